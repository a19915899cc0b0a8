// SPDX-License-Identifier: Apache-2.0
// The platform's telephony as it is: the wrappers of SimManager and the facade's ways to them.
#include <ITapiSim.h>
#include <TelCall.h>
#include <TelNetwork.h>

#include "SimSlots.h"

using namespace fake;
using testing::Each;
using testing::ElementsAre;
using testing::IsEmpty;

namespace {

char* nameOf(const char* text)
{
    return const_cast<char*>(text);
}

// The facade has each wrapper under the same name: `ask` takes either. Both are made a row.
template <class Ask>
void addCalls(std::vector<LoggedCall>& calls, const std::string& name, Ask ask, const Texts& trace)
{
    const Texts locked = lockedThroughout(trace);
    calls.push_back({name, [=] { ask(simManager()); }, locked});
    calls.push_back({"CoreSystem" + name, [=] { ask(coreSystem()); }, accessed(locked)});
}

void addListCalls(std::vector<LoggedCall>& calls)
{
    for (const int code : {0, -22, 1}) {
        const std::string suffix = code == 0 ? "" : code < 0 ? "Refused" : "RefusedAboveZero";
        addCalls(calls, "InitHandleList" + suffix,
                 [code](auto& target) {
                     platform().answer("telephony_init()", code, 2u);
                     telephony_handle_list_s list = {7, nullptr};
                     EXPECT_EQ(target.InitHandleList(&list), code == 0);
                     EXPECT_EQ(list.count, 2u); // whatever the platform wrote
                     EXPECT_THAT(platform().liveHandles(), ElementsAre("list of 2"));
                 },
                 {"telephony_init()"});
        addCalls(calls, "DeinitHandleList" + suffix,
                 [code](auto& target) {
                     platform().answer("telephony_deinit(list of 2)", code);
                     telephony_handle_list_s list = openList(2);
                     EXPECT_EQ(target.DeinitHandleList(&list), code == 0);
                     EXPECT_EQ(list.count, 0u); // the caller's own list, not a copy of it
                     EXPECT_EQ(list.handle, nullptr);
                     EXPECT_THAT(platform().liveHandles(), IsEmpty());
                 },
                 {"telephony_deinit(list of 2)"});
    }
    addCalls(calls, "InitHandleListWithoutTelephony",
             [](auto& target) {
                 setNoTelephony();
                 telephony_h preset = nullptr;
                 telephony_handle_list_s list = {7, &preset};
                 EXPECT_FALSE(target.InitHandleList(&list));
                 EXPECT_EQ(list.count, 7u);
                 EXPECT_EQ(list.handle, &preset);
             },
             {"telephony_init()"});
    addCalls(calls, "InitHandleListWithoutSlots",
             [](auto& target) {
                 setSlotCount(0);
                 telephony_handle_list_s list = {7, nullptr};
                 EXPECT_TRUE(target.InitHandleList(&list));
                 EXPECT_EQ(list.count, 0u);
             },
             {"telephony_init()"});
}

void addNameCalls(std::vector<LoggedCall>& calls)
{
    addCalls(calls, "GetCpNameList",
             [](auto& target) {
                 platform().setModems(Texts{"cp0", "cp1"});
                 char** const names = target.GetCpNameList();
                 EXPECT_EQ(names, platform().modemNames()); // the platform's own
                 EXPECT_STREQ(names[1], "cp1");
                 EXPECT_EQ(names[2], nullptr);
             },
             {"tel_get_cp_name_list()"});
    addCalls(calls, "GetCpNameListWithoutService",
             [](auto& target) { EXPECT_EQ(target.GetCpNameList(), nullptr); },
             {"tel_get_cp_name_list()"});
}

// A wrapper that asks a modem by its name. The handle stays open: meant.
template <class Ask>
void addModemCalls(std::vector<LoggedCall>& calls, const std::string& name,
                   const std::string& function, Ask ask)
{
    for (const int code : {0, 4, -1}) {
        const std::string suffix = code == 0 ? "" : code > 0 ? "Refused" : "RefusedBelowZero";
        addCalls(calls, name + suffix,
                 [=](auto& target) {
                     platform().answer("tel_init(cp1)", 0);
                     platform().answer(modemCall(function, 1), code, 1);
                     int answer = 99;
                     EXPECT_EQ(ask(target, nameOf("cp1"), &answer), code == 0);
                     EXPECT_EQ(answer, 1); // whatever the platform wrote
                     EXPECT_THAT(platform().liveHandles(), ElementsAre("modem cp1"));
                 },
                 {"tel_init(cp1)", modemCall(function, 1)});
    }
    addCalls(calls, name + "WithoutModem",
             [=](auto& target) {
                 platform().answer("tel_init(nobody)", -1);
                 platform().answer(function + "(no modem)", -2);
                 int answer = 99;
                 EXPECT_FALSE(ask(target, nameOf("nobody"), &answer));
                 EXPECT_EQ(answer, 99);
             },
             {"tel_init(nobody)", function + "(no modem)"});
    // The null handle is the platform's to judge.
    addCalls(calls, name + "WithoutModemAnswered",
             [=](auto& target) {
                 platform().answer("tel_init(nobody)", -1);
                 platform().answer(function + "(no modem)", 0, -1);
                 int answer = 99;
                 EXPECT_TRUE(ask(target, nameOf("nobody"), &answer));
                 EXPECT_EQ(answer, -1);
             },
             {"tel_init(nobody)", function + "(no modem)"});
    addCalls(calls, name + "OfFirstModem",
             [=](auto& target) {
                 platform().answer("tel_init(null)", 0);
                 platform().answer(function + "(modem null)", 0, 0);
                 int answer = 99;
                 EXPECT_TRUE(ask(target, nullptr, &answer));
                 EXPECT_EQ(answer, 0);
                 EXPECT_THAT(platform().liveHandles(), ElementsAre("modem null"));
             },
             {"tel_init(null)", function + "(modem null)"});
}

// Asks for a value of the enumeration, as the number that it is.
template <class Enum, class Ask>
bool asNumber(int* number, Ask ask)
{
    Enum value;
    std::memcpy(&value, number, sizeof value);
    const bool answered = ask(&value);
    std::memcpy(number, &value, sizeof value);
    return answered;
}

void addSubscriptionCalls(std::vector<LoggedCall>& calls)
{
    addModemCalls(calls, "GetMainSimSubscription", "tel_get_network_default_subscription",
                  [](auto& target, char* name, int* answer) {
                      return asNumber<TelNetworkDefaultSubs_t>(answer, [&](auto* value) {
                          return target.GetMainSimSubscription(name, value);
                      });
                  });
    addModemCalls(calls, "GetCallPreferredSubscription",
                  "tel_get_call_preferred_voice_subscription",
                  [](auto& target, char* name, int* answer) {
                      return asNumber<TelCallPreferredVoiceSubs_t>(answer, [&](auto* value) {
                          return target.GetCallPreferredSubscription(name, value);
                      });
                  });
    addModemCalls(calls, "GetDefaultDataSubscription", "tel_get_network_default_data_subscription",
                  [](auto& target, char* name, int* answer) {
                      return asNumber<TelNetworkDefaultDataSubs_t>(answer, [&](auto* value) {
                          return target.GetDefaultDataSubscription(name, value);
                      });
                  });
    addModemCalls(
        calls, "CheckSmsEnabled", "tel_check_sms_device_status",
        [](auto& target, char* name, int* answer) { return target.CheckSmsEnabled(name, answer); });
}

std::string initInfoCall(int slot)
{
    return modemCall("tel_get_sim_init_info", slot);
}

// Two modems; the status of each slot is to be set.
void setModems()
{
    platform().setModems(Texts{"cp0", "cp1"});
    platform().answer(initCall(0), 0);
    platform().answer(initCall(1), 0);
}

// Asks, beginning with `preset` in the status; the status then.
template <class Target>
int statusOf(Target& target, int slot, bool expected, int preset)
{
    EXPECT_EQ(asNumber<TelSimCardStatus_t>(
                  &preset, [&](auto* status) { return target.IsAvaliableState(slot, status); }),
              expected);
    return preset;
}

void addStatusCall(std::vector<LoggedCall>& calls, const std::string& name, int slot, int status,
                   int cardChanged, const std::string& shownStatus)
{
    addCalls(calls, name,
             [=](auto& target) {
                 setModems();
                 platform().answer(initInfoCall(slot), 0, status);
                 platform().cardChanged = cardChanged;
                 EXPECT_EQ(statusOf(target, slot, status == TAPI_SIM_STATUS_SIM_INIT_COMPLETED, 99),
                           status);
                 EXPECT_THAT(platform().liveHandles(), ElementsAre("modem " + modemOf(slot)));
             },
             {"tel_get_cp_name_list()", initCall(slot), initInfoCall(slot),
              SIM_MANAGER.debug("IsAvaliableState", "SIM_INIT_INFO[" + shownStatus + ", " +
                                                        std::to_string(cardChanged) + "]")});
}

void addStatusFailure(std::vector<LoggedCall>& calls, const std::string& name, int slot,
                      const std::function<void()>& prepare, const Texts& trace, const Texts& live)
{
    addCalls(
        calls, name,
        [=](auto& target) {
            setModems();
            prepare();
            EXPECT_EQ(statusOf(target, slot, false, 3), 3);
            EXPECT_EQ(platform().liveHandles(), live);
        },
        trace);
}

void addStatusCalls(std::vector<LoggedCall>& calls)
{
    addStatusCall(calls, "StatusCompletedInFirstSlot", 0, 3, 0, "3");
    addStatusCall(calls, "StatusCompletedInSecondSlot", 1, 3, 1, "3");
    addStatusCall(calls, "StatusUnknown", 0, TAPI_SIM_STATUS_UNKNOWN, -7, "ff");
    addStatusCall(calls, "StatusAbsent", 1, TAPI_SIM_STATUS_CARD_NOT_PRESENT, 0, "1");
    addStatusCall(calls, "StatusInitialising", 1, TAPI_SIM_STATUS_SIM_INITIALIZING, 0, "2");
    addStatusCall(calls, "StatusThatThePlatformLacks", 0, 0x7ffffff3, 0, "7ffffff3");
    addStatusCall(calls, "StatusBelowZero", 0, -1, 0, "ffffffff");
    addStatusFailure(calls, "StatusReadFailed", 0, [] { platform().answer(initInfoCall(0), -1); },
                     {"tel_get_cp_name_list()", initCall(0), initInfoCall(0)}, {"modem cp0"});
    addStatusFailure(calls, "StatusReadFailedButWritten", 1,
                     [] { platform().answer(initInfoCall(1), 4, 3); },
                     {"tel_get_cp_name_list()", initCall(1), initInfoCall(1)}, {"modem cp1"});
    addStatusFailure(calls, "StatusWithoutModem", 0, [] { platform().answer(initCall(0), -1); },
                     {"tel_get_cp_name_list()", initCall(0)}, {});
    addStatusFailure(calls, "StatusWithoutModemNames", 0,
                     [] { platform().setModems(std::nullopt); }, {"tel_get_cp_name_list()"}, {});
    // The names end with null; a null name is the platform's to judge.
    addStatusFailure(calls, "StatusOfSlotAfterTheNames", 2,
                     [] { platform().answer("tel_init(null)", -1); },
                     {"tel_get_cp_name_list()", "tel_init(null)"}, {});
    addStatusFailure(calls, "StatusOfSlotBelowZero", -1, [] {}, {}, {});
    addStatusFailure(calls, "StatusOfLeastSlot", INT32_MIN, [] {}, {}, {});
}

// Begins with texts in the three strings; what they hold then.
template <class Target>
Texts infoOf(Target& target, const char* name, bool expected)
{
    std::string mcc = "old mcc";
    std::string mnc = "old mnc";
    std::string msin = "old msin";
    EXPECT_EQ(target.GetSimInfo(name, &mcc, &mnc, &msin), expected);
    return {mcc, mnc, msin};
}

const Texts UNTOUCHED_INFO = {"old mcc", "old mnc", "old msin"};

void addInfoCalls(std::vector<LoggedCall>& calls)
{
    addCalls(calls, "GetSimInfo",
             [](auto& target) {
                 setSlots({NO_CARD, AMERICAN_CARD});
                 EXPECT_EQ(infoOf(target, "cp1", true), (Texts{"310", "260", "907264815"}));
                 EXPECT_THAT(platform().liveHandles(), ElementsAre("modem cp1")); // meant
             },
             {initCall(1), imsiCall(1)});
    addCalls(calls, "GetSimInfoOfFirstModem",
             [](auto& target) {
                 platform().answer("tel_init(null)", 0);
                 platform().answer("tel_get_sim_imsi(modem null)", 0, imsiInfo(KOREAN_CARD));
                 EXPECT_EQ(infoOf(target, nullptr, true), (Texts{"450", "05", "8173926450"}));
             },
             {"tel_init(null)", "tel_get_sim_imsi(modem null)"});
    addCalls(calls, "GetSimInfoOfUnknownModem",
             [](auto& target) {
                 platform().answer("tel_init(nobody)", -1);
                 EXPECT_EQ(infoOf(target, "nobody", false), UNTOUCHED_INFO);
                 EXPECT_THAT(platform().liveHandles(), IsEmpty());
             },
             {"tel_init(nobody)", SIM_MANAGER.error("GetSimInfo", "Failed to get TapiHandle")});
    for (const int code : {4, -1})
        addCalls(calls, "GetSimInfoRefused" + std::string(code > 0 ? "AboveZero" : "BelowZero"),
                 [code](auto& target) {
                     platform().answer(initCall(0), 0);
                     platform().answer(imsiCall(0), code, imsiInfo(KOREAN_CARD));
                     EXPECT_EQ(infoOf(target, "cp0", false), UNTOUCHED_INFO);
                     EXPECT_THAT(platform().liveHandles(), ElementsAre("modem cp0")); // meant
                 },
                 {initCall(0), imsiCall(0), SIM_MANAGER.error("GetSimInfo", "Failed to get IMSI")});
}

void addNumberCalls(std::vector<LoggedCall>& calls)
{
    addCalls(calls, "GetPhoneNumber",
             [](auto& target) {
                 const telephony_handle_list_s list = openList(2);
                 platform().answer(numberCall(1), 0, KOREAN_CARD.number);
                 char* number = nullptr;
                 EXPECT_TRUE(target.GetPhoneNumber(list.handle + 1, &number));
                 EXPECT_EQ(number, KOREAN_CARD.number);
                 // The platform's own string, handed on.
                 EXPECT_EQ(ledger().origin(number), "platform: " + KOREAN_CARD.number);
                 std::free(number);
                 EXPECT_THAT(ledger().live(), IsEmpty());
             },
             {numberCall(1)});
    addCalls(calls, "GetPhoneNumberNull",
             [](auto& target) {
                 platform().answer(numberCall(0), 0, static_cast<char*>(nullptr));
                 char preset = 'p';
                 char* number = &preset;
                 EXPECT_TRUE(target.GetPhoneNumber(openList(1).handle, &number));
                 EXPECT_EQ(number, nullptr);
             },
             {numberCall(0)});
    for (const int code : {-39841791, 1})
        addCalls(
            calls, "GetPhoneNumberRefused" + std::string(code > 0 ? "AboveZero" : "BelowZero"),
            [code](auto& target) {
                platform().answer(numberCall(0), code);
                char preset = 'p';
                char* number = &preset;
                EXPECT_FALSE(target.GetPhoneNumber(openList(1).handle, &number));
                EXPECT_EQ(number, &preset);
            },
            {numberCall(0), SIM_MANAGER.error("GetPhoneNumber", "Failed to get phone number")});
    addCalls(calls, "GetPhoneNumberOfNullHandle",
             [](auto& target) {
                 platform().answer("telephony_sim_get_subscriber_number(no slot)", -22);
                 telephony_h none = nullptr;
                 char* number = nullptr;
                 EXPECT_FALSE(target.GetPhoneNumber(&none, &number));
             },
             {"telephony_sim_get_subscriber_number(no slot)",
              SIM_MANAGER.error("GetPhoneNumber", "Failed to get phone number")});
}

std::vector<LoggedCall> legacyCalls()
{
    std::vector<LoggedCall> calls;
    addListCalls(calls);
    addNameCalls(calls);
    addSubscriptionCalls(calls);
    addStatusCalls(calls);
    addInfoCalls(calls);
    addNumberCalls(calls);
    return calls;
}

// Every status of the platform.
const int STATUSES[] = {0, 1, 2, 3, 4, 5, 6, 7, 8, 9, 10, 11, 12, 13, 14, 255};

INSTANTIATE_TEST_SUITE_P(Legacy, LoggedCallTest, testing::ValuesIn(legacyCalls()),
                         rowName<LoggedCall>);

class LegacyTest : public PlatformTest {};

TEST_F(LegacyTest, ListIsFilledAndReleased)
{
    setSlotCount(2);
    telephony_handle_list_s list = {0, nullptr};
    EXPECT_TRUE(system.InitHandleList(&list));
    EXPECT_EQ(list.count, 2u);
    EXPECT_TRUE(system.DeinitHandleList(&list));
    EXPECT_THAT(platform().liveHandles(), IsEmpty());
}

TEST_F(LegacyTest, OnlyCompletedInitialisationIsAvailable)
{
    setModems();
    for (const int status : STATUSES) {
        platform().answer(initInfoCall(1), 0, status);
        EXPECT_EQ(statusOf(system, 1, status == 3, 99), status);
    }
    EXPECT_EQ(platform().liveHandles().size(), std::size(STATUSES));
}

TEST_F(LegacyTest, StatusOfFailedReadIsWhatThePlatformLeft)
{
    setModems();
    platform().answer(initInfoCall(0), -1, 5);
    EXPECT_EQ(statusOf(system, 0, false, 99), 5);
    platform().answer(initInfoCall(0), -1);
    EXPECT_EQ(statusOf(system, 0, false, 99), 99);
}

TEST_F(LegacyTest, EveryCallByNameOpensAHandleOfItsOwn)
{
    platform().answer(initCall(0), 0);
    platform().answer(modemCall("tel_check_sms_device_status", 0), 0, 1);
    for (std::size_t calls = 1; calls <= 3; ++calls) {
        int ready = 0;
        EXPECT_TRUE(system.CheckSmsEnabled(nameOf("cp0"), &ready));
        EXPECT_EQ(platform().liveHandles().size(), calls);
    }
    EXPECT_THAT(platform().liveHandles(), Each("modem cp0"));
}

TEST_F(LegacyTest, ImsiPartsAreGivenAsTheyStand)
{
    for (const Card& card : {KOREAN_CARD, AMERICAN_CARD, Card{"", "", "", ""},
                             Card{"450", "", "8", ""}, Card{"4501", "2601", "81739264501", ""}}) {
        setSlots({card});
        EXPECT_EQ(infoOf(system, "cp0", true), (Texts{card.mcc, card.mnc, card.msin}));
    }
}

TEST_F(LegacyTest, IdentityIsNeverFormatted)
{
    for (const int mode : {0, 1}) {
        platform().debugMode = mode;
        setSlots({KOREAN_CARD});
        infoOf(system, "cp0", true);
        char* number = nullptr;
        EXPECT_TRUE(system.GetPhoneNumber(openList(1).handle, &number));
        platform().answer(imsiCall(0), -1, imsiInfo(KOREAN_CARD));
        infoOf(system, "cp0", false);
        EXPECT_FALSE(isIdentityTold(KOREAN_CARD));
        EXPECT_FALSE(isTold(KOREAN_CARD.mcc));
        std::free(number);
        platform().reset();
    }
}

} // namespace
