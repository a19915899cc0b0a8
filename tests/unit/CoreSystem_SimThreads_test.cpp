// SPDX-License-Identifier: Apache-2.0
// SIM questions of many threads at once.
#include "IdentityReads.h"
#include "support/Together.h"

using namespace fake;

namespace {

const int THREADS = 8;
const int ROUNDS = 50;

// Two cards in service, at home; every question has an answer.
void setWholeDevice()
{
    setSlots({KOREAN_CARD, AMERICAN_CARD});
    platform().answer("tel_init(null)", 0);
    for (const int slot : {0, 1}) {
        platform().answer(slotCall("telephony_modem_get_imei", slot), 0,
                          std::string("490154203237518"));
        platform().answer(slotCall("telephony_network_get_service_state", slot), 0, 0);
        platform().answer(slotCall("telephony_network_get_roaming_status", slot), 0, slot == 1);
        platform().answer(modemCall("tel_get_sim_init_info", slot), 0, 3);
        for (const char* function :
             {"tel_get_network_default_subscription", "tel_get_call_preferred_voice_subscription",
              "tel_get_network_default_data_subscription", "tel_check_sms_device_status"})
            platform().answer(modemCall(function, slot), 0, 1);
    }
}

void askStates(CoreSystem& system)
{
    EXPECT_TRUE(system.IsSimAvailable());
    EXPECT_TRUE(system.IsSimExist());
    EXPECT_TRUE(CoreSystemInternals::isDualSimAvailable());
    bool roaming = false;
    EXPECT_TRUE(system.GetRoamingStatus(1, &roaming));
    EXPECT_TRUE(roaming);
    char* imei = nullptr;
    EXPECT_EQ(system.GetIMEI(&imei), 0);
    EXPECT_STREQ(imei, "490154203237518");
    std::free(imei);
}

void askIdentity(CoreSystem& system)
{
    for (const IdentityRead& read : IDENTITY_READS) {
        char* value = nullptr;
        const int result = (system.*read.readFirst)(&value);
        EXPECT_EQ(result, 0);
        EXPECT_EQ(value, read.valueOf(KOREAN_CARD));
        std::free(value);
        std::vector<char*> values;
        int count = 0;
        (system.*read.readAll)(values, &count);
        EXPECT_EQ(count, 2);
        for (char* const element : values)
            std::free(element);
    }
}

void askLegacy(CoreSystem& system)
{
    telephony_handle_list_s list = {0, nullptr};
    EXPECT_TRUE(system.InitHandleList(&list));
    char* number = nullptr;
    EXPECT_TRUE(system.GetPhoneNumber(list.handle, &number));
    std::free(number);
    EXPECT_TRUE(system.DeinitHandleList(&list));

    char* const name = system.GetCpNameList()[1];
    TelSimCardStatus_t status = TAPI_SIM_STATUS_UNKNOWN;
    EXPECT_TRUE(system.IsAvaliableState(1, &status));
    TelNetworkDefaultSubs_t subscription = TAPI_NETWORK_DEFAULT_SUBS_UNKNOWN;
    EXPECT_TRUE(system.GetMainSimSubscription(name, &subscription));
    TelNetworkDefaultDataSubs_t data = TAPI_NETWORK_DEFAULT_DATA_SUBS_UNKNOWN;
    EXPECT_TRUE(system.GetDefaultDataSubscription(name, &data));
    TelCallPreferredVoiceSubs_t voice = TAPI_CALL_PREFERRED_VOICE_SUBS_UNKNOWN;
    EXPECT_TRUE(system.GetCallPreferredSubscription(name, &voice));
    int ready = 0;
    EXPECT_TRUE(system.CheckSmsEnabled(name, &ready));
    std::string parts[3];
    EXPECT_TRUE(system.GetSimInfo(name, &parts[0], &parts[1], &parts[2]));
    EXPECT_EQ(parts[0] + parts[1] + parts[2], AMERICAN_CARD.imsi());
}

class SimThreadsTest : public PlatformTest {};

TEST_F(SimThreadsTest, EveryQuestionMayBeAskedOnAnyThread)
{
    setWholeDevice();
    together(THREADS, [](int) {
        for (int round = 0; round < ROUNDS; ++round) {
            askStates(*CoreSystem::GetInstance());
            askIdentity(*CoreSystem::GetInstance());
            askLegacy(*CoreSystem::GetInstance());
        }
    });
    // Only what is kept on purpose: six modems a round, and no list.
    const Texts live = platform().liveHandles();
    EXPECT_EQ(live.size(), static_cast<std::size_t>(THREADS * ROUNDS * 6));
    EXPECT_EQ(std::count(live.begin(), live.end(), "modem cp1"), THREADS * ROUNDS * 6);
    ledger().freeAll();
}

// A roaming question keeps every other read of SIM data out, from its beginning to its end.
TEST_F(SimThreadsTest, LockedQuestionIsNotInterrupted)
{
    setWholeDevice();
    together(THREADS, [](int) {
        for (int round = 0; round < ROUNDS; ++round) {
            bool roaming = false;
            CoreSystem::GetInstance()->GetRoamingStatus(1, &roaming);
            CoreSystem::GetInstance()->IsSimExist();
        }
    });
    Texts inside;
    int questions = 0;
    for (const std::string& text : platform().trace()) {
        if (text == "lock " + SIM_ACCESS)
            inside.clear();
        else if (text == "unlock " + SIM_ACCESS) {
            ++questions;
            ASSERT_EQ(inside.front(), "telephony_init()");
            ASSERT_EQ(inside.back(), deinitCall(2));
            ASSERT_EQ(inside.size(), 4u);
        } else if (text.compare(0, 9, "telephony") == 0)
            inside.push_back(text);
    }
    EXPECT_EQ(questions, 2 * THREADS * ROUNDS);
}

} // namespace
