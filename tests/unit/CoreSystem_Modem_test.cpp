// SPDX-License-Identifier: Apache-2.0
// The IMEI and what answers in its place, and roaming.
#include <stdlib.h>

#include "SimSlots.h"

using namespace fake;
using testing::ElementsAre;
using testing::IsEmpty;

namespace {

// While it lives, the process is in this time zone.
class TimeZone {
public:
    explicit TimeZone(const std::string& zone)
    {
        setenv("TZ", zone.c_str(), 1);
    }
    ~TimeZone()
    {
        unsetenv("TZ");
        tzset();
    }
};

const std::time_t WINTER = 1768478400; // 2026-01-15 12:00 UTC
const std::time_t SUMMER = 1784116800; // 2026-07-15 12:00 UTC

struct Zone {
    std::string rules;
    std::time_t now;
    int offset;
    std::string imei;
};

// The rules count hours west of Greenwich.
const Zone ZONES[] = {
    {"UTC0", WINTER, 0, "000000000000000"},
    {"No/Such/Place", SUMMER, 0, "000000000000000"},
    {"KST-9", WINTER, 32400, "324000000000000"},
    {"NST3:30", WINTER, -12600, "-12600000000000"},
    {"ABC-0:00:01", WINTER, 1, "100000000000000"},
    {"ABC0:00:01", WINTER, -1, "-10000000000000"},
    {"CET-1CEST,M3.5.0,M10.5.0/3", WINTER, 3600, "360000000000000"},
    {"CET-1CEST,M3.5.0,M10.5.0/3", SUMMER, 7200, "720000000000000"},
};

const auto imeiCall = [](int slot) { return slotCall("telephony_modem_get_imei", slot); };

// Asks with a slot that holds something else; what it holds then.
char* imei()
{
    char preset = 'p';
    char* value = &preset;
    EXPECT_EQ(coreSystem().GetIMEI(&value), 0);
    EXPECT_THAT(platform().liveHandles(), IsEmpty());
    return value;
}

void expectImei(const std::string& expected, const std::string& owner)
{
    char* const value = imei();
    ASSERT_NE(value, nullptr);
    EXPECT_EQ(value, expected);
    EXPECT_EQ(ledger().live(), Texts{owner + expected});
    std::free(value);
    EXPECT_THAT(ledger().live(), IsEmpty());
}

void expectFallback(const std::string& expected)
{
    EXPECT_EQ(expected.size(), 15u);
    expectImei(expected, "copy: ");
}

const std::string IMEI_0 = "490154203237518";
const std::string IMEI_1 = "356938035643809";

const Texts IMEI_ENTRY = {CORE_SYSTEM.debug("GetIMEI", "CoreSystem::GetIMEI")};
const Texts IMEI_WITHOUT_LIST = {
    CORE_SYSTEM.error("GetIMEI", "telephony_init Failed. Start to get IMEI from current time")};

Texts modemsAsked(unsigned int count, int asked)
{
    Texts trace = IMEI_ENTRY + accessed(listTaken(count)) +
                  Texts{CORE_SYSTEM.debug("GetIMEI", "GetTelephonyHandle. handle count : " +
                                                         std::to_string(count))};
    for (int slot = 0; slot < asked; ++slot)
        trace.push_back(imeiCall(slot));
    return trace;
}

// What the modem of a slot answers.
struct Imei {
    int code;
    std::any value;
};

void setImeis(const std::vector<Imei>& imeis, unsigned int count)
{
    setSlotCount(count);
    int slot = 0;
    for (const Imei& imei : imeis)
        platform().answer(imeiCall(slot++), imei.code, imei.value);
}

void setImei(int code, const std::any& value = {})
{
    setImeis({{code, value}}, 1);
}

// The modem of the last slot that is asked answers.
LoggedCall answeredCall(const std::string& name, const std::string& answer,
                        const std::vector<Imei>& imeis, unsigned int count)
{
    const auto asked = static_cast<int>(imeis.size());
    const std::string line = "Slot" + std::to_string(asked - 1) + " IMEI exist";
    return {"Imei" + name,
            [=] {
                setImeis(imeis, count);
                expectImei(answer, "platform: "); // the platform's own string, handed on
            },
            modemsAsked(count, asked) + Texts{CORE_SYSTEM.debug("GetIMEI", line)} +
                accessed(listReleased(count))};
}

LoggedCall fallbackCall(const std::string& name, const Texts& trace,
                        const std::function<void()>& prepare)
{
    return {"Imei" + name,
            [=] {
                const TimeZone zone("KST-9");
                prepare();
                expectFallback("324000000000000");
            },
            trace + Texts{"intToStr(32400)"}};
}

std::vector<LoggedCall> imeiCalls()
{
    const std::any null = static_cast<char*>(nullptr);
    return {
        answeredCall("OfOnlyModem", IMEI_0, {{0, IMEI_0}}, 1),
        answeredCall("OfFirstModemAndNoOtherIsAsked", IMEI_0, {{0, IMEI_0}}, 2),
        answeredCall("OfSecondModem", IMEI_1, {{-13, {}}, {0, IMEI_1}}, 2),
        answeredCall("AfterSuccessWithNull", IMEI_1, {{0, {}}, {1, {}}, {0, IMEI_1}}, 3),
        answeredCall("Empty", "", {{0, std::string()}}, 1),
        fallbackCall("OfNoModem", modemsAsked(2, 2) + accessed(listReleased(2)),
                     [] {
                         setImeis({{-13, {}}, {1, {}}}, 2);
                     }),
        fallbackCall("NullOfEveryModem", modemsAsked(1, 1) + accessed(listReleased(1)),
                     [=] { setImei(0, null); }),
        fallbackCall("WithoutTelephony", IMEI_ENTRY + accessed(noListTaken()) + IMEI_WITHOUT_LIST,
                     [] { setNoTelephony(); }),
    };
}

const auto serviceCall = [](int slot) {
    return slotCall("telephony_network_get_service_state", slot);
};
const auto roamingCall = [](int slot) {
    return slotCall("telephony_network_get_roaming_status", slot);
};

std::string roamingLine(const std::string& text)
{
    return SIM_MANAGER.debug("GetRoamingStatus", text);
}

void setService(int slot, int code, const std::any& state)
{
    setSlotCount(2);
    platform().answer(serviceCall(slot), code, state);
}

void setRoaming(int slot, int code, const std::any& value)
{
    setService(slot, 0, 0);
    platform().answer(roamingCall(slot), code, value);
}

// How far a question gets: the list is taken, the slot is asked for its service, and for roaming,
// which it answers.
enum Steps { NO_LIST, TAKEN, ASKED, IN_SERVICE, ANSWERED };

Texts roamingSteps(int slot, Steps steps)
{
    const Texts all = {roamingLine("telephony_init success"), serviceCall(slot),
                       roamingLine("telephony_network_service_state : [In Service]"),
                       roamingCall(slot),
                       roamingLine("telephony_network_get_roaming_status success")};
    const int lengths[] = {0, 1, 2, 4, 5};
    return Texts(all.begin(), all.begin() + lengths[steps]);
}

// The flag holds the opposite before where it is told, and keeps what it holds where not.
struct RoamingCase {
    std::string name;
    int slot;
    Steps steps;
    bool isTold;
    bool flag;
    std::function<void()> prepare;
    std::string released = deinitCall(2);
};

// No roaming status without service; every failure is false and the flag is the platform's.
std::vector<RoamingCase> roamingCases()
{
    std::vector<RoamingCase> cases = {
        {"RefusedButWritten", 0, IN_SERVICE, true, true, [] { setRoaming(0, -13, true); }},
        {"ServiceNotTold", 0, ASKED, false, true, [] { setService(0, 0, {}); }},
        {"OfNoSlots", 0, TAKEN, false, true, [] { setSlotCount(0); }, deinitCall(0)},
        {"WithoutTelephony", 0, NO_LIST, false, true, [] { setNoTelephony(); },
         "telephony_deinit(no list)"},
        {"WithListOfFailedCall", 0, NO_LIST, false, true,
         [] {
             setSlotCount(2);
             platform().answer("telephony_init()", 1, 2u);
         }},
        {"WhateverTheReleaseAnswers", 0, ANSWERED, true, true,
         [] {
             setRoaming(0, 0, true);
             platform().answer(deinitCall(2), -22);
         }},
    };
    for (const int slot : {0, 1})
        for (const bool roaming : {false, true})
            cases.push_back({"Slot" + std::to_string(slot) + (roaming ? "Away" : "Home"), slot,
                             ANSWERED, true, roaming, [=] { setRoaming(slot, 0, roaming); }});
    for (const int state : {1, 2, 3, 7, -1})
        cases.push_back({"ServiceState" + std::to_string(state + 1), 1, ASKED, false, true,
                         [=] { setService(1, 0, state); }});
    for (const int code : {-13, 1}) {
        const std::string refused = "Refused" + std::to_string(code + 13);
        cases.push_back(
            {"Service" + refused, 0, ASKED, false, true, [=] { setService(0, code, 0); }});
        cases.push_back({refused, 0, IN_SERVICE, false, true, [=] { setRoaming(0, code, {}); }});
    }
    for (const int slot : {2, 3, -1, INT32_MAX, INT32_MIN})
        cases.push_back({"NoSlot" + std::to_string(static_cast<unsigned int>(slot)), slot, TAKEN,
                         false, true, [] { setSlotCount(2); }});
    return cases;
}

std::vector<LoggedCall> roamingCalls()
{
    const std::string method = "GetRoamingStatus";
    std::vector<LoggedCall> calls;
    for (const RoamingCase& row : roamingCases()) {
        // Begins with an error line, always: meant.
        const Texts trace = lockedThroughout(
            Texts{SIM_MANAGER.error(method, "SimManager::GetRoamingStatus()"), "telephony_init()"} +
            roamingSteps(row.slot, row.steps) + Texts{row.released});
        const std::string result = row.steps != ANSWERED ? "GetRoamingStatus Failed"
                                   : row.flag            ? "GetRoamingStatus : [Roaming]"
                                                         : "GetRoamingStatus : [Not Roaming]";
        const auto run = [=] {
            row.prepare();
            bool flag = row.isTold ? !row.flag : row.flag;
            EXPECT_EQ(coreSystem().GetRoamingStatus(row.slot, &flag), row.steps == ANSWERED);
            EXPECT_EQ(flag, row.flag);
            EXPECT_THAT(platform().liveHandles(), IsEmpty());
        };
        calls.push_back({"Roaming" + row.name, run,
                         Texts{CORE_SYSTEM.debug(method, "CoreSystem::GetRoamingStatus")} +
                             accessed(trace) + Texts{CORE_SYSTEM.debug(method, result)}});
    }
    return calls;
}

LOGGED_CALLS(Imei, imeiCalls());
LOGGED_CALLS(Roaming, roamingCalls());

class ModemTest : public PlatformTest {};

// And the clock of the zone does not, but for the offset that it has.
TEST_F(ModemTest, OffsetOfTheZoneAnswersInPlaceOfTheImei)
{
    setNoTelephony();
    for (const auto& [rules, now, offset, expected] : ZONES) {
        SCOPED_TRACE(rules);
        const TimeZone zone(rules);
        for (const int seconds : {0, 59, 86400}) {
            platform().forgetEvents();
            platform().now = now + seconds;
            expectFallback(expected);
            EXPECT_EQ(platform().texts(Event::Kind::CALL),
                      (Texts{"telephony_init()", callText("intToStr", offset)}));
        }
    }
}

TEST_F(ModemTest, FallbackWithoutSlotsKeepsTheList)
{
    const TimeZone zone("UTC0");
    setSlotCount(0);
    char* value = nullptr;
    EXPECT_EQ(system.GetIMEI(&value), 0);
    EXPECT_STREQ(value, "000000000000000");
    EXPECT_THAT(platform().liveHandles(), ElementsAre("list of 0"));
    std::free(value);
}

TEST_F(ModemTest, StringOfFailedReadIsNotTaken)
{
    const TimeZone zone("UTC0");
    setImei(-13, IMEI_0);
    char* const value = imei();
    EXPECT_STREQ(value, "000000000000000");
    std::free(value);
    EXPECT_THAT(ledger().freeAll(), ElementsAre("platform: " + IMEI_0));
}

TEST_F(ModemTest, OddAnswersPassThroughUnchanged)
{
    platform().debugMode = 1;
    for (const std::string& odd : ODD_TEXTS) {
        setImei(0, odd);
        expectImei(odd, "platform: ");
        EXPECT_FALSE(!odd.empty() && isTold(odd));
    }
}

TEST_F(ModemTest, FailedCopyOfTheFallbackGivesNull)
{
    setNoTelephony();
    const FailingAllocation failure(Allocation::STRDUP);
    EXPECT_EQ(imei(), nullptr);
    EXPECT_TRUE(failure.happened());
}

TEST_F(ModemTest, NoExceptionCrossesTheInterface)
{
    platform().numberTextThrows = true;
    setNoTelephony();
    EXPECT_EQ(imei(), nullptr);
}

} // namespace
