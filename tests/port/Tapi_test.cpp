// SPDX-License-Identifier: Apache-2.0
// The older telephony functions over a backend that answers what a test says.
#include <new>

#include <ITapiCall.h>
#include <ITapiNetText.h>
#include <ITapiNetwork.h>
#include <ITapiSim.h>
#include <gmock/gmock.h>
#include <tapi_common.h>
#include <telephony.h>

#include "coresystem_port.h"
#include "shim/Handles.h"
#include "support/FakeBackend.h"
#include "support/Together.h"

using coresystem_port::lastOrigin;
using coresystem_port::Question;
using port::CardStatus;
using port::Subscriptions;
using testing::Each;
using testing::ElementsAre;
using testing::HasSubstr;
using testing::IsEmpty;
using testing::SizeIs;

namespace {

using ModemHandles = port::Handles<TapiHandle*, port::SlotName>;
using Names = FakeTelephony::Names;

class TapiTest : public testing::Test {
protected:
    void setCard(CardStatus value, bool isAnother = false)
    {
        telephony.cardAnswer = answered(port::Card{value, isAnother});
    }

    FakedBackend backend;
    FakeTelephony& telephony = backend.fakeTelephony;
    TelSimImsiInfo_t imsi = {};
    TelSimCardStatus_t status = TAPI_SIM_STATUS_CARD_CRASHED;
    int changed = 7;
};

// A handle on the first modem that is released with the test.
class TapiHandleTest : public TapiTest {
protected:
    TapiHandleTest()
    {
        telephony.questions.clear();
    }
    ~TapiHandleTest() override
    {
        EXPECT_EQ(0, tel_deinit(handle));
        EXPECT_EQ(0U, ModemHandles::live());
    }

    TapiHandle* const handle = tel_init("modem0");
};

std::vector<std::string> textsOf(char** list)
{
    std::vector<std::string> texts;
    for (; *list != nullptr; ++list)
        texts.emplace_back(*list);
    return texts;
}

TEST_F(TapiTest, NamesAreListedInOrderInListsThatStayAndAreNotMultiplied)
{
    char** const first = tel_get_cp_name_list();
    EXPECT_THAT(telephony.questions, ElementsAre("slots"));
    EXPECT_EQ("test", lastOrigin(Question::SimSlots).source);
    telephony.slotsAnswer = answered(Names{"other"});
    char** const second = tel_get_cp_name_list();
    EXPECT_NE(first, second);
    EXPECT_THAT(textsOf(second), ElementsAre("other"));
    EXPECT_THAT(textsOf(first), ElementsAre("modem0", "modem1"));
    telephony.slotsAnswer = answered(Names{"modem0", "modem1"});
    EXPECT_EQ(first, tel_get_cp_name_list());
}

TEST_F(TapiTest, NoModemIsAListWithoutNames)
{
    telephony.slotsAnswer = answered(Names{});
    char** const names = tel_get_cp_name_list();
    ASSERT_NE(nullptr, names);
    for (std::size_t slot = 0; slot <= port::SLOT_LIMIT; ++slot)
        EXPECT_EQ(nullptr, names[slot]) << "the place of a slot that went away: " << slot;
}

TEST_F(TapiTest, NoListIsLongerThanTheLimit)
{
    Names names;
    while (names.size() < port::SLOT_LIMIT)
        names.push_back("modem" + std::to_string(names.size()));
    telephony.slotsAnswer = answered(names);
    EXPECT_THAT(textsOf(tel_get_cp_name_list()), SizeIs(port::SLOT_LIMIT));
    names.emplace_back("one more");
    telephony.slotsAnswer = answered(names);
    EXPECT_EQ(nullptr, tel_get_cp_name_list());
    EXPECT_THAT(lastOrigin(Question::SimSlots).reason, HasSubstr("has more than 64 slots"));
    telephony_handle_list_s list = {};
    EXPECT_NE(TELEPHONY_ERROR_NONE, telephony_init(&list));
}

TEST_F(TapiTest, NoServiceIsNoList)
{
    for (const port::Error& error :
         {port::notAvailable("no service"), port::denied("no"), port::notSupported("a tablet")}) {
        telephony.slotsAnswer = error;
        EXPECT_EQ(nullptr, tel_get_cp_name_list());
        EXPECT_EQ(error.reason, lastOrigin(Question::SimSlots).reason);
    }
}

TEST_F(TapiTest, ModemIsOpenedByItsNameAndTheFirstOneWithout)
{
    for (const auto& [name, question] :
         {std::pair("modem1", "imsi modem1"), {nullptr, "imsi modem0"}}) {
        TapiHandle* const handle = tel_init(name);
        ASSERT_NE(nullptr, handle);
        telephony.questions.clear();
        EXPECT_EQ(0, tel_get_sim_imsi(handle, &imsi));
        EXPECT_THAT(telephony.questions, ElementsAre(question));
        EXPECT_EQ(0, tel_deinit(handle));
    }
}

TEST_F(TapiTest, UnknownModemsAreNotOpened)
{
    for (const char* const name : {"", "modem", "modem00", "MODEM0", " modem0"})
        EXPECT_EQ(nullptr, tel_init(name)) << name;
    telephony.slotsAnswer = answered(Names{});
    EXPECT_EQ(nullptr, tel_init(nullptr));
    telephony.slotsAnswer = port::notAvailable("no service");
    EXPECT_EQ(nullptr, tel_init("modem0"));
    EXPECT_EQ(nullptr, tel_init(nullptr));
    EXPECT_EQ(0U, ModemHandles::live());
}

TEST_F(TapiTest, EachOpenIsAHandleOfItsOwnAndCounted)
{
    TapiHandle* const first = tel_init("modem0");
    TapiHandle* const second = tel_init("modem0");
    EXPECT_NE(first, second);
    EXPECT_EQ(2U, ModemHandles::live());
    EXPECT_EQ(0, tel_deinit(first));
    EXPECT_EQ(1U, ModemHandles::live());
    EXPECT_EQ(0, tel_deinit(second));
    EXPECT_EQ(0U, ModemHandles::live());
}

// The result of every function that takes a handle.
std::vector<int> askAll(TapiHandle* handle)
{
    TelSimImsiInfo_t imsi = {};
    TelSimCardStatus_t status = TAPI_SIM_STATUS_UNKNOWN;
    TelNetworkDefaultSubs_t network = TAPI_NETWORK_DEFAULT_SUBS_SIM2;
    TelNetworkDefaultDataSubs_t data = TAPI_NETWORK_DEFAULT_DATA_SUBS_SIM2;
    TelCallPreferredVoiceSubs_t voice = TAPI_CALL_PREFERRED_VOICE_SUBS_ASK_ALWAYS;
    int number = 7;
    std::vector<int> results = {tel_get_sim_imsi(handle, &imsi),
                                tel_get_sim_init_info(handle, &status, &number),
                                tel_get_network_default_subscription(handle, &network),
                                tel_get_network_default_data_subscription(handle, &data),
                                tel_get_call_preferred_voice_subscription(handle, &voice),
                                tel_check_sms_device_status(handle, &number)};
    EXPECT_STREQ("", imsi.szMcc);
    EXPECT_EQ(TAPI_SIM_STATUS_UNKNOWN, status);
    EXPECT_EQ(TAPI_NETWORK_DEFAULT_SUBS_SIM2, network);
    EXPECT_EQ(TAPI_NETWORK_DEFAULT_DATA_SUBS_SIM2, data);
    EXPECT_EQ(TAPI_CALL_PREFERRED_VOICE_SUBS_ASK_ALWAYS, voice);
    EXPECT_EQ(7, number);
    return results;
}

TEST_F(TapiTest, NullReleasedAndForeignHandlesAreInvalid)
{
    TapiHandle* const released = tel_init("modem0");
    EXPECT_EQ(0, tel_deinit(released));
    telephony_handle_list_s list = {};
    ASSERT_EQ(0, telephony_init(&list));
    TapiHandle* otherKind = nullptr;
    std::memcpy(&otherKind, list.handle, sizeof otherKind);
    telephony.questions.clear();
    int onTheStack = 0;
    for (TapiHandle* const handle : {static_cast<TapiHandle*>(nullptr), released, otherKind,
                                     reinterpret_cast<TapiHandle*>(&onTheStack)}) {
        EXPECT_THAT(askAll(handle), Each(-2));
        EXPECT_EQ(-2, tel_deinit(handle));
    }
    EXPECT_THAT(telephony.questions, IsEmpty());
    EXPECT_EQ(0, telephony_deinit(&list));
}

TEST_F(TapiHandleTest, NullSlotsAreInvalid)
{
    EXPECT_EQ(-2, tel_get_sim_imsi(handle, nullptr));
    EXPECT_EQ(-2, tel_get_sim_init_info(handle, nullptr, &changed));
    EXPECT_EQ(-2, tel_get_sim_init_info(handle, &status, nullptr));
    EXPECT_EQ(-2, tel_get_network_default_subscription(handle, nullptr));
    EXPECT_EQ(-2, tel_get_network_default_data_subscription(handle, nullptr));
    EXPECT_EQ(-2, tel_get_call_preferred_voice_subscription(handle, nullptr));
    EXPECT_EQ(-2, tel_check_sms_device_status(handle, nullptr));
    EXPECT_THAT(telephony.questions, IsEmpty());
}

TEST_F(TapiHandleTest, EveryErrorHasItsCode)
{
    for (const auto& [error, code] : {std::pair(port::notAvailable("gone"), -17),
                                      {port::notSupported("no radio"), -3},
                                      {port::denied("private"), -19}}) {
        telephony.imsiAnswer = error;
        telephony.cardAnswer = error;
        telephony.subscriptionsAnswer = error;
        telephony.smsAnswer = error;
        EXPECT_THAT(askAll(handle), Each(code));
        for (const Question question : {Question::SimIdentity, Question::SimCard,
                                        Question::Subscriptions, Question::SmsReadiness})
            EXPECT_EQ(error.reason, lastOrigin(question).reason);
    }
}

TEST_F(TapiHandleTest, ImsiComesInItsParts)
{
    for (const port::Imsi& whole :
         {port::Imsi{"310", "260", "123456789"}, port::Imsi{"001", "01", "0123456789"}}) {
        telephony.imsiAnswer = answered(whole);
        ASSERT_EQ(0, tel_get_sim_imsi(handle, &imsi));
        EXPECT_EQ(whole.mcc, imsi.szMcc);
        EXPECT_EQ(whole.mnc, imsi.szMnc);
        EXPECT_EQ(whole.msin, imsi.szMsin);
    }
    EXPECT_EQ("test", lastOrigin(Question::SimIdentity).source);
}

TEST_F(TapiHandleTest, ImsiThatDoesNotFitIsNotCut)
{
    for (const port::Imsi& tooLong :
         {port::Imsi{"0010", "01", "0123456789"}, port::Imsi{"001", "0001", "0123456789"},
          port::Imsi{"001", "01", "01234567890"}}) {
        telephony.imsiAnswer = answered(tooLong);
        EXPECT_EQ(-17, tel_get_sim_imsi(handle, &imsi));
        EXPECT_STREQ("", imsi.szMcc);
    }
}

TEST_F(TapiHandleTest, BothGenerationsTellEveryCardAndWhyItCannotBeRead)
{
    const struct {
        CardStatus status;
        int number;
        telephony_sim_state_e state;
        int imsiCode;
    } rows[] = {
        {CardStatus::Error, 0, TELEPHONY_SIM_STATE_UNAVAILABLE, -501},
        {CardStatus::Absent, 1, TELEPHONY_SIM_STATE_UNAVAILABLE, -501},
        {CardStatus::Initializing, 2, TELEPHONY_SIM_STATE_UNKNOWN, -502},
        {CardStatus::Ready, 3, TELEPHONY_SIM_STATE_AVAILABLE, -502},
        {CardStatus::PinRequired, 4, TELEPHONY_SIM_STATE_LOCKED, -503},
        {CardStatus::PukRequired, 5, TELEPHONY_SIM_STATE_LOCKED, -503},
        {CardStatus::Blocked, 6, TELEPHONY_SIM_STATE_LOCKED, -504},
        {CardStatus::NetworkLocked, 7, TELEPHONY_SIM_STATE_LOCKED, -503},
        {CardStatus::SubsetLocked, 8, TELEPHONY_SIM_STATE_LOCKED, -503},
        {CardStatus::ProviderLocked, 9, TELEPHONY_SIM_STATE_LOCKED, -503},
        {CardStatus::CorporateLocked, 10, TELEPHONY_SIM_STATE_LOCKED, -503},
        {CardStatus::Removed, 11, TELEPHONY_SIM_STATE_UNAVAILABLE, -501},
        {CardStatus::DeviceLocked, 12, TELEPHONY_SIM_STATE_LOCKED, -503},
        {CardStatus::Crashed, 13, TELEPHONY_SIM_STATE_UNAVAILABLE, -501},
        {CardStatus::PoweredOff, 14, TELEPHONY_SIM_STATE_UNAVAILABLE, -501},
        {CardStatus::Unknown, 255, TELEPHONY_SIM_STATE_UNKNOWN, -502},
    };
    telephony_handle_list_s list = {};
    ASSERT_EQ(0, telephony_init(&list));
    telephony.imsiAnswer = port::noSim("why");
    for (const auto& row : rows) {
        SCOPED_TRACE(row.number);
        setCard(row.status);
        ASSERT_EQ(0, tel_get_sim_init_info(handle, &status, &changed));
        EXPECT_EQ(row.number, static_cast<int>(status));
        EXPECT_EQ(0, changed);
        auto state = static_cast<telephony_sim_state_e>(3);
        ASSERT_EQ(0, telephony_sim_get_state(list.handle[0], &state));
        EXPECT_EQ(row.state, state);
        EXPECT_EQ(row.imsiCode, tel_get_sim_imsi(handle, &imsi));
        EXPECT_STREQ("", imsi.szMcc);
    }
    EXPECT_EQ("test", lastOrigin(Question::SimCard).source);
    EXPECT_EQ(0, telephony_deinit(&list));
    setCard(CardStatus::Ready, true);
    ASSERT_EQ(0, tel_get_sim_init_info(handle, &status, &changed));
    EXPECT_EQ(1, changed);
    telephony.cardAnswer = port::notAvailable("gone in between");
    EXPECT_EQ(-17, tel_get_sim_imsi(handle, &imsi));
    EXPECT_EQ("why", lastOrigin(Question::SimIdentity).reason);
}

TEST_F(TapiHandleTest, SubscriptionsAreNumberedFromTheFirstSlot)
{
    for (const auto& [slot, name] :
         {std::pair(std::optional<int>(), -1), {0, 0}, {1, 1}, {2, -1}}) {
        Subscriptions all;
        all.network = slot;
        telephony.subscriptionsAnswer = answered(all);
        TelNetworkDefaultSubs_t network = TAPI_NETWORK_DEFAULT_SUBS_UNKNOWN;
        TelNetworkDefaultDataSubs_t data = TAPI_NETWORK_DEFAULT_DATA_SUBS_SIM1;
        ASSERT_EQ(0, tel_get_network_default_subscription(handle, &network));
        ASSERT_EQ(0, tel_get_network_default_data_subscription(handle, &data));
        EXPECT_EQ(name, static_cast<int>(network));
        EXPECT_EQ(TAPI_NETWORK_DEFAULT_DATA_SUBS_UNKNOWN, data);
        std::swap(all.network, all.data);
        telephony.subscriptionsAnswer = answered(all);
        ASSERT_EQ(0, tel_get_network_default_data_subscription(handle, &data));
        EXPECT_EQ(name, static_cast<int>(data));
    }
}

TEST_F(TapiHandleTest, EveryVoicePreferenceHasItsNumber)
{
    using Voice = Subscriptions::Voice;
    for (const auto& [preference, number] : {std::pair(Voice::Unknown, -1),
                                             {Voice::CurrentNetwork, 0},
                                             {Voice::AskAlways, 1},
                                             {Voice::Slot1, 2},
                                             {Voice::Slot2, 3}}) {
        Subscriptions all;
        all.voice = preference;
        telephony.subscriptionsAnswer = answered(all);
        TelCallPreferredVoiceSubs_t voice = TAPI_CALL_PREFERRED_VOICE_SUBS_UNKNOWN;
        ASSERT_EQ(0, tel_get_call_preferred_voice_subscription(handle, &voice));
        EXPECT_EQ(number, static_cast<int>(voice));
    }
}

TEST_F(TapiHandleTest, SmsReadinessIsOneOrZero)
{
    for (const int expected : {1, 0}) {
        telephony.smsAnswer = answered(expected == 1);
        int ready = 7;
        ASSERT_EQ(0, tel_check_sms_device_status(handle, &ready));
        EXPECT_EQ(expected, ready);
    }
}

TEST_F(TapiHandleTest, NoExceptionLeaves)
{
    telephony.before = [] { throw std::string("trouble"); };
    EXPECT_EQ(nullptr, tel_get_cp_name_list());
    EXPECT_EQ(nullptr, tel_init("modem0"));
    EXPECT_THAT(askAll(handle), Each(-17));
    telephony.before = [] { throw std::bad_alloc(); };
    EXPECT_EQ(nullptr, tel_get_cp_name_list());
    EXPECT_THAT(askAll(handle), Each(-5));
}

TEST_F(TapiTest, ThreadsMayOpenAskAndReleaseAtOnce)
{
    together(8, [](int number) {
        for (int round = 0; round < 100; ++round) {
            char** const names = tel_get_cp_name_list();
            TapiHandle* const mine = tel_init(names[number % 2]);
            TelSimImsiInfo_t parts = {};
            EXPECT_EQ(0, tel_get_sim_imsi(mine, &parts));
            EXPECT_EQ(0, tel_deinit(mine));
        }
    });
    EXPECT_EQ(0U, ModemHandles::live());
}

} // namespace
