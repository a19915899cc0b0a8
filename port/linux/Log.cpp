// SPDX-License-Identifier: Apache-2.0
// The journal when its socket is there, else standard error.
#include "../backend/Log.h"

#include <algorithm>
#include <atomic>
#include <cerrno>
#include <chrono>
#include <climits>
#include <cstdint>
#include <cstdio>
#include <cstring>
#include <string_view>

#include <coresystem_port.h>
#include <dlog.h>
#include <endian.h>
#include <poll.h>
#include <sys/socket.h>
#include <sys/stat.h>
#include <sys/time.h>
#include <sys/uio.h>
#include <sys/un.h>
#include <unistd.h>

#include "../../devicefile/Descriptor.h"

namespace port::linux_backend {
namespace {

constexpr char JOURNAL[] = "/run/systemd/journal/socket";

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

// Nobody who logs waits longer for whoever reads the log. A reader that let a line wait in vain is
// not waited for again before it takes one.
constexpr std::chrono::milliseconds PATIENCE(100);

class Reader {
public:
    std::chrono::milliseconds patience() const
    {
        return stalls_.load(std::memory_order_relaxed) ? std::chrono::milliseconds(0) : PATIENCE;
    }
    // Records whether a line was taken; after a failure errno says why not.
    bool note(bool taken)
    {
        const bool stalls = !taken && (errno == EAGAIN || errno == EWOULDBLOCK);
        stalls_.store(stalls, std::memory_order_relaxed);
        return taken;
    }
    bool stalls() const
    {
        return stalls_.load(std::memory_order_relaxed);
    }

private:
    std::atomic<bool> stalls_{false};
};

Reader journal;
Reader standardError;

// As the journal's native protocol has it: name, size in little endian, value.
void addField(std::string& record, const char* name, const std::string& value)
{
    const std::uint64_t size = htole64(value.size());
    record.append(name).append("\n");
    record.append(reinterpret_cast<const char*>(&size), sizeof size);
    record.append(value).append("\n");
}

// By a socket for each line: a process that closes descriptors which it does not know, or forks, or
// unloads this library, loses and keeps none. What does not fit into one datagram is refused.
bool sendToJournal(const std::string& record)
{
    const Descriptor end(socket(AF_UNIX, SOCK_DGRAM | SOCK_CLOEXEC, 0));
    const auto patience = journal.patience();
    const timeval limit = {0,
                           static_cast<suseconds_t>(std::chrono::microseconds(patience).count())};
    sockaddr_un address = {};
    address.sun_family = AF_UNIX;
    std::strcpy(address.sun_path, JOURNAL);
    if (setsockopt(end.number(), SOL_SOCKET, SO_SNDTIMEO, &limit, sizeof limit) != 0)
        return false;
    const int flags = MSG_NOSIGNAL | (patience.count() == 0 ? MSG_DONTWAIT : 0);
    const auto send = [&](int how) {
        return sendto(end.number(), record.data(), record.size(), how,
                      reinterpret_cast<const sockaddr*>(&address), sizeof address) >= 0;
    };
    return send(flags) || (errno == EINTR && send(flags | MSG_DONTWAIT));
}

bool writeToJournal(const Priority& priority, const std::string& tag, const std::string& text)
{
    std::string record;
    addField(record, "MESSAGE", text);
    addField(record, "PRIORITY", priority.journal);
    addField(record, "SYSLOG_IDENTIFIER", tag);
    return journal.note(sendToJournal(record));
}

// Writes without waiting where the kernel can do that for a pipe or a socket of others, else as
// much as a descriptor takes that is ready.
ssize_t writeReady(const std::string_view& text)
{
    struct stat status = {};
    const bool mayStall = fstat(STDERR_FILENO, &status) == 0 &&
                          (S_ISFIFO(status.st_mode) || S_ISSOCK(status.st_mode));
    if (!mayStall)
        return write(STDERR_FILENO, text.data(), text.size());
    iovec block = {const_cast<char*>(text.data()), text.size()};
    const ssize_t written = pwritev2(STDERR_FILENO, &block, 1, -1, RWF_NOWAIT);
    if (written >= 0 || (errno != EOPNOTSUPP && errno != ENOSYS && errno != EINVAL))
        return written;
    return write(STDERR_FILENO, text.data(), std::min<std::size_t>(text.size(), PIPE_BUF));
}

// In one write where that is possible, so that lines of several threads stay whole.
bool sendToStandardError(const std::string& line)
{
    using Clock = std::chrono::steady_clock;
    const Clock::time_point deadline = Clock::now() + standardError.patience();
    for (std::string_view rest(line); !rest.empty();) {
        const auto left =
            std::chrono::duration_cast<std::chrono::milliseconds>(deadline - Clock::now());
        pollfd ready = {STDERR_FILENO, POLLOUT, 0};
        const bool isReady = poll(&ready, 1, std::max(0, static_cast<int>(left.count()))) > 0;
        const ssize_t written = isReady ? writeReady(rest) : -1;
        if (written >= 0)
            rest.remove_prefix(static_cast<std::size_t>(written));
        else if (isReady && errno != EAGAIN && errno != EINTR)
            return false;
        else if (Clock::now() >= deadline) {
            errno = EAGAIN;
            return false;
        }
    }
    return true;
}

// The form that `dlogutil -v brief` shows.
bool writeToStandardError(const Priority& priority, const std::string& tag, const std::string& text)
{
    char processId[16];
    std::snprintf(processId, sizeof processId, "(%5d): ", static_cast<int>(getpid()));
    std::string line = std::string(1, priority.letter) + "/" + tag;
    line.resize(std::max(line.size(), sizeof "I/12345678" - 1), ' ');
    line += processId + text + "\n";
    return standardError.note(sendToStandardError(line));
}

bool journalIsThere()
{
    return access(JOURNAL, W_OK) == 0;
}

using coresystem_port::LogSink;
std::atomic<LogSink> chosenSink{LogSink::Automatic};

// Lines that nobody took in time, since the last one that was taken.
std::atomic<unsigned long> lostLines{0};

class MachineLog : public Log {
public:
    bool isOn() const override
    {
        return chosenSink != LogSink::None;
    }

    bool write(int priority, const std::string& tag, const std::string& text) override
    {
        const LogSink sink = chosenSink;
        if (sink == LogSink::None)
            return true;
        if (!writeTo(sink, priority, tag, text)) {
            lostLines += standardError.stalls() ? 1 : 0;
            return false;
        }
        if (lostLines != 0)
            if (const unsigned long lost = lostLines.exchange(0); lost != 0)
                writeTo(sink, DLOG_WARN, "coresystem-port",
                        std::to_string(lost) + " log lines are lost: nobody took them");
        return true;
    }

private:
    static bool writeTo(LogSink sink, int priority, const std::string& tag, const std::string& text)
    {
        const Priority& row = rowOf(priority);
        const bool toJournal = sink == LogSink::Automatic && journalIsThere();
        return (toJournal && writeToJournal(row, tag, text)) ||
               writeToStandardError(row, tag, text);
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
