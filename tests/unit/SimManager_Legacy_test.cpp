// SPDX-License-Identifier: Apache-2.0
// The platform's telephony as it is: the wrappers of SimManager and the facade's ways to them.
#include <ITapiSim.h>
#include <TelCall.h>
#include <TelNetwork.h>

#include "SimSlots.h"

using namespace fake;
using testing::ElementsAre;
using testing::IsEmpty;

namespace {

char* nameOf(const char* text)
{
    return const_cast<char*>(text);
}

std::string codeName(int code)
{
    return code == 0 ? "" : code < 0 ? "RefusedBelowZero" : "RefusedAboveZero";
}

// The facade has each wrapper under the same name: `ask` takes either. Both are made a row.
class LegacyCalls : public std::vector<LoggedCall> {
public:
    template <class Ask>
    void add(const std::string& name, const Texts& trace, Ask ask)
    {
        const Texts locked = lockedThroughout(trace);
        push_back({name, [=] { ask(simManager()); }, locked});
        push_back({"CoreSystem" + name, [=] { ask(coreSystem()); }, accessed(locked)});
    }
};

void addListCalls(LegacyCalls& calls)
{
    for (const int code : {0, -22, 1}) {
        calls.add("InitHandleList" + codeName(code), {"telephony_init()"}, [=](auto& target) {
            platform().answer("telephony_init()", code, 2u);
            telephony_handle_list_s list = {7, nullptr};
            EXPECT_EQ(target.InitHandleList(&list), code == 0);
            EXPECT_EQ(list.count, 2u); // whatever the platform wrote
            EXPECT_THAT(platform().liveHandles(), ElementsAre("list of 2"));
        });
        calls.add("DeinitHandleList" + codeName(code), {deinitCall(2)}, [=](auto& target) {
            platform().answer(deinitCall(2), code);
            telephony_handle_list_s list = openList(2);
            EXPECT_EQ(target.DeinitHandleList(&list), code == 0);
            EXPECT_EQ(list.count, 0u); // the caller's own list, not a copy of it
            EXPECT_EQ(list.handle, nullptr);
            EXPECT_THAT(platform().liveHandles(), IsEmpty());
        });
    }
    calls.add("InitHandleListWithoutTelephony", {"telephony_init()"}, [](auto& target) {
        setNoTelephony();
        telephony_h preset = nullptr;
        telephony_handle_list_s list = {7, &preset};
        EXPECT_FALSE(target.InitHandleList(&list));
        EXPECT_EQ(list.count, 7u);
        EXPECT_EQ(list.handle, &preset);
    });
    calls.add("InitHandleListWithoutSlots", {"telephony_init()"}, [](auto& target) {
        setSlotCount(0);
        telephony_handle_list_s list = {7, nullptr};
        EXPECT_TRUE(target.InitHandleList(&list));
        EXPECT_EQ(list.count, 0u);
    });
}

void addNameCalls(LegacyCalls& calls)
{
    calls.add("GetCpNameList", {"tel_get_cp_name_list()"}, [](auto& target) {
        platform().setModems(Texts{"cp0", "cp1"});
        char** const names = target.GetCpNameList();
        EXPECT_EQ(names, platform().modemNames()); // the platform's own
        EXPECT_STREQ(names[1], "cp1");
        EXPECT_EQ(names[2], nullptr);
    });
    calls.add("GetCpNameListWithoutService", {"tel_get_cp_name_list()"},
              [](auto& target) { EXPECT_EQ(target.GetCpNameList(), nullptr); });
}

// A modem of this name, or none; what it is asked, its answer, and what is then open.
struct ModemAnswer {
    std::string suffix;
    const char* modem;
    bool isThere;
    int code;
    std::any answer;
    Texts open;
};

// A wrapper that asks a modem by its name. The handle stays open: meant.
template <class Ask>
void addModemCalls(LegacyCalls& calls, const std::string& name, const std::string& function,
                   Ask ask)
{
    const ModemAnswer rows[] = {
        {"", "cp1", true, 0, 1, {"modem cp1"}},
        {"Refused", "cp1", true, 4, 1, {"modem cp1"}},
        {"RefusedBelowZero", "cp1", true, -1, 1, {"modem cp1"}},
        {"WithoutModem", "nobody", false, -2, {}, {}},
        // The null handle is the platform's to judge.
        {"WithoutModemAnswered", "nobody", false, 0, -1, {}},
        {"OfFirstModem", nullptr, true, 0, 0, {"modem null"}},
    };
    for (const ModemAnswer& row : rows) {
        const std::string modem = row.modem != nullptr ? row.modem : "null";
        const std::string init = "tel_init(" + modem + ")";
        const std::string call = function + (row.isThere ? "(modem " + modem + ")" : "(no modem)");
        calls.add(name + row.suffix, {init, call}, [=](auto& target) {
            platform().answer(init, row.isThere ? 0 : -1);
            platform().answer(call, row.code, row.answer);
            int answer = 99;
            EXPECT_EQ(ask(target, nameOf(row.modem), &answer), row.code == 0);
            // Whatever the platform wrote.
            EXPECT_EQ(answer, row.answer.has_value() ? std::any_cast<int>(row.answer) : 99);
            EXPECT_EQ(platform().liveHandles(), row.open);
        });
    }
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

// A wrapper that answers a value of the enumeration.
#define SUBSCRIPTION(Enum, method)                                                              \
    [](auto& target, char* name, int* answer) {                                                 \
        return asNumber<Enum>(answer, [&](auto* value) { return target.method(name, value); }); \
    }

void addSubscriptionCalls(LegacyCalls& calls)
{
    addModemCalls(calls, "GetMainSimSubscription", "tel_get_network_default_subscription",
                  SUBSCRIPTION(TelNetworkDefaultSubs_t, GetMainSimSubscription));
    addModemCalls(calls, "GetCallPreferredSubscription",
                  "tel_get_call_preferred_voice_subscription",
                  SUBSCRIPTION(TelCallPreferredVoiceSubs_t, GetCallPreferredSubscription));
    addModemCalls(calls, "GetDefaultDataSubscription", "tel_get_network_default_data_subscription",
                  SUBSCRIPTION(TelNetworkDefaultDataSubs_t, GetDefaultDataSubscription));
    addModemCalls(
        calls, "CheckSmsEnabled", "tel_check_sms_device_status",
        [](auto& target, char* name, int* answer) { return target.CheckSmsEnabled(name, answer); });
}

const auto initInfoCall = [](int slot) { return modemCall("tel_get_sim_init_info", slot); };

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

void addStatus(LegacyCalls& calls, const std::string& name, int slot, int status, int cardChanged,
               const std::string& shownStatus)
{
    const std::string line =
        "SIM_INIT_INFO[" + shownStatus + ", " + std::to_string(cardChanged) + "]";
    calls.add("Status" + name,
              {"tel_get_cp_name_list()", initCall(slot), initInfoCall(slot),
               SIM_MANAGER.debug("IsAvaliableState", line)},
              [=](auto& target) {
                  setModems();
                  platform().answer(initInfoCall(slot), 0, status);
                  platform().cardChanged = cardChanged;
                  const bool complete = status == TAPI_SIM_STATUS_SIM_INIT_COMPLETED;
                  EXPECT_EQ(statusOf(target, slot, complete, 99), status);
                  EXPECT_THAT(platform().liveHandles(), ElementsAre("modem " + modemOf(slot)));
              });
}

void addStatusFailure(LegacyCalls& calls, const std::string& name, int slot, const Texts& trace,
                      const Texts& live, const std::function<void()>& prepare, int left = 3)
{
    calls.add("Status" + name, trace, [=](auto& target) {
        setModems();
        prepare();
        EXPECT_EQ(statusOf(target, slot, false, 3), left);
        EXPECT_EQ(platform().liveHandles(), live);
    });
}

void addStatusCalls(LegacyCalls& calls)
{
    addStatus(calls, "CompletedInFirstSlot", 0, 3, 0, "3");
    addStatus(calls, "CompletedInSecondSlot", 1, 3, 1, "3");
    addStatus(calls, "Unknown", 0, TAPI_SIM_STATUS_UNKNOWN, -7, "ff");
    addStatus(calls, "Initialising", 1, TAPI_SIM_STATUS_SIM_INITIALIZING, 0, "2");
    addStatus(calls, "ThatThePlatformLacks", 0, 0x7ffffff3, 0, "7ffffff3");
    const std::string names = "tel_get_cp_name_list()";
    const Texts read = {names, initCall(0), initInfoCall(0)};
    addStatusFailure(calls, "ReadFailed", 0, read, {"modem cp0"},
                     [] { platform().answer(initInfoCall(0), -1); });
    addStatusFailure(calls, "ReadFailedButWritten", 0, read, {"modem cp0"},
                     [] { platform().answer(initInfoCall(0), 4, 3); });
    addStatusFailure(
        calls, "ReadFailedButOtherWritten", 0, read, {"modem cp0"},
        [] { platform().answer(initInfoCall(0), -1, 5); }, 5);
    addStatusFailure(calls, "WithoutModem", 0, {names, initCall(0)}, {},
                     [] { platform().answer(initCall(0), -1); });
    addStatusFailure(calls, "WithoutModemNames", 0, {names}, {},
                     [] { platform().setModems(std::nullopt); });
    // The names end with null; a null name is the platform's to judge.
    addStatusFailure(calls, "OfSlotAfterTheNames", 2, {names, "tel_init(null)"}, {},
                     [] { platform().answer("tel_init(null)", -1); });
    addStatusFailure(calls, "OfSlotBelowZero", -1, {}, {}, [] {});
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

void addInfoCalls(LegacyCalls& calls)
{
    calls.add("GetSimInfo", {initCall(1), imsiCall(1)}, [](auto& target) {
        setSlots({NO_CARD, AMERICAN_CARD});
        EXPECT_EQ(infoOf(target, "cp1", true), (Texts{"310", "260", "907264815"}));
        EXPECT_THAT(platform().liveHandles(), ElementsAre("modem cp1")); // meant
    });
    const Texts ofFirst = {"tel_init(null)", "tel_get_sim_imsi(modem null)"};
    calls.add("GetSimInfoOfFirstModem", ofFirst, [](auto& target) {
        platform().answer("tel_init(null)", 0);
        platform().answer("tel_get_sim_imsi(modem null)", 0, imsiInfo(KOREAN_CARD));
        EXPECT_EQ(infoOf(target, nullptr, true), (Texts{"450", "05", "8173926450"}));
    });
    const Texts ofUnknown = {"tel_init(nobody)",
                             SIM_MANAGER.error("GetSimInfo", "Failed to get TapiHandle")};
    calls.add("GetSimInfoOfUnknownModem", ofUnknown, [](auto& target) {
        platform().answer("tel_init(nobody)", -1);
        EXPECT_EQ(infoOf(target, "nobody", false), UNTOUCHED_INFO);
        EXPECT_THAT(platform().liveHandles(), IsEmpty());
    });
    const Texts refused = {initCall(0), imsiCall(0),
                           SIM_MANAGER.error("GetSimInfo", "Failed to get IMSI")};
    for (const int code : {4, -1})
        calls.add("GetSimInfo" + codeName(code), refused, [=](auto& target) {
            platform().answer(initCall(0), 0);
            platform().answer(imsiCall(0), code, imsiInfo(KOREAN_CARD));
            EXPECT_EQ(infoOf(target, "cp0", false), UNTOUCHED_INFO);
            EXPECT_THAT(platform().liveHandles(), ElementsAre("modem cp0")); // meant
        });
}

void addNumberCalls(LegacyCalls& calls)
{
    calls.add("GetPhoneNumber", {numberCall(1)}, [](auto& target) {
        const telephony_handle_list_s list = openList(2);
        platform().answer(numberCall(1), 0, KOREAN_CARD.number);
        char* number = nullptr;
        EXPECT_TRUE(target.GetPhoneNumber(list.handle + 1, &number));
        EXPECT_EQ(number, KOREAN_CARD.number);
        // The platform's own string, handed on.
        EXPECT_EQ(ledger().origin(number), "platform: " + KOREAN_CARD.number);
        std::free(number);
        EXPECT_THAT(ledger().live(), IsEmpty());
    });
    calls.add("GetPhoneNumberNull", {numberCall(0)}, [](auto& target) {
        platform().answer(numberCall(0), 0, static_cast<char*>(nullptr));
        char preset = 'p';
        char* number = &preset;
        EXPECT_TRUE(target.GetPhoneNumber(openList(1).handle, &number));
        EXPECT_EQ(number, nullptr);
    });
    const Texts failed = {SIM_MANAGER.error("GetPhoneNumber", "Failed to get phone number")};
    for (const int code : {-39841791, 1})
        calls.add("GetPhoneNumber" + codeName(code), Texts{numberCall(0)} + failed,
                  [=](auto& target) {
                      platform().answer(numberCall(0), code);
                      char preset = 'p';
                      char* number = &preset;
                      EXPECT_FALSE(target.GetPhoneNumber(openList(1).handle, &number));
                      EXPECT_EQ(number, &preset);
                  });
}

LegacyCalls legacyCalls()
{
    LegacyCalls calls;
    addListCalls(calls);
    addNameCalls(calls);
    addSubscriptionCalls(calls);
    addStatusCalls(calls);
    addInfoCalls(calls);
    addNumberCalls(calls);
    return calls;
}

LOGGED_CALLS(Legacy, legacyCalls());

class LegacyTest : public PlatformTest {};

TEST_F(LegacyTest, OnlyCompletedInitialisationIsAvailable)
{
    setModems();
    for (const int status : {0, 1, 2, 3, 4, 5, 6, 7, 8, 9, 10, 11, 12, 13, 14, 255}) {
        platform().answer(initInfoCall(1), 0, status);
        EXPECT_EQ(statusOf(system, 1, status == 3, 99), status);
    }
}

TEST_F(LegacyTest, EveryCallByNameOpensAHandleOfItsOwn)
{
    platform().answer(initCall(0), 0);
    platform().answer(modemCall("tel_check_sms_device_status", 0), 0, 1);
    for (std::size_t calls = 1; calls <= 3; ++calls) {
        int ready = 0;
        EXPECT_TRUE(system.CheckSmsEnabled(nameOf("cp0"), &ready));
        EXPECT_EQ(platform().liveHandles(), Texts(calls, "modem cp0"));
    }
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
