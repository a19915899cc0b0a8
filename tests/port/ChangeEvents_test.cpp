// SPDX-License-Identifier: Apache-2.0
// Who is told of which change, where and when.
#include "events/ChangeEvents.h"

#include <atomic>
#include <cstdlib>
#include <future>
#include <thread>

#include <gmock/gmock.h>

#include "common/ContextThread.h"
#include "support/FakeBackend.h"
#include "support/Together.h"

using port::Change;
using port::ChangeEvents;
using port::LinkState;
using testing::ElementsAre;
using testing::IsEmpty;

namespace {

using Answers = FakeNetwork::Answers;

constexpr Change ALL[] = {Change::WifiDevice, Change::WifiConnection, Change::WifiStatus,
                          Change::PacketData, Change::FlightMode,     Change::DataRoaming};

const port::Error FAILED = port::notAvailable("nobody is there");

class ChangeEventsTest : public testing::Test {
protected:
    ~ChangeEventsTest() override
    {
        for (const Change change : ALL)
            events.unset(change);
        EXPECT_EQ(0, network.watches());
    }

    void listen(Change change, const std::string& name)
    {
        EXPECT_TRUE(events.set(
            change, [this, name](int value) { told.push_back(name + std::to_string(value)); }));
    }

    void setFlightMode(bool on)
    {
        network.change([on](Answers& answers) { answers.flightMode = answered(on); });
    }
    void setBoth(bool on)
    {
        network.change([on](Answers& answers) {
            answers.packetData = answered(on);
            answers.flightMode = answered(on);
        });
    }

    // Everything that waits.
    static void runLoop()
    {
        while (g_main_context_iteration(nullptr, FALSE) != FALSE) {}
    }
    // The events since.
    std::vector<std::string> taken()
    {
        runLoop();
        return std::exchange(told, {});
    }

    FakeBackend backend;
    FakeNetwork& network = backend.fakeNetwork;
    ChangeEvents events{backend};
    std::vector<std::string> told;
};

TEST_F(ChangeEventsTest, OnlyWhatChangedIsTold)
{
    for (const Change change : ALL)
        listen(change, std::to_string(static_cast<int>(change)) + "=");
    EXPECT_THAT(taken(), IsEmpty());
    network.tell();
    EXPECT_THAT(taken(), IsEmpty());
    network.change([](Answers& answers) { answers.packetData = answered(true); });
    EXPECT_THAT(taken(), ElementsAre("3=1"));
    network.change([](Answers& answers) { answers.wifi = answered(LinkState::Deactivated); });
    EXPECT_THAT(taken(), ElementsAre("0=0")); // off and disconnected are one status
    network.change([](Answers& answers) { answers.wifi = answered(LinkState::Disconnected); });
    EXPECT_THAT(taken(), ElementsAre("0=1"));
    network.change([](Answers& answers) { answers.wifi = answered(LinkState::Connected); });
    EXPECT_THAT(taken(), ElementsAre("2=1")); // the radio was on before
}

TEST_F(ChangeEventsTest, EveryStepIsToldWhenSeveralWait)
{
    listen(Change::FlightMode, "");
    setFlightMode(true);
    setFlightMode(false);
    setFlightMode(true);
    EXPECT_THAT(taken(), ElementsAre("1", "0", "1"));
}

TEST_F(ChangeEventsTest, FailedReadKeepsTheLastGoodValue)
{
    listen(Change::FlightMode, "");
    network.change([](Answers& answers) { answers.flightMode = FAILED; });
    EXPECT_THAT(taken(), IsEmpty());
    setFlightMode(false);
    EXPECT_THAT(taken(), IsEmpty());
    network.change([](Answers& answers) { answers.flightMode = FAILED; });
    setFlightMode(true);
    EXPECT_THAT(taken(), ElementsAre("1"));
}

TEST_F(ChangeEventsTest, FirstAnswerAfterNoneIsTold)
{
    network.change([](Answers& answers) {
        answers.wifi = FAILED;
        answers.flightMode = FAILED;
    });
    listen(Change::WifiDevice, "device");
    listen(Change::FlightMode, "flight");
    network.change([](Answers& answers) {
        answers.wifi = answered(LinkState::Deactivated);
        answers.flightMode = answered(false);
    });
    EXPECT_THAT(taken(), ElementsAre("device0", "flight0"));
}

TEST_F(ChangeEventsTest, SettingAgainReplaces)
{
    listen(Change::FlightMode, "first");
    setFlightMode(true); // waits for the first, which does not hear of it any more
    listen(Change::FlightMode, "second");
    EXPECT_THAT(taken(), IsEmpty());
    setFlightMode(false);
    EXPECT_THAT(taken(), ElementsAre("second0"));
}

TEST_F(ChangeEventsTest, NothingIsToldAfterUnsetAndOfWhatWasBeforeSet)
{
    listen(Change::PacketData, "data");
    listen(Change::FlightMode, "first");
    setFlightMode(true);
    events.unset(Change::FlightMode);
    EXPECT_THAT(taken(), IsEmpty());
    setFlightMode(false);
    listen(Change::FlightMode, "second");
    network.tell();
    EXPECT_THAT(taken(), IsEmpty());
}

TEST_F(ChangeEventsTest, BackendIsWatchedOnlyWhileSomebodyListens)
{
    EXPECT_EQ(0, network.watches());
    listen(Change::FlightMode, "");
    listen(Change::PacketData, "");
    listen(Change::PacketData, "");
    EXPECT_EQ(1, network.watches());
    events.unset(Change::FlightMode);
    EXPECT_EQ(1, network.watches());
    events.unset(Change::PacketData);
    EXPECT_EQ(0, network.watches());
    events.unset(Change::PacketData);
    listen(Change::FlightMode, "");
    EXPECT_EQ(1, network.watches());
}

TEST_F(ChangeEventsTest, BackendThatCannotBeWatchedIsRefused)
{
    network.watchable = false;
    EXPECT_FALSE(events.set(Change::FlightMode, [this](int) { told.emplace_back("refused"); }));
    network.watchable = true;
    setFlightMode(true);
    EXPECT_THAT(taken(), IsEmpty());
}

TEST_F(ChangeEventsTest, ContextThatNeverRunsLosesNothingAndKeepsNothing)
{
    const auto kept = std::make_shared<int>(0);
    EXPECT_TRUE(events.set(Change::FlightMode, [kept](int) { ++*kept; }));
    for (int i = 0; i < 100; ++i)
        setFlightMode(i % 2 == 0);
    EXPECT_EQ(0, *kept);
    EXPECT_EQ(2, kept.use_count());
    events.unset(Change::FlightMode);
    EXPECT_EQ(1, kept.use_count());
}

TEST_F(ChangeEventsTest, CallbackMayUnsetItself)
{
    const auto kept = std::make_shared<int>(0);
    EXPECT_TRUE(events.set(Change::FlightMode, [this, kept](int) {
        ++*kept;
        events.unset(Change::FlightMode);
    }));
    setFlightMode(true);
    setFlightMode(false);
    EXPECT_THAT(taken(), IsEmpty());
    EXPECT_EQ(1, *kept);
    EXPECT_EQ(1, kept.use_count());
    EXPECT_EQ(0, network.watches());
}

TEST_F(ChangeEventsTest, CallbackMayUnsetTheNextOneAndSetAnother)
{
    listen(Change::FlightMode, "flight");
    EXPECT_TRUE(events.set(Change::PacketData, [this](int) {
        events.unset(Change::FlightMode);
        listen(Change::PacketData, "second");
    }));
    setBoth(true);
    EXPECT_THAT(taken(), IsEmpty());
    setBoth(false);
    EXPECT_THAT(taken(), ElementsAre("second0"));
}

TEST_F(ChangeEventsTest, CallbackMayRunItsLoop)
{
    EXPECT_TRUE(events.set(Change::FlightMode, [this](int value) {
        told.push_back("begin" + std::to_string(value));
        runLoop();
        told.push_back("end" + std::to_string(value));
    }));
    setFlightMode(true);
    setFlightMode(false);
    EXPECT_THAT(taken(), ElementsAre("begin1", "begin0", "end0", "end1"));
}

TEST_F(ChangeEventsTest, EachCallbackRunsOnTheContextOfItsRegistration)
{
    port::ContextThread other;
    std::promise<std::thread::id> place;
    other.run([&] {
        EXPECT_TRUE(events.set(Change::PacketData,
                               [&](int) { place.set_value(std::this_thread::get_id()); }));
    });
    listen(Change::FlightMode, "here");
    setBoth(true);
    std::thread::id theirs;
    other.run([&] { theirs = std::this_thread::get_id(); });
    EXPECT_EQ(theirs, place.get_future().get());
    EXPECT_THAT(taken(), ElementsAre("here1"));
    events.unset(Change::PacketData); // its promise ends here
}

TEST_F(ChangeEventsTest, UnsetAndReplacingWaitForACallOnAnotherThread)
{
    const std::function<void()> ends[] = {[this] { events.unset(Change::FlightMode); },
                                          [this] { listen(Change::FlightMode, ""); }};
    for (const auto& endIt : ends) {
        setFlightMode(false);
        port::ContextThread other;
        std::promise<void> begun;
        std::promise<void> mayEnd;
        std::atomic<bool> ended{false};
        other.run([&] {
            EXPECT_TRUE(events.set(Change::FlightMode, [&](int) {
                begun.set_value();
                mayEnd.get_future().wait();
                ended = true;
            }));
        });
        setFlightMode(true);
        begun.get_future().wait();
        std::thread releaser([&] { mayEnd.set_value(); });
        endIt();
        EXPECT_TRUE(ended);
        releaser.join();
    }
}

// How often; the environment may ask for more.
int rounds()
{
    const char* const asked = std::getenv("CORESYSTEM_TEST_ROUNDS");
    return asked != nullptr ? std::atoi(asked) : 300;
}

TEST_F(ChangeEventsTest, ThreadsMaySetAndUnsetWhileChangesArrive)
{
    port::ContextThread loop;
    std::atomic<bool> done{false};
    std::thread changing([&] {
        for (bool on = true; !done; on = !on)
            setBoth(on);
    });
    std::atomic<int> late{0};
    together(2, [&](int number) {
        const Change change = number == 0 ? Change::FlightMode : Change::PacketData;
        for (int round = 0; round < rounds(); ++round) {
            const auto live = std::make_shared<std::atomic<bool>>(true);
            const auto listening = [&, live] {
                events.set(change, [&late, live](int) { late += *live ? 0 : 1; });
            };
            if (round % 2 == 0)
                loop.run(listening);
            else
                listening(); // on a context whose loop nobody runs
            events.unset(change);
            *live = false;
        }
    });
    done = true;
    changing.join();
    EXPECT_EQ(0, late);
    EXPECT_EQ(0, network.watches());
}

TEST_F(ChangeEventsTest, ThreadsMayReplaceEachOther)
{
    std::vector<port::ContextThread> loops(2);
    together(3, [&](int number) {
        for (int round = 0; round < rounds(); ++round)
            if (number == 2)
                setFlightMode(round % 2 == 0);
            else
                loops[static_cast<std::size_t>(number)].run(
                    [&] { EXPECT_TRUE(events.set(Change::FlightMode, [](int) {})); });
    });
    EXPECT_EQ(1, network.watches());
    events.unset(Change::FlightMode);
}

TEST(ChangeEventsDeathTest, ProcessMayEndWhileChangesArrive)
{
    EXPECT_EXIT(
        {
            auto& backend = *new FakeBackend;
            auto& network = backend.fakeNetwork;
            auto& events = *new ChangeEvents(backend);
            auto& loop = *new port::ContextThread;
            std::promise<void> told;
            loop.run([&] {
                events.set(Change::FlightMode, [&told, first = true](int) mutable {
                    if (std::exchange(first, false))
                        told.set_value();
                });
            });
            std::thread([&network] {
                for (bool on = true;; on = !on)
                    network.change([on](Answers& answers) { answers.flightMode = answered(on); });
            }).detach();
            told.get_future().wait();
            std::exit(0);
        },
        testing::ExitedWithCode(0), "");
}

} // namespace
