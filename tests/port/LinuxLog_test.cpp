// SPDX-License-Identifier: Apache-2.0
#include <atomic>
#include <chrono>
#include <cstring>
#include <filesystem>
#include <sstream>

#include <dlog.h>
#include <fcntl.h>
#include <gmock/gmock.h>
#include <sys/socket.h>
#include <sys/un.h>
#include <unistd.h>

#include "backend/Log.h"
#include "coresystem_port.h"
#include "support/CapturedStandardError.h"
#include "support/Child.h"
#include "support/TemporaryTree.h"
#include "support/Together.h"

using coresystem_port::LogSink;
using testing::HasSubstr;
using testing::MatchesRegex;

namespace {

bool write(int priority, const std::string& tag, const std::string& text)
{
    return port::processLog().write(priority, tag, text);
}

class LinuxLogTest : public testing::Test {
protected:
    LinuxLogTest()
    {
        coresystem_port::setLogSink(LogSink::StandardError);
    }
};

TEST_F(LinuxLogTest, StandardErrorHasTheBriefForm)
{
    CapturedStandardError log;
    EXPECT_TRUE(write(DLOG_ERROR, "CoreSystem", "text"));
    char process[16];
    std::snprintf(process, sizeof process, "(%5d)", getpid());
    EXPECT_EQ("E/CoreSystem" + std::string(process) + ": text\n", log.take());
}

TEST_F(LinuxLogTest, PrioritiesHaveTheirLetters)
{
    CapturedStandardError log;
    for (int priority = DLOG_UNKNOWN; priority < DLOG_PRIO_MAX; ++priority)
        write(priority, "t", "x");
    std::string letters;
    std::istringstream lines(log.take());
    for (std::string line; std::getline(lines, line);)
        letters += line[0];
    EXPECT_EQ("??VDIWEFS", letters);
}

TEST_F(LinuxLogTest, LinesOfManyThreadsStayWhole)
{
    CapturedStandardError log;
    together(8, [](int number) {
        for (int i = 0; i < 100; ++i)
            write(DLOG_INFO, "CoreSystem", std::string(700, static_cast<char>('a' + number)));
    });
    std::istringstream lines(log.take());
    int count = 0;
    for (std::string line; std::getline(lines, line); ++count)
        ASSERT_THAT(line, MatchesRegex("I/CoreSystem\\([ 0-9]+\\): (a+|b+|c+|d+|e+|f+|g+|h+)"));
    EXPECT_EQ(800, count);
}

TEST_F(LinuxLogTest, ClosedStandardErrorAndAFullDiskAreToldToTheCaller)
{
    const int kept = dup(STDERR_FILENO);
    const int full = open("/dev/full", O_WRONLY);
    close(STDERR_FILENO);
    const bool writtenToNothing = write(DLOG_INFO, "CoreSystem", "text");
    dup2(full, STDERR_FILENO);
    const bool writtenToAFullDisk = write(DLOG_INFO, "CoreSystem", "text");
    dup2(kept, STDERR_FILENO);
    close(full);
    close(kept);
    EXPECT_FALSE(writtenToNothing);
    EXPECT_FALSE(writtenToAFullDisk);
}

TEST_F(LinuxLogTest, ReaderThatStallsIsNotWaitedForAndItsLostLinesAreCounted)
{
    int ends[2] = {-1, -1};
    ASSERT_EQ(0, pipe(ends));
    fcntl(ends[0], F_SETFL, O_NONBLOCK);
    const int kept = dup(STDERR_FILENO);
    dup2(ends[1], STDERR_FILENO);
    close(ends[1]);
    const auto readAll = [&ends] {
        std::string all(1 << 17, '\0'); // more than a pipe holds
        const ssize_t size = read(ends[0], all.data(), all.size());
        return all.substr(0, size > 0 ? static_cast<std::size_t>(size) : 0);
    };
    const auto start = std::chrono::steady_clock::now();
    int lost = 0;
    std::atomic<int> lostByThreads{0};
    for (int line = 0; line < 200; ++line)
        lost += write(DLOG_ERROR, "CoreSystem", std::string(998, 'x')) ? 0 : 1;
    together(8, [&](int) {
        for (int line = 0; line < 50; ++line)
            lostByThreads += write(DLOG_ERROR, "CoreSystem", std::string(998, 'x')) ? 0 : 1;
    });
    EXPECT_LT(std::chrono::steady_clock::now() - start, std::chrono::seconds(2)); // 100 ms, once
    EXPECT_GT(lost, 100); // a pipe holds 64 KiB
    EXPECT_EQ(400, lostByThreads);
    readAll();
    EXPECT_TRUE(write(DLOG_ERROR, "CoreSystem", "last"));
    dup2(kept, STDERR_FILENO);
    close(kept);
    EXPECT_THAT(readAll(), MatchesRegex("E/CoreSystem\\([ 0-9]+\\): last\n"
                                        "W/coresystem-port\\([ 0-9]+\\): " +
                                        std::to_string(lost + lostByThreads) +
                                        " log lines are lost: nobody took them\n"));
    close(ends[0]);
}

// A field as the journal's protocol writes it: name, length in little endian, value.
std::string field(const std::string& name, const std::string& value)
{
    std::string length(8, '\0');
    for (std::size_t i = 0, rest = value.size(); rest > 0; ++i, rest >>= 8)
        length[i] = static_cast<char>(rest & 0xff);
    return name + "\n" + length + value + "\n";
}

// Stands in for the journal: a datagram socket at the journal's place in a private /run.
class JournalTest : public testing::Test {
protected:
    void SetUp() override
    {
        if (!canHavePrivateMounts())
            GTEST_SKIP() << "needs a mount namespace, to put a socket in the journal's place";
        std::filesystem::create_directories(tree.path("/systemd/journal"));
    }
    ~JournalTest() override
    {
        if (socket_ >= 0)
            close(socket_);
    }

    void listen()
    {
        sockaddr_un address = {};
        address.sun_family = AF_UNIX;
        std::strcpy(address.sun_path, tree.path("/systemd/journal/socket").c_str());
        socket_ = socket(AF_UNIX, SOCK_DGRAM | SOCK_NONBLOCK, 0);
        ASSERT_EQ(0, bind(socket_, reinterpret_cast<sockaddr*>(&address), sizeof address));
    }

    std::string received() const
    {
        char record[65536];
        const ssize_t size = recv(socket_, record, sizeof record, 0);
        return std::string(record, size > 0 ? static_cast<std::size_t>(size) : 0);
    }

    // What a process with this /run captures.
    template <typename Work>
    std::string inPlaceOfRun(Work work)
    {
        return inChild([&]() -> std::string {
            if (!enterPrivateMounts() || !bindFolder(tree.root(), "/run"))
                return "failed";
            return work();
        });
    }
    // The standard error of such a process, and where its lines go by themselves.
    std::string standardErrorOf(int priority, const std::string& text,
                                LogSink sink = LogSink::Automatic)
    {
        return inPlaceOfRun([&] {
            coresystem_port::setLogSink(sink);
            CapturedStandardError log;
            const bool written = write(priority, "CoreSystem", text);
            return log.take() + (written ? "" : "not written") +
                   coresystem_port::automaticLogSink();
        });
    }

    const TemporaryTree tree;
    int socket_ = -1;
};

TEST_F(JournalTest, LinesGoToTheJournalWhenItIsThere)
{
    listen();
    EXPECT_EQ("journal", standardErrorOf(DLOG_ERROR, "one line"));
    EXPECT_EQ(field("MESSAGE", "one line") + field("PRIORITY", "3") +
                  field("SYSLOG_IDENTIFIER", "CoreSystem"),
              received());
    standardErrorOf(DLOG_INFO, std::string(20000, 'x'));
    EXPECT_THAT(received(), HasSubstr(std::string(20000, 'x')));
    EXPECT_THAT(standardErrorOf(DLOG_WARN, "text", LogSink::StandardError),
                MatchesRegex("W/CoreSystem\\([ 0-9]+\\): text\njournal"));
    EXPECT_EQ("", received()) << "standard error was chosen";
}

TEST_F(JournalTest, LinesGoToStandardErrorWhenTheJournalStalls)
{
    listen(); // and never read
    const auto start = std::chrono::steady_clock::now();
    EXPECT_THAT(inPlaceOfRun([] {
                    CapturedStandardError log;
                    bool written = true;
                    for (int line = 0; line < 3000; ++line)
                        written = write(DLOG_WARN, "CoreSystem", "text") && written;
                    const std::string taken = log.take();
                    return written ? taken.substr(taken.rfind("W/")) : "not written";
                }),
                MatchesRegex("W/CoreSystem\\([ 0-9]+\\): text\n"));
    EXPECT_LT(std::chrono::steady_clock::now() - start, std::chrono::seconds(2));
}

TEST_F(JournalTest, LinesGoToStandardErrorWithoutAJournalAndWhenItDied)
{
    EXPECT_THAT(standardErrorOf(DLOG_WARN, "text"),
                MatchesRegex("W/CoreSystem\\([ 0-9]+\\): text\nstandard error"));
    listen();
    close(std::exchange(socket_, -1)); // its socket file stays
    EXPECT_THAT(standardErrorOf(DLOG_WARN, "text"),
                MatchesRegex("W/CoreSystem\\([ 0-9]+\\): text\njournal"));
}

} // namespace
