// SPDX-License-Identifier: Apache-2.0
/// \file
/// Logger state that applications and the libraries they use share: debug mode, tag, format
/// buffers.
#ifndef COREUTIL_CORE_LOGGER_H
#define COREUTIL_CORE_LOGGER_H

/// The process-wide logger state. Every operation may be called from any thread.
///
/// The environment sets the start values (ignored in a set-user-ID process): CORESYSTEM_LOG_DEBUG=1
/// switches debug mode on, CORESYSTEM_LOG_TAG=TAG sets the application's tag.
class CoreLogger {
public:
    /// The one logger; never null.
    static CoreLogger* GetInstance();

    /// 1 when debug lines are written.
    int GetDebugMode();
    /// 1 switches debug lines on, anything else off.
    void SetDebugMode(int mode);

    /// Whether the application has set its own tag.
    bool HasLogTag();
    /// The application's tag, or "" without one. The string is never freed or changed.
    const char* GetLogTag() const;
    /// Sets the application's tag; null or "" takes it back. The text is copied.
    void SetLogTag(const char* tag);

    /// The index of the calling thread's next format buffer.
    int GetBufferIndex();
    /// The calling thread's buffer of that index: 600 writable bytes, never null, owned by the
    /// logger. Each thread has a ring of its own, so threads that log at once never share a buffer;
    /// a buffer is good until the same thread has taken BUFFER_COUNT more. Any index is taken
    /// modulo the ring.
    char* GetBuffer(const int& index);

    static const int BUFFER_COUNT = 4;
    static const int BUFFER_SIZE = 600;

private:
    CoreLogger();
    CoreLogger(const CoreLogger&) = delete;
    CoreLogger& operator=(const CoreLogger&) = delete;
};

#endif
