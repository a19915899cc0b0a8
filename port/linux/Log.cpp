// SPDX-License-Identifier: Apache-2.0
// The journal when its socket is there, else standard error.
#include "../backend/Log.h"

#include <algorithm>
#include <atomic>
#include <cerrno>
#include <cstdio>

#include <coresystem_port.h>
#include <dlog.h>
#include <unistd.h>

#include "../common/GLibTypes.h"

namespace port::linux_backend {
namespace {

// One row per log_priority: the letter of the brief form and the journal's PRIORITY (syslog(3)).
struct Priority {
    char letter;
    const char* journal;
};
constexpr Priority PRIORITIES[] = {
    {'?', "6"}, {'?', "6"}, {'V', "7"}, {'D', "7"}, {'I', "6"},
    {'W', "4"}, {'E', "3"}, {'F', "2"}, {'S', "6"},
};
static_assert(sizeof PRIORITIES / sizeof *PRIORITIES == DLOG_PRIO_MAX, "one row per priority");

const Priority& rowOf(int priority)
{
    const bool known = priority >= 0 && priority < DLOG_PRIO_MAX;
    return PRIORITIES[known ? priority : DLOG_UNKNOWN];
}

bool writeToJournal(const Priority& priority, const std::string& tag, const std::string& text)
{
    const auto field = [](const char* name, const std::string& value) {
        return GLogField{name, value.data(), static_cast<gssize>(value.size())};
    };
    const std::string level = priority.journal;
    const GLogField fields[] = {field("MESSAGE", text), field("PRIORITY", level),
                                field("SYSLOG_IDENTIFIER", tag)};
    return g_log_writer_journald(G_LOG_LEVEL_MESSAGE, fields, G_N_ELEMENTS(fields), nullptr) ==
           G_LOG_WRITER_HANDLED;
}

// The form that `dlogutil -v brief` shows, in one write so that lines of several threads stay
// whole.
bool writeToStandardError(const Priority& priority, const std::string& tag, const std::string& text)
{
    char processId[16];
    std::snprintf(processId, sizeof processId, "(%5d): ", static_cast<int>(getpid()));
    std::string line = std::string(1, priority.letter) + "/" + tag;
    line.resize(std::max(line.size(), sizeof "I/12345678" - 1), ' ');
    line += processId + text + "\n";
    ssize_t written = 0;
    do
        written = write(STDERR_FILENO, line.data(), line.size());
    while (written < 0 && errno == EINTR);
    return written == static_cast<ssize_t>(line.size());
}

bool journalIsThere()
{
    return access("/run/systemd/journal/socket", W_OK) == 0;
}

using coresystem_port::LogSink;
std::atomic<LogSink> chosenSink{LogSink::Automatic};

class MachineLog : public Log {
public:
    bool write(int priority, const std::string& tag, const std::string& text) override
    {
        const LogSink sink = chosenSink;
        if (sink == LogSink::None)
            return true;
        const Priority& row = rowOf(priority);
        const bool journal = sink == LogSink::Automatic && journalIsThere();
        return (journal && writeToJournal(row, tag, text)) || writeToStandardError(row, tag, text);
    }
};

} // namespace
} // namespace port::linux_backend

port::Log& port::processLog()
{
    static Log& log = *new linux_backend::MachineLog;
    return log;
}

void coresystem_port::setLogSink(LogSink sink)
{
    port::linux_backend::chosenSink = sink;
}

std::string coresystem_port::automaticLogSink()
{
    return port::linux_backend::journalIsThere() ? "journal" : "standard error";
}
