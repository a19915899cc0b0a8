// SPDX-License-Identifier: Apache-2.0
// Changes of a device file, and who is told of them.
#include <filesystem>
#include <fstream>

#include "common/GLibTypes.h"
#include "events/ChangeEvents.h"
#include "support/CapturedStandardError.h"
#include "support/DeviceFileTest.h"
#include "support/Wait.h"

using port::Change;
using testing::ElementsAre;
using testing::IsEmpty;

namespace {

namespace fs = std::filesystem;

class SimulatorWatchTest : public DeviceFileTest {
protected:
    ~SimulatorWatchTest() override
    {
        events.unset(Change::FlightMode);
    }

    void listen()
    {
        EXPECT_TRUE(events.set(Change::FlightMode, [this](int on) { told.push_back(on); }));
    }

    // The next event, and those that came with it.
    std::vector<int> taken()
    {
        runUntil([&] { return !told.empty(); });
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
    std::vector<int> told;
};

TEST_F(SimulatorWatchTest, FileMayBeWrittenInPlaceOrReplacedAgainAndAgain)
{
    describe(flightMode(false));
    listen();
    for (int round = 0; round < 22; ++round) {
        const std::string facts = flightMode(round % 2 == 0);
        round < 2 ? describe(facts) : replace(facts);
        ASSERT_THAT(taken(), ElementsAre(round % 2 == 0 ? 1 : 0));
    }
}

TEST_F(SimulatorWatchTest, FileMayGoAndComeFromAnywhere)
{
    listen();
    describe(flightMode(false)); // for the first time
    EXPECT_THAT(taken(), ElementsAre(0));
    tree.remove("/d.toml");
    describe(flightMode(true));
    EXPECT_THAT(taken(), ElementsAre(1));
    fs::rename(tree.write("/elsewhere/next.toml", "schema = 1\n" + flightMode(false)), path);
    EXPECT_THAT(taken(), ElementsAre(0));
    tree.remove("/d.toml");
    fs::create_hard_link(tree.write("/other.toml", "schema = 1\n" + flightMode(true)), path);
    EXPECT_THAT(taken(), ElementsAre(1));
}

TEST_F(SimulatorWatchTest, LinkIsFollowed)
{
    tree.write("/shelf/real.toml", "schema = 1\n" + flightMode(false));
    fs::create_symlink(tree.path("/shelf/real.toml"), path);
    listen();
    tree.write("/shelf/real.toml", "schema = 1\n" + flightMode(true));
    EXPECT_THAT(taken(), ElementsAre(1));
    tree.write("/other.toml", "schema = 1\n" + flightMode(false));
    fs::create_symlink(tree.path("/other.toml"), tree.path("/link"));
    fs::rename(tree.path("/link"), path); // now it leads elsewhere
    EXPECT_THAT(taken(), ElementsAre(0));
}

TEST_F(SimulatorWatchTest, HalfWrittenFileIsNotLookedAt)
{
    describe(flightMode(false));
    listen();
    coresystem_port::setLogSink(coresystem_port::LogSink::StandardError);
    CapturedStandardError log;
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
    EXPECT_THAT(taken(), ElementsAre(1));
    EXPECT_EQ("", log.take());
}

TEST_F(SimulatorWatchTest, WatchMayEndWhileTheFileChanges)
{
    for (int round = 0; round < 100; ++round) {
        describe(flightMode(round % 2 == 0));
        listen();
        describe(flightMode(round % 2 != 0));
        events.unset(Change::FlightMode);
    }
    while (g_main_context_iteration(nullptr, FALSE) != FALSE) {}
    EXPECT_THAT(told, IsEmpty());
}

} // namespace
