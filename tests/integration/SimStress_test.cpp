// SPDX-License-Identifier: Apache-2.0
// Many threads ask the library about SIM cards while the modems come and go: from the facade over
// the port to the real ModemManager.
#include <CoreSystem.h>

#include <cstdlib>
#include <iostream>
#include <string>

#include <gmock/gmock.h>

#include <coresystem_port.h>

#include "support/ModemsThatComeAndGo.h"

using Modems = ModemsThatComeAndGo;

namespace {

struct Count {
    std::atomic<long> asked{0};
    std::atomic<long> answered{0};

    void add(bool isAnswer)
    {
        ++asked;
        answered += isAnswer ? 1 : 0;
    }
};

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

bool isOfSomeModem(const std::string& mcc)
{
    for (int modem = 0; modem < Modems::MODEMS; ++modem)
        if (mcc == Modems::mccOf(modem))
            return true;
    return false;
}

void askFirstCard(Count& count)
{
    const std::string mcc = textOf(&CoreSystem::GetMCCFromSim, count);
    EXPECT_TRUE(mcc.empty() || isOfSomeModem(mcc)) << mcc;
    const std::string mnc = textOf(&CoreSystem::GetMNCFromSim, count);
    EXPECT_TRUE(mnc.empty() || mnc == "01") << mnc;
    const std::string number = textOf(&CoreSystem::GetPhoneNumberFromSim, count);
    EXPECT_TRUE(number.empty() || number == AtModem::State().number) << number;
    EXPECT_EQ(15U, textOf(&CoreSystem::GetIMEI, count).size());
    count.add(library().IsSimAvailable());
    count.add(library().IsSimExist());
}

void askSlots(int round, Count& count)
{
    const std::string name = Modems::slotOf(round % Modems::MODEMS);
    std::string mcc, mnc, msin;
    const bool isRead = library().GetSimInfo(name.c_str(), &mcc, &mnc, &msin);
    EXPECT_EQ(isRead ? Modems::mccOf(round % Modems::MODEMS) : "", mcc); // never another card's
    count.add(isRead);

    bool roaming = false;
    library().GetRoamingStatus(round % Modems::MODEMS, &roaming);
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

TEST(SimStressTest, ThreadsMayAskTheLibraryWhileModemsComeAndGo)
{
    if (!ModemsOnBus::obstacle().empty())
        GTEST_SKIP() << ModemsOnBus::obstacle();
    coresystem_port::setLogSink(coresystem_port::LogSink::None); // an error line for each failure
    Modems modems;
    Count count;
    const int steps = modems.whileTheyComeAndGo([&](int round) {
        askFirstCard(count);
        askSlots(round, count);
    });
    std::cout << Modems::THREADS << " threads, " << steps << " disturbances: " << count.asked
              << " questions, " << count.answered << " answers" << std::endl;
    EXPECT_GT(steps, 3);
    EXPECT_GT(count.answered, Modems::THREADS * 10);
    EXPECT_LT(count.answered, count.asked); // modems did come and go
}

} // namespace
