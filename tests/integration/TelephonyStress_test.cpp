// SPDX-License-Identifier: Apache-2.0
// Many threads ask the real ModemManager while its modems come and go.
// CORESYSTEM_STRESS_SECONDS sets for how long; it is 3 without it.
#include "linux/Telephony.h"

#include <atomic>
#include <chrono>
#include <cstdlib>
#include <iostream>
#include <string>
#include <thread>

#include <gmock/gmock.h>

#include "support/ModemsOnBus.h"
#include "support/TelephonyQuestions.h"
#include "support/Together.h"

using port::Telephony;
using port::linux_backend::Bus;
using port::linux_backend::LinuxTelephony;

namespace {

constexpr int THREADS = 8;
constexpr int MODEMS = 3;

std::chrono::seconds duration()
{
    const char* const seconds = std::getenv("CORESYSTEM_STRESS_SECONDS");
    return std::chrono::seconds(seconds != nullptr ? std::atoi(seconds) : 3);
}

std::string idOf(int modem)
{
    return "m" + std::to_string(modem);
}

port::SlotName slotOf(int modem)
{
    return "/virtual/" + idOf(modem);
}

// A card whose MCC tells whose it is.
AtModem::State stateOf(int modem)
{
    AtModem::State state;
    state.imsi = std::to_string(200 + modem) + "01" + "1234567890";
    return state;
}

struct Count {
    std::atomic<long> asked{0};
    std::atomic<long> answered{0};
    std::atomic<long> imsis{0};
};

void askEverything(Telephony& telephony, int modem, Count& count)
{
    for (const auto& question : telephonyQuestions()) {
        const auto error = question.ask(telephony, slotOf(modem));
        EXPECT_TRUE(!error || !error->reason.empty()) << question.name;
        ++count.asked;
        count.answered += error ? 0 : 1;
    }
    if (const auto imsi = telephony.imsi(slotOf(modem))) {
        EXPECT_EQ(std::to_string(200 + modem), imsi.value().value.mcc); // never another card's
        ++count.imsis;
    }
}

// One of the things that happen to modems.
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

TEST(TelephonyStressTest, ThreadsMayAskWhileModemsComeAndGo)
{
    if (!ModemsOnBus::obstacle().empty())
        GTEST_SKIP() << ModemsOnBus::obstacle();
    ModemsOnBus modems;
    for (int modem = 0; modem < MODEMS; ++modem)
        modems.add(idOf(modem), stateOf(modem));
    Bus bus;
    LinuxTelephony telephony(bus);
    Count count;
    std::atomic<bool> done{false};
    std::thread askers([&] {
        together(THREADS, [&](int number) {
            for (int round = number; !done; ++round)
                askEverything(telephony, round % MODEMS, count);
        });
    });
    const auto end = std::chrono::steady_clock::now() + duration();
    int step = 0;
    while (std::chrono::steady_clock::now() < end)
        disturb(modems, step++);
    done = true;
    askers.join();
    std::cout << THREADS << " threads, " << step << " disturbances: " << count.asked
              << " questions, " << count.answered << " answers, " << count.imsis << " IMSIs checked"
              << std::endl;
    EXPECT_GT(step, 3);
    EXPECT_GT(count.answered, THREADS * 10);
    EXPECT_LT(count.answered, count.asked); // modems did come and go
    EXPECT_GT(count.imsis, 0);
}

} // namespace
