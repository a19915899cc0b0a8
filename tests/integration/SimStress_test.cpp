// SPDX-License-Identifier: Apache-2.0
// Many threads ask about SIM cards while the modems come and go: from the facade over the port to the
// real ModemManager.
#include <CoreSystem.h>

#include <atomic>
#include <chrono>
#include <cstdlib>
#include <future>
#include <iostream>
#include <string>

#include <gmock/gmock.h>

#include <coresystem_port.h>

#include "support/ModemsOnBusTest.h"
#include "support/Together.h"

namespace {

constexpr int THREADS = 8;
constexpr int MODEMS = 3;

struct Count {
    std::atomic<long> asked{0};
    std::atomic<long> answered{0};

    void add(bool isAnswer)
    {
        ++asked;
        answered += isAnswer ? 1 : 0;
    }
};

// Several modems, each with a card whose MCC tells whose it is.
std::string idOf(int modem)
{
    return "m" + std::to_string(modem);
}

std::string slotOf(int modem)
{
    return "/virtual/" + idOf(modem);
}

std::string mccOf(int modem)
{
    return std::to_string(200 + modem);
}

AtModem::State stateOf(int modem)
{
    AtModem::State state;
    state.imsi = mccOf(modem) + "01" + "1234567890";
    return state;
}

CoreSystem& library()
{
    return *CoreSystem::GetInstance();
}

// The text that a question gives, empty for none.
std::string textOf(int (CoreSystem::*question)(char**), Count& count)
{
    char* slot = nullptr;
    (library().*question)(&slot);
    const std::string text = slot != nullptr ? slot : "";
    std::free(slot);
    count.add(!text.empty());
    return text;
}

void askFirstCard(Count& count)
{
    const std::string mcc = textOf(&CoreSystem::GetMCCFromSim, count);
    EXPECT_THAT(mcc, testing::AnyOf("", mccOf(0), mccOf(1), mccOf(2)));
    const std::string mnc = textOf(&CoreSystem::GetMNCFromSim, count);
    EXPECT_THAT(mnc, testing::AnyOf("", "01"));
    const std::string number = textOf(&CoreSystem::GetPhoneNumberFromSim, count);
    EXPECT_THAT(number, testing::AnyOf("", AtModem::State().number));
    EXPECT_EQ(15U, textOf(&CoreSystem::GetIMEI, count).size());
    count.add(library().IsSimAvailable());
    count.add(library().IsSimExist());
}

void askSlots(int round, Count& count)
{
    const int modem = round % MODEMS;
    std::string mcc, mnc, msin;
    const bool isRead = library().GetSimInfo(slotOf(modem).c_str(), &mcc, &mnc, &msin);
    EXPECT_EQ(isRead ? mccOf(modem) : "", mcc); // never another card's
    count.add(isRead);

    bool roaming = false;
    library().GetRoamingStatus(modem, &roaming);
    EXPECT_FALSE(roaming);

    telephony_handle_list_s list = {0, nullptr};
    const bool isFilled = library().InitHandleList(&list);
    count.add(isFilled);
    for (unsigned int slot = 0; slot < list.count; ++slot) {
        char* number = nullptr;
        count.add(library().GetPhoneNumber(&list.handle[slot], &number));
        std::free(number);
    }
    EXPECT_TRUE(library().DeinitHandleList(&list));
}

// One of them is unplugged or plugged in, or the daemon is killed and started.
void disturb(ModemsOnBus& modems, int step)
{
    const int modem = step / 2 % MODEMS;
    if (step % 12 == 11) {
        modems.kill();
        modems.start();
        for (int i = 0; i < MODEMS; ++i)
            modems.plugIn(idOf(i), stateOf(i));
    } else if (step % 2 == 0) {
        modems.unplug(idOf(modem));
    } else {
        modems.add(idOf(modem), stateOf(modem));
    }
}

using StressTest = ModemsOnBusTest;

// For CORESYSTEM_STRESS_SECONDS or 3 seconds.
TEST_F(StressTest, ThreadsMayAskTheLibraryWhileModemsComeAndGo)
{
    coresystem_port::setLogSink(coresystem_port::LogSink::None); // an error line for each failure
    for (int modem = 0; modem < MODEMS; ++modem)
        modems->add(idOf(modem), stateOf(modem));
    Count count;
    std::atomic<bool> done{false};
    auto askers = std::async(std::launch::async, [&] {
        together(THREADS, [&](int number) {
            for (int round = number; !done; ++round) {
                askFirstCard(count);
                askSlots(round, count);
            }
        });
    });
    const char* const seconds = std::getenv("CORESYSTEM_STRESS_SECONDS");
    const auto end = std::chrono::steady_clock::now() +
                     std::chrono::seconds(seconds != nullptr ? std::atoi(seconds) : 3);
    int steps = 0;
    try {
        while (std::chrono::steady_clock::now() < end)
            disturb(*modems, steps++);
    } catch (...) {
        done = true;
        throw;
    }
    done = true;
    askers.get();
    std::cout << THREADS << " threads, " << steps << " disturbances: " << count.asked
              << " questions, " << count.answered << " answers" << std::endl;
    EXPECT_GT(steps, 3);
    EXPECT_GT(count.answered, THREADS * 10);
    EXPECT_LT(count.answered, count.asked); // modems did come and go
}

} // namespace
