// SPDX-License-Identifier: Apache-2.0
// Changes of a device file, and who is told of them.
#include <filesystem>
#include <fstream>
#include <string>
#include <utility>
#include <vector>

#include <fcntl.h>
#include <poll.h>
#include <unistd.h>

#include "common/GLibTypes.h"
#include "events/ChangeEvents.h"
#include "support/DeviceFileTest.h"
#include "support/Wait.h"

using port::Change;
using testing::ElementsAre;
using testing::HasSubstr;
using testing::IsEmpty;

namespace {

namespace fs = std::filesystem;

// Standard error as a pipe whose lines can be waited for.
class LogLines {
public:
    LogLines()
    {
        EXPECT_EQ(0, pipe2(pipe_, O_CLOEXEC));
        EXPECT_EQ(STDERR_FILENO, dup2(pipe_[1], STDERR_FILENO));
        coresystem_port::setLogSink(coresystem_port::LogSink::StandardError);
    }
    ~LogLines()
    {
        coresystem_port::setLogSink(coresystem_port::LogSink::None);
        EXPECT_EQ(STDERR_FILENO, dup2(before_, STDERR_FILENO));
        for (const int file : {before_, pipe_[0], pipe_[1]})
            close(file);
    }
    LogLines(const LogLines&) = delete;
    LogLines& operator=(const LogLines&) = delete;

    // The next line; empty when none comes within a time.
    std::string next(int milliseconds = 10000) const
    {
        std::string line;
        for (struct pollfd end = {pipe_[0], POLLIN, 0}; poll(&end, 1, milliseconds) == 1;) {
            char byte = 0;
            if (read(pipe_[0], &byte, 1) != 1 || byte == '\n')
                break;
            line += byte;
        }
        return line;
    }

private:
    int before_ = fcntl(STDERR_FILENO, F_DUPFD_CLOEXEC, 0);
    int pipe_[2] = {-1, -1};
};

class SimulatorWatchTest : public DeviceFileTest {
protected:
    ~SimulatorWatchTest() override
    {
        for (const Change change : {Change::WifiDevice, Change::WifiConnection, Change::WifiStatus,
                                    Change::PacketData, Change::FlightMode})
            events.unset(change);
    }

    void listen(Change change, const std::string& name)
    {
        EXPECT_TRUE(events.set(
            change, [this, name](int value) { told.push_back(name + std::to_string(value)); }));
    }

    // The next events, as many as that.
    std::vector<std::string> taken(std::size_t count)
    {
        runUntil([&] { return told.size() >= count; });
        return std::exchange(told, {});
    }

    // Replaces the file at once, as editors do.
    void replace(const std::string& facts) const
    {
        fs::rename(tree.write("/next.toml", "schema = 1\n" + facts), path);
    }

    static std::string flightMode(bool on)
    {
        return "[settings]\nflight_mode = " + std::string(on ? "true" : "false") + "\n";
    }

    port::ChangeEvents events{*backend};
    std::vector<std::string> told;
};

TEST_F(SimulatorWatchTest, EditIsToldAsOneEventPerFactInAFixedOrder)
{
    describe(
        "[network]\nwifi = 'connected'\n[settings]\nflight_mode = false\npacket_data = true\n");
    listen(Change::FlightMode, "flight");
    listen(Change::PacketData, "data");
    listen(Change::WifiStatus, "status");
    listen(Change::WifiConnection, "connection");
    listen(Change::WifiDevice, "device");
    replace(
        "[network]\nwifi = 'deactivated'\n[settings]\nflight_mode = true\npacket_data = false\n");
    EXPECT_THAT(taken(5), ElementsAre("device0", "connection1", "status0", "data0", "flight1"));
}

TEST_F(SimulatorWatchTest, FileMayBeWrittenInPlaceOrReplacedAgainAndAgain)
{
    describe(flightMode(false));
    listen(Change::FlightMode, "");
    for (int round = 0; round < 22; ++round) {
        const std::string facts = flightMode(round % 2 == 0);
        round < 2 ? describe(facts) : replace(facts);
        ASSERT_THAT(taken(1), ElementsAre(round % 2 == 0 ? "1" : "0"));
    }
}

TEST_F(SimulatorWatchTest, FileMayGoAndComeFromAnywhere)
{
    listen(Change::FlightMode, "");
    describe(flightMode(false)); // for the first time
    EXPECT_THAT(taken(1), ElementsAre("0"));
    tree.remove("/d.toml");
    describe(flightMode(true));
    EXPECT_THAT(taken(1), ElementsAre("1"));
    fs::rename(tree.write("/elsewhere/next.toml", "schema = 1\n" + flightMode(false)), path);
    EXPECT_THAT(taken(1), ElementsAre("0"));
    tree.remove("/d.toml");
    fs::create_hard_link(tree.write("/other.toml", "schema = 1\n" + flightMode(true)), path);
    EXPECT_THAT(taken(1), ElementsAre("1"));
}

TEST_F(SimulatorWatchTest, LinkIsFollowed)
{
    tree.write("/shelf/real.toml", "schema = 1\n" + flightMode(false));
    fs::create_symlink(tree.path("/shelf/real.toml"), path);
    listen(Change::FlightMode, "");
    tree.write("/shelf/real.toml", "schema = 1\n" + flightMode(true));
    EXPECT_THAT(taken(1), ElementsAre("1"));
    tree.write("/other.toml", "schema = 1\n" + flightMode(false));
    fs::create_symlink(tree.path("/other.toml"), tree.path("/link"));
    fs::rename(tree.path("/link"), path); // now it leads elsewhere
    EXPECT_THAT(taken(1), ElementsAre("0"));
}

TEST_F(SimulatorWatchTest, BrokenEditIsReportedOnceAndKeepsTheLastGoodState)
{
    describe(flightMode(false));
    listen(Change::FlightMode, "flight");
    listen(Change::WifiStatus, "status");
    const LogLines log;
    replace("[settings]\nflight_mode = maybe\n");
    EXPECT_THAT(log.next(), HasSubstr(line(3) + ":15: "));
    replace(flightMode(false) + "[network]\nwifi = 'connected'\n");
    EXPECT_THAT(taken(1), ElementsAre("status1")); // and none of what was the same before
    EXPECT_EQ("", log.next(0));
    replace("[settings]\nflight_mode = maybe\n"); // again, since it was good in between
    EXPECT_THAT(log.next(), HasSubstr(line(3) + ":15: "));
}

TEST_F(SimulatorWatchTest, HalfWrittenFileIsNotLookedAt)
{
    describe(flightMode(false));
    listen(Change::FlightMode, "");
    const LogLines log;
    const port::Owned<GFile> watched(g_file_new_for_path(path.c_str()));
    const port::Owned<GFileMonitor> monitor(
        g_file_monitor_file(watched.get(), G_FILE_MONITOR_NONE, nullptr, nullptr));
    bool changed = false; // as anybody may see it
    const auto see = +[](GFileMonitor*, GFile*, GFile*, GFileMonitorEvent, gpointer seen) {
        *static_cast<bool*>(seen) = true;
    };
    g_signal_connect(monitor.get(), "changed", G_CALLBACK(see), &changed);
    {
        std::ofstream file(path);
        file << "schema = 1\n[settings]\nflight_" << std::flush;
        EXPECT_TRUE(runUntil([&] { return changed; }));
        file << "mode = true\n";
    }
    EXPECT_THAT(taken(1), ElementsAre("1"));
    EXPECT_EQ("", log.next(0));
}

TEST_F(SimulatorWatchTest, WatchMayEndWhileTheFileChanges)
{
    for (int round = 0; round < 100; ++round) {
        describe(flightMode(round % 2 == 0));
        listen(Change::FlightMode, "");
        describe(flightMode(round % 2 != 0));
        events.unset(Change::FlightMode);
    }
    while (g_main_context_iteration(nullptr, FALSE) != FALSE) {}
    EXPECT_THAT(told, IsEmpty());
}

} // namespace
