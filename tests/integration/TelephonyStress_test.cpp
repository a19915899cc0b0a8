// SPDX-License-Identifier: Apache-2.0
// Many threads ask the real ModemManager while its modems come and go.
#include "linux/Telephony.h"

#include <iostream>

#include <gmock/gmock.h>

#include "support/ModemsThatComeAndGo.h"
#include "support/TelephonyQuestions.h"

using port::Telephony;
using port::linux_backend::Bus;
using port::linux_backend::LinuxTelephony;
using Modems = ModemsThatComeAndGo;

namespace {

struct Count {
    std::atomic<long> asked{0};
    std::atomic<long> answered{0};
    std::atomic<long> imsis{0};
};

void askEverything(Telephony& telephony, int modem, Count& count)
{
    for (const auto& question : telephonyQuestions()) {
        const auto error = question.ask(telephony, Modems::slotOf(modem));
        EXPECT_TRUE(!error || !error->reason.empty()) << question.name;
        ++count.asked;
        count.answered += error ? 0 : 1;
    }
    if (const auto imsi = telephony.imsi(Modems::slotOf(modem))) {
        EXPECT_EQ(Modems::mccOf(modem), imsi.value().value.mcc); // never another card's
        ++count.imsis;
    }
}

TEST(TelephonyStressTest, ThreadsMayAskWhileModemsComeAndGo)
{
    if (!ModemsOnBus::obstacle().empty())
        GTEST_SKIP() << ModemsOnBus::obstacle();
    Modems modems;
    Bus bus;
    LinuxTelephony telephony(bus);
    Count count;
    const int steps = modems.whileTheyComeAndGo(
        [&](int round) { askEverything(telephony, round % Modems::MODEMS, count); });
    std::cout << Modems::THREADS << " threads, " << steps << " disturbances: " << count.asked
              << " questions, " << count.answered << " answers, " << count.imsis << " IMSIs checked"
              << std::endl;
    EXPECT_GT(steps, 3);
    EXPECT_GT(count.answered, Modems::THREADS * 10);
    EXPECT_LT(count.answered, count.asked); // modems did come and go
    EXPECT_GT(count.imsis, 0);
}

} // namespace
