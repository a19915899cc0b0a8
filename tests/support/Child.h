// SPDX-License-Identifier: Apache-2.0
// Work that must not change this process, done by a child process.
#ifndef TESTS_SUPPORT_CHILD_H
#define TESTS_SUPPORT_CHILD_H

#include <functional>
#include <string>

#include <sys/types.h>

/// Runs the work in a forked child and returns its result.
std::string inChild(const std::function<std::string()>& work);

/// A program that a test runs, killed at the latest with the object. The thread that starts it must
/// outlive it.
class Process {
public:
    Process() = default;
    ~Process();
    Process(const Process&) = delete;
    Process& operator=(const Process&) = delete;

    /// Forks. `become` executes a program, with nothing that allocates: another thread may hold the
    /// allocator's lock for good.
    void start(const std::function<void()>& become);
    /// 0 while there is none.
    pid_t id() const
    {
        return id_;
    }
    void tell(int signal) const;
    /// Waits for its end; its exit code, or minus the signal that ended it.
    int end();
    /// Kills it without a farewell, when it runs.
    void kill();
    /// Stops it from running, and lets it go on.
    void freeze() const;
    void thaw() const;

private:
    pid_t id_ = 0;
};

/// For a child only: both outputs go to the end of a file. False when they cannot.
bool writeInto(const char* file);

/// For a child only: a mount namespace of its own, in which no change reaches the machine. False
/// when that is not permitted here.
bool enterPrivateMounts();

/// For a child after enterPrivateMounts(): shows one folder in the place of another.
bool bindFolder(const std::string& shown, const std::string& place);

/// Whether this process may have a mount namespace of its own.
bool canHavePrivateMounts();

#endif
