// SPDX-License-Identifier: Apache-2.0
// The logging convention of the library, once.
//
//   DEBUG_LINE("deviceName : %s, ret : %d", name, ret);   only in debug mode, body enciphered
//   ERROR_LINE("mcc is invalid");                         always, plain text
//   NOTICE_LINE("Set Connection Change Callback");        always, plain text, at DLOG_INFO
//
// A source file whose lines carry another tag than "CoreSystem" defines CORESYSTEM_DEFAULT_TAG
// before it includes this header.
#ifndef CORESYSTEM_LOG_H
#define CORESYSTEM_LOG_H

#include <cstdarg>
#include <cstdio>
#include <cstring>
#include <string>

#include <dlog.h>

#include <AESCrypto.h>
#include <CoreLogger.h>

#ifndef CORESYSTEM_DEFAULT_TAG
#define CORESYSTEM_DEFAULT_TAG "CoreSystem"
#endif

// Log lines are rare: their code stays out of the callers' way.
#define CORESYSTEM_COLD __attribute__((cold, noinline))

// Begins every line: file, function, line.
#define LOG_PREFIX "%s: %s(%d) > "

#define LOG_SITE (::coresystem::LogSite{CORESYSTEM_DEFAULT_TAG, __FILE__, __func__, __LINE__})

#define DEBUG_LINE(...) DEBUG_LINE_AT(LOG_SITE, __VA_ARGS__)

#define DEBUG_LINE_AT(site, ...)                             \
    do {                                                     \
        if (::coresystem::isDebugOn())                       \
            ::coresystem::writeDebugLine(site, __VA_ARGS__); \
    } while (false)

#define ERROR_LINE(...) ::coresystem::writeErrorLine(LOG_SITE, LOG_PREFIX __VA_ARGS__)

#define NOTICE_LINE(...) ::coresystem::writePlainLine(DLOG_INFO, LOG_SITE, LOG_PREFIX __VA_ARGS__)

namespace coresystem {

// Where a log statement stands.
struct LogSite {
    const char* defaultTag;
    const char* path; // as compiled; lines show its base name
    const char* functionName;
    int lineNumber;
};

inline bool isDebugOn()
{
    return CoreLogger::GetInstance()->GetDebugMode() == 1;
}

inline const char* logFileName(const LogSite& site)
{
    const char* const lastSlash = std::strrchr(site.path, '/');
    return lastSlash != nullptr ? lastSlash + 1 : site.path;
}

// Asked anew for each line: the application may set its tag at any time.
inline const char* logTag(const LogSite& site)
{
    CoreLogger* const logger = CoreLogger::GetInstance();
    return logger->HasLogTag() ? logger->GetLogTag() : site.defaultTag;
}

// The size that a message is cut to, its NUL included.
constexpr std::size_t LOG_MESSAGE_SIZE = 599;

__attribute__((format(printf, 2, 3))) CORESYSTEM_COLD inline void
writeDebugLine(const LogSite& site, const char* format, ...)
{
    CoreLogger* const logger = CoreLogger::GetInstance();
    char* const buffer = logger->GetBuffer(logger->GetBufferIndex());

    va_list arguments;
    va_start(arguments, format);
    std::vsnprintf(buffer, LOG_MESSAGE_SIZE, format, arguments);
    va_end(arguments);

    try {
        const std::string enciphered = AESCrypto::GetInstance()->Encrypt(std::string(buffer));
        __dlog_print(LOG_ID_MAIN, DLOG_INFO, logTag(site), LOG_PREFIX "{#!@%s#!@}",
                     logFileName(site), site.functionName, site.lineNumber, enciphered.c_str());
    } catch (...) {
        // Logging never fails the caller, and no exception crosses the interface.
    }
}

// The format is one literal that begins with LOG_PREFIX.
template <typename... Arguments>
CORESYSTEM_COLD void writePlainLine(int priority, const LogSite& site, const char* format,
                                    Arguments... arguments)
{
    __dlog_print(LOG_ID_MAIN, priority, logTag(site), format, logFileName(site), site.functionName,
                 site.lineNumber, arguments...);
}

template <typename... Arguments>
void writeErrorLine(const LogSite& site, const char* format, Arguments... arguments)
{
    writePlainLine(DLOG_ERROR, site, format, arguments...);
}

} // namespace coresystem

#endif
