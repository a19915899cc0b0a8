// SPDX-License-Identifier: Apache-2.0
// The IMEI and what answers in its place, and roaming.
#include <stdlib.h>

#include "SimSlots.h"

using namespace fake;
using testing::AnyOf;
using testing::ElementsAre;
using testing::IsEmpty;

namespace {

// While it lives, the process is in this time zone.
class TimeZone {
public:
    explicit TimeZone(const std::string& zone)
    {
        if (const char* const value = std::getenv("TZ"))
            before_ = value;
        setenv("TZ", zone.c_str(), 1);
    }
    ~TimeZone()
    {
        if (before_)
            setenv("TZ", before_->c_str(), 1);
        else
            unsetenv("TZ");
        tzset();
    }
    TimeZone(const TimeZone&) = delete;
    TimeZone& operator=(const TimeZone&) = delete;

private:
    std::optional<std::string> before_;
};

const std::time_t WINTER = 1768478400; // 2026-01-15 12:00 UTC
const std::time_t SUMMER = 1784116800; // 2026-07-15 12:00 UTC

struct Zone {
    std::string name;
    std::string rules;
    std::time_t now;
    int offset;
    std::string imei;
};

std::ostream& operator<<(std::ostream& out, const Zone& zone)
{
    return out << zone.name;
}

// The rules count hours west of Greenwich.
const Zone ZONES[] = {
    {"Utc", "UTC0", WINTER, 0, "000000000000000"},
    {"UnknownZone", "No/Such/Place", SUMMER, 0, "000000000000000"},
    {"East", "KST-9", WINTER, 32400, "324000000000000"},
    {"West", "EST5", WINTER, -18000, "-18000000000000"},
    {"HalfHourEast", "IST-5:30", SUMMER, 19800, "198000000000000"},
    {"HalfHourWest", "NST3:30", WINTER, -12600, "-12600000000000"},
    {"QuarterHour", "<+1245>-12:45", SUMMER, 45900, "459000000000000"},
    {"FarthestEast", "<+14>-14", WINTER, 50400, "504000000000000"},
    {"FarthestWest", "<-12>12", WINTER, -43200, "-43200000000000"},
    {"OneSecondEast", "ABC-0:00:01", WINTER, 1, "100000000000000"},
    {"OneSecondWest", "ABC0:00:01", WINTER, -1, "-10000000000000"},
    {"NorthernWinter", "CET-1CEST,M3.5.0,M10.5.0/3", WINTER, 3600, "360000000000000"},
    {"NorthernSummer", "CET-1CEST,M3.5.0,M10.5.0/3", SUMMER, 7200, "720000000000000"},
    {"WesternWinter", "EST5EDT,M3.2.0,M11.1.0", WINTER, -18000, "-18000000000000"},
    {"WesternSummer", "EST5EDT,M3.2.0,M11.1.0", SUMMER, -14400, "-14400000000000"},
    {"SouthernSummer", "AEST-10AEDT,M10.1.0,M4.1.0/3", WINTER, 39600, "396000000000000"},
    {"SouthernWinter", "AEST-10AEDT,M10.1.0,M4.1.0/3", SUMMER, 36000, "360000000000000"},
    {"SummerTimeAllYear", "XXX3EDT4,0/0,J365/23", WINTER, -14400, "-14400000000000"},
};

std::string imeiCall(int slot)
{
    return slotCall("telephony_modem_get_imei", slot);
}

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

// The modem of the last slot that is asked answers.
LoggedCall answeredCall(const std::string& name, const std::function<void()>& prepare,
                        unsigned int count, int asked, const std::string& answer)
{
    return {name,
            [=] {
                setSlotCount(count);
                prepare();
                expectImei(answer, "platform: "); // the platform's own string, handed on
            },
            modemsAsked(count, asked) +
                Texts{CORE_SYSTEM.debug("GetIMEI",
                                        "Slot" + std::to_string(asked - 1) + " IMEI exist")} +
                accessed(listReleased(count))};
}

LoggedCall fallbackCall(const std::string& name, const std::function<void()>& prepare,
                        const Texts& trace)
{
    return {name,
            [=] {
                const TimeZone zone("KST-9");
                prepare();
                expectFallback("324000000000000");
            },
            trace + Texts{"intToStr(32400)"}};
}

void answerImei(int slot, int code, const std::any& value = {})
{
    platform().answer(imeiCall(slot), code, value);
}

std::vector<LoggedCall> imeiCalls()
{
    return {
        answeredCall(
            "ImeiOfOnlyModem", [] { answerImei(0, 0, IMEI_0); }, 1, 1, IMEI_0),
        answeredCall(
            "ImeiOfFirstModemAndNoOtherIsAsked", [] { answerImei(0, 0, IMEI_0); }, 2, 1, IMEI_0),
        answeredCall(
            "ImeiOfSecondModem",
            [] {
                answerImei(0, -13);
                answerImei(1, 0, IMEI_1);
            },
            2, 2, IMEI_1),
        answeredCall(
            "ImeiAfterSuccessWithNull",
            [] {
                answerImei(0, 0);
                answerImei(1, 1);
                answerImei(2, 0, IMEI_1);
            },
            3, 3, IMEI_1),
        answeredCall(
            "ImeiEmpty", [] { answerImei(0, 0, std::string()); }, 1, 1, ""),
        fallbackCall(
            "ImeiOfNoModem",
            [] {
                setSlotCount(2);
                answerImei(0, -13);
                answerImei(1, 1);
            },
            modemsAsked(2, 2) + accessed(listReleased(2))),
        fallbackCall(
            "ImeiNullOfEveryModem",
            [] {
                setSlotCount(1);
                answerImei(0, 0, static_cast<char*>(nullptr));
            },
            modemsAsked(1, 1) + accessed(listReleased(1))),
        fallbackCall(
            "ImeiWithoutTelephony", [] { setNoTelephony(); },
            IMEI_ENTRY + accessed(noListTaken()) + IMEI_WITHOUT_LIST),
    };
}

// \name Roaming

std::string serviceCall(int slot)
{
    return slotCall("telephony_network_get_service_state", slot);
}

std::string roamingCall(int slot)
{
    return slotCall("telephony_network_get_roaming_status", slot);
}

std::string roamingLine(const std::string& text)
{
    return SIM_MANAGER.debug("GetRoamingStatus", text);
}

// Always an error line: meant.
const std::string ROAMING_ENTRY =
    SIM_MANAGER.error("GetRoamingStatus", "SimManager::GetRoamingStatus()");

// Answers of the platform, and the result and the flag that are expected of them.
struct RoamingCase {
    std::string name;
    int slot;
    std::function<void()> prepare;
    bool answered;
    bool preset;
    bool flag;
    Texts steps; // after the initialisation
    unsigned int count = 2;
};

void setService(int slot, int code, int state)
{
    setSlotCount(2);
    platform().answer(serviceCall(slot), code, state);
}

void setRoaming(int slot, int code, const std::any& value)
{
    setService(slot, 0, TELEPHONY_NETWORK_SERVICE_STATE_IN_SERVICE);
    platform().answer(roamingCall(slot), code, value);
}

const std::string SUCCESS_LINE = roamingLine("telephony_init success");
const std::string IN_SERVICE_LINE = roamingLine("telephony_network_service_state : [In Service]");

Texts inServiceAsked(int slot)
{
    return {SUCCESS_LINE, serviceCall(slot), IN_SERVICE_LINE, roamingCall(slot)};
}

Texts roamingAnswered(int slot)
{
    return inServiceAsked(slot) +
           Texts{roamingLine("telephony_network_get_roaming_status success")};
}

std::vector<RoamingCase> answeredCases()
{
    std::vector<RoamingCase> cases;
    for (const int slot : {0, 1})
        for (const bool roaming : {false, true})
            cases.push_back({"RoamingSlot" + std::to_string(slot) + (roaming ? "Away" : "Home"),
                             slot, [=] { setRoaming(slot, 0, roaming); }, true, !roaming, roaming,
                             roamingAnswered(slot)});
    return cases;
}

// No roaming status without service; every failure is false and the flag is the platform's.
std::vector<RoamingCase> unansweredCases()
{
    std::vector<RoamingCase> cases;
    for (const int state : {1, 2, 3, 7, -1})
        cases.push_back({"RoamingServiceState" + std::to_string(state + 1),
                         1,
                         [=] { setService(1, 0, state); },
                         false,
                         true,
                         true,
                         {SUCCESS_LINE, serviceCall(1)}});
    for (const int code : {-13, 1})
        cases.push_back({"RoamingServiceRefused" + std::to_string(code + 13),
                         0,
                         [=] { setService(0, code, 0); },
                         false,
                         true,
                         true,
                         {SUCCESS_LINE, serviceCall(0)}});
    for (const int code : {-13, 1})
        cases.push_back({"RoamingRefused" + std::to_string(code + 13), 0,
                         [=] { setRoaming(0, code, {}); }, false, true, true, inServiceAsked(0)});
    cases.push_back({"RoamingRefusedButWritten", 0, [] { setRoaming(0, -13, true); }, false, false,
                     true, inServiceAsked(0)});
    cases.push_back({"RoamingServiceNotTold",
                     0,
                     [] {
                         setSlotCount(2);
                         platform().answer(serviceCall(0), 0);
                     },
                     false,
                     true,
                     true,
                     {SUCCESS_LINE, serviceCall(0)}});
    return cases;
}

std::vector<RoamingCase> slotCases()
{
    std::vector<RoamingCase> cases;
    for (const int slot : {2, 3, -1, INT32_MAX, INT32_MIN})
        cases.push_back({"RoamingNoSlot" + std::to_string(static_cast<unsigned int>(slot)),
                         slot,
                         [] { setSlotCount(2); },
                         false,
                         true,
                         true,
                         {SUCCESS_LINE}});
    cases.push_back(
        {"RoamingOfNoSlots", 0, [] { setSlotCount(0); }, false, true, true, {SUCCESS_LINE}, 0});
    return cases;
}

Texts roamingTrace(const RoamingCase& row)
{
    return lockedThroughout(Texts{ROAMING_ENTRY, "telephony_init()"} + row.steps +
                            Texts{deinitCall(row.count)});
}

Texts facadeTrace(const RoamingCase& row, const Texts& trace)
{
    const std::string result = !row.answered ? "GetRoamingStatus Failed"
                               : row.flag    ? "GetRoamingStatus : [Roaming]"
                                             : "GetRoamingStatus : [Not Roaming]";
    return Texts{CORE_SYSTEM.debug("GetRoamingStatus", "CoreSystem::GetRoamingStatus")} +
           accessed(trace) + Texts{CORE_SYSTEM.debug("GetRoamingStatus", result)};
}

template <class Target>
void askRoaming(Target& target, const RoamingCase& row)
{
    row.prepare();
    bool flag = row.preset;
    EXPECT_EQ(target.GetRoamingStatus(row.slot, &flag), row.answered);
    EXPECT_EQ(flag, row.flag);
    EXPECT_THAT(platform().liveHandles(), IsEmpty());
}

void addRoamingCalls(std::vector<LoggedCall>& calls, const RoamingCase& row, const Texts& trace)
{
    calls.push_back({"Sim" + row.name, [=] { askRoaming(simManager(), row); }, trace});
    calls.push_back({row.name, [=] { askRoaming(coreSystem(), row); }, facadeTrace(row, trace)});
}

std::vector<LoggedCall> roamingCalls()
{
    std::vector<LoggedCall> calls;
    for (const auto& cases : {answeredCases(), unansweredCases(), slotCases()})
        for (const RoamingCase& row : cases)
            addRoamingCalls(calls, row, roamingTrace(row));
    addRoamingCalls(
        calls, {"RoamingWithoutTelephony", 0, [] { setNoTelephony(); }, false, true, true, {}},
        lockedThroughout({ROAMING_ENTRY, "telephony_init()", "telephony_deinit(no list)"}));
    addRoamingCalls(calls,
                    {"RoamingWithListOfFailedCall",
                     0,
                     [] {
                         setSlotCount(2);
                         platform().answer("telephony_init()", 1, 2u);
                     },
                     false,
                     true,
                     true,
                     {}},
                    lockedThroughout({ROAMING_ENTRY, "telephony_init()", deinitCall(2)}));
    addRoamingCalls(calls,
                    {"RoamingWhateverTheReleaseAnswers",
                     0,
                     [] {
                         setRoaming(0, 0, true);
                         platform().answer(deinitCall(2), -22);
                     },
                     true,
                     false,
                     true,
                     {}},
                    lockedThroughout(Texts{ROAMING_ENTRY, "telephony_init()"} + roamingAnswered(0) +
                                     Texts{deinitCall(2)}));
    return calls;
}

INSTANTIATE_TEST_SUITE_P(Imei, LoggedCallTest, testing::ValuesIn(imeiCalls()), rowName<LoggedCall>);
INSTANTIATE_TEST_SUITE_P(Roaming, LoggedCallTest, testing::ValuesIn(roamingCalls()),
                         rowName<LoggedCall>);

class ZoneTest : public PlatformTest, public testing::WithParamInterface<Zone> {};

INSTANTIATE_TEST_SUITE_P(Every, ZoneTest, testing::ValuesIn(ZONES), rowName<Zone>);

TEST_P(ZoneTest, OffsetAnswersInPlaceOfTheImei)
{
    const TimeZone zone(GetParam().rules);
    platform().now = GetParam().now;
    setNoTelephony();
    expectFallback(GetParam().imei);
    EXPECT_THAT(
        platform().texts(Event::Kind::CALL),
        ElementsAre("telephony_init()", "intToStr(" + std::to_string(GetParam().offset) + ")"));
}

TEST_P(ZoneTest, ReadingOfTheClockChangesNothing)
{
    const TimeZone zone(GetParam().rules);
    setNoTelephony();
    for (const int seconds : {0, 1, 59, 3600, 86400}) {
        platform().now = GetParam().now + seconds;
        expectFallback(GetParam().imei);
    }
}

class ImeiTest : public PlatformTest {};

TEST_F(ImeiTest, ZoneThatChangesBetweenTwoCallsIsSeen)
{
    setNoTelephony();
    platform().now = WINTER;
    const TimeZone restored("UTC0");
    expectFallback("000000000000000");
    setenv("TZ", "KST-9", 1);
    expectFallback("324000000000000");
    setenv("TZ", "EST5", 1);
    expectFallback("-18000000000000");
}

TEST_F(ImeiTest, SummerTimeThatBeginsBetweenTwoCallsIsSeen)
{
    setNoTelephony();
    const TimeZone zone("CET-1CEST,M3.5.0,M10.5.0/3");
    platform().now = 1774745999; // 2026-03-29 00:59:59 UTC
    expectFallback("360000000000000");
    platform().now = 1774746000;
    expectFallback("720000000000000");
}

TEST_F(ImeiTest, MachinesOwnZoneGivesFifteenCharacters)
{
    setNoTelephony();
    char* const value = imei();
    EXPECT_EQ(std::string(value).size(), 15u);
    std::free(value);
}

TEST_F(ImeiTest, FallbackWithoutSlotsKeepsTheList)
{
    const TimeZone zone("UTC0");
    setSlotCount(0);
    char* value = nullptr;
    EXPECT_EQ(system.GetIMEI(&value), 0);
    EXPECT_STREQ(value, "000000000000000");
    EXPECT_THAT(platform().liveHandles(), ElementsAre("list of 0"));
    std::free(value);
}

TEST_F(ImeiTest, EveryFailureCodeLeadsToTheFallback)
{
    const TimeZone zone("UTC0");
    for (const int code : PLATFORM_FAILURES) {
        setSlotCount(1);
        answerImei(0, code);
        expectFallback("000000000000000");
        setNoTelephony(code);
        expectFallback("000000000000000");
    }
}

TEST_F(ImeiTest, StringOfFailedReadIsNotTaken)
{
    const TimeZone zone("UTC0");
    setSlotCount(1);
    answerImei(0, -13, IMEI_0);
    char* const value = imei();
    EXPECT_STREQ(value, "000000000000000");
    std::free(value);
    EXPECT_THAT(ledger().freeAll(), ElementsAre("platform: " + IMEI_0));
}

TEST_F(ImeiTest, OddAnswersPassThroughUnchanged)
{
    for (const std::string& odd :
         {std::string("%s%n"), std::string("\xff\n"), std::string(1 << 20, '4')}) {
        platform().debugMode = 1;
        setSlotCount(1);
        answerImei(0, 0, odd);
        expectImei(odd, "platform: ");
        EXPECT_FALSE(isTold(odd));
    }
}

TEST_F(ImeiTest, AnswerTakesNoLockOfItsOwn)
{
    setSlotCount(1);
    answerImei(0, 0, IMEI_0);
    std::free(imei());
    EXPECT_EQ(platform().texts(Event::Kind::LOCK), (Texts{SIM_MANAGER.lock(), SIM_MANAGER.lock()}));
}

TEST_F(ImeiTest, FailedCopyOfTheFallbackGivesNull)
{
    setNoTelephony();
    const FailingAllocation failure(Allocation::STRDUP);
    EXPECT_EQ(imei(), nullptr);
    EXPECT_TRUE(failure.happened());
}

TEST_F(ImeiTest, NoExceptionCrossesTheInterface)
{
    platform().numberTextThrows = true;
    setNoTelephony();
    EXPECT_EQ(imei(), nullptr);
}

class RoamingTest : public PlatformTest {
protected:
    bool flag = false;
};

TEST_F(RoamingTest, EveryFailureCodeIsNoAnswer)
{
    for (const int code : PLATFORM_FAILURES) {
        setRoaming(0, code, {});
        EXPECT_FALSE(system.GetRoamingStatus(0, &flag)) << code;
        setService(0, code, 0);
        EXPECT_FALSE(system.GetRoamingStatus(0, &flag)) << code;
        setNoTelephony(code);
        EXPECT_FALSE(system.GetRoamingStatus(0, &flag)) << code;
    }
}

TEST_F(RoamingTest, NothingIsCached)
{
    for (const bool roaming : {true, false, true}) {
        setRoaming(1, 0, roaming);
        EXPECT_TRUE(system.GetRoamingStatus(1, &flag));
        EXPECT_EQ(flag, roaming);
        setService(1, 0, TELEPHONY_NETWORK_SERVICE_STATE_EMERGENCY_ONLY);
        EXPECT_FALSE(system.GetRoamingStatus(1, &flag));
        EXPECT_EQ(flag, roaming);
    }
}

} // namespace
