// SPDX-License-Identifier: Apache-2.0
// Flight mode, data roaming, mobile data, sales code, font size and the current time.
#include <cstring>

#include "support/PlatformTest.h"

using namespace fake;
using testing::IsEmpty;
using testing::StrEq;

namespace {

// Codes that the platform documents, and some that it does not.
const int SETTING_FAILURES[] = {-22, -12, -5, -13, -38, -1073741822, -1, 1, INT32_MAX, INT32_MIN};

struct Switch {
    std::string name;
    bool (CoreSystem::*ask)();
    std::string call;
    std::string text; // before " ON" or " OFF"

    std::string entryLine() const
    {
        return CORE_SYSTEM.debug(name, "CoreSystem::" + name);
    }
    Texts trace(bool isOn) const
    {
        return {entryLine(), call, CORE_SYSTEM.debug(name, text + (isOn ? " ON" : " OFF"))};
    }
    bool answer() const
    {
        return (coreSystem().*ask)();
    }
};

std::ostream& operator<<(std::ostream& out, const Switch& row)
{
    return out << row.name;
}

const Switch SWITCHES[] = {
    {"IsFlightMode", &CoreSystem::IsFlightMode, "runtime_info_get_value_bool(0)", "FlightMode"},
    {"IsDataRoamingEnabled", &CoreSystem::IsDataRoamingEnabled, "runtime_info_get_value_bool(10)",
     "DataRoaming"},
    {"IsMobileData", &CoreSystem::IsMobileData, "system_settings_get_value_bool(8)", "MobileData"},
};

std::vector<LoggedCall> switchCalls()
{
    std::vector<LoggedCall> calls;
    for (const Switch& row : SWITCHES) {
        for (const bool isOn : {true, false})
            calls.push_back({row.name + (isOn ? "On" : "Off"),
                             [row, isOn] {
                                 platform().answer(row.call, 0, isOn);
                                 EXPECT_EQ(row.answer(), isOn);
                             },
                             row.trace(isOn)});
        calls.push_back({row.name + "Failed",
                         [row] {
                             platform().answer(row.call, -1073741822);
                             EXPECT_FALSE(row.answer());
                         },
                         row.trace(false)});
    }
    return calls;
}

const std::string SALES_CODE_CALL = "vconf_get_str(db/csc/salescode)";
const Texts SALES_CODE_TRACE = {CORE_SYSTEM.debug("GetCSC", "CoreSystem::GetCSC"), SALES_CODE_CALL};

char* salesCode()
{
    return coreSystem().GetCSC();
}

const std::vector<LoggedCall> SALES_CODE_CALLS = {
    {"GetCSCAnswered",
     [] {
         platform().answer(SALES_CODE_CALL, 0, std::string("KOO"));
         std::free(salesCode());
     },
     SALES_CODE_TRACE},
    {"GetCSCWithoutKey",
     [] {
         platform().answer(SALES_CODE_CALL, 0);
         EXPECT_EQ(salesCode(), nullptr);
     },
     SALES_CODE_TRACE},
};

const std::string FONT_SIZE_CALL = "system_settings_get_value_int(3)";

struct FontSize {
    int value;
    std::string text; // of the result line; empty for none
};

const FontSize FONT_SIZES[] = {{-1, ""},
                               {0, "FontSize is small"},
                               {1, "FontSize is normal"},
                               {2, "FontSize is large"},
                               {3, "FontSize is huge"},
                               {4, "FontSize is giant"},
                               {5, ""},
                               {6, ""},
                               {INT32_MAX, ""},
                               {INT32_MIN, ""}};

Texts fontSizeTrace(const FontSize& row)
{
    Texts trace = {CORE_SYSTEM.debug("GetFontSize", "CoreSystem::GetFontSize"), FONT_SIZE_CALL};
    if (!row.text.empty())
        trace.push_back(CORE_SYSTEM.debug("GetFontSize", row.text));
    return trace;
}

// The content of a slot that held something else before.
int fontSize(int expectedCode)
{
    int slot = 99;
    EXPECT_EQ(CoreSystemInternals::fontSize(&slot), expectedCode);
    return slot;
}

std::vector<LoggedCall> fontSizeCalls()
{
    std::vector<LoggedCall> calls;
    for (const FontSize& row : FONT_SIZES)
        for (const int code : {0, -5}) {
            std::string name = "GetFontSize" + std::to_string(row.value) + (code ? "Failed" : "");
            std::replace(name.begin(), name.end(), '-', 'n');
            calls.push_back({name,
                             [row, code] {
                                 platform().answer(FONT_SIZE_CALL, code, row.value);
                                 EXPECT_EQ(fontSize(code), row.value);
                             },
                             fontSizeTrace(row)});
        }
    return calls;
}

const std::string TIME_CALL = "alarm_get_current_time()";

std::tm brokenDown()
{
    static const char* const ZONE = "ZONE";
    std::tm time = {};
    time.tm_sec = 59;
    time.tm_min = 58;
    time.tm_hour = 23;
    time.tm_mday = 31;
    time.tm_mon = 11;
    time.tm_year = 126;
    time.tm_wday = 4;
    time.tm_yday = 364;
    time.tm_isdst = 1;
    time.tm_gmtoff = 32400;
    time.tm_zone = ZONE;
    return time;
}

void expectSame(const std::tm& time, const std::tm& expected)
{
    EXPECT_EQ(time.tm_sec, expected.tm_sec);
    EXPECT_EQ(time.tm_min, expected.tm_min);
    EXPECT_EQ(time.tm_hour, expected.tm_hour);
    EXPECT_EQ(time.tm_mday, expected.tm_mday);
    EXPECT_EQ(time.tm_mon, expected.tm_mon);
    EXPECT_EQ(time.tm_year, expected.tm_year);
    EXPECT_EQ(time.tm_wday, expected.tm_wday);
    EXPECT_EQ(time.tm_yday, expected.tm_yday);
    EXPECT_EQ(time.tm_isdst, expected.tm_isdst);
    EXPECT_EQ(time.tm_gmtoff, expected.tm_gmtoff);
    EXPECT_EQ(time.tm_zone, expected.tm_zone); // the pointer, not the text
}

// The content of a slot that held something else before.
std::tm currentTime(int expectedCode)
{
    std::tm slot;
    std::memset(&slot, 0x7f, sizeof slot);
    EXPECT_EQ(CoreSystemInternals::currentTime(&slot), expectedCode);
    return slot;
}

Texts timeTrace(const std::string& text)
{
    return {CORE_SYSTEM.debug("GetCurrentTime", "CoreSystem::GetCurrentTime"), TIME_CALL,
            CORE_SYSTEM.debug("GetCurrentTime", "currentTime : " + text)};
}

const std::vector<LoggedCall> TIME_CALLS = {
    {"GetCurrentTimeAnswered",
     [] {
         platform().answer(TIME_CALL, 0, brokenDown());
         expectSame(currentTime(0), brokenDown());
     },
     timeTrace("day 31,  23:58:59")},
    {"GetCurrentTimeFailed",
     [] {
         platform().answer(TIME_CALL, -22);
         expectSame(currentTime(-22), std::tm());
     },
     timeTrace("day 0,  0:0:0")},
};

INSTANTIATE_TEST_SUITE_P(Switches, LoggedCallTest, testing::ValuesIn(switchCalls()),
                         rowName<LoggedCall>);
INSTANTIATE_TEST_SUITE_P(SalesCode, LoggedCallTest, testing::ValuesIn(SALES_CODE_CALLS),
                         rowName<LoggedCall>);
INSTANTIATE_TEST_SUITE_P(FontSizes, LoggedCallTest, testing::ValuesIn(fontSizeCalls()),
                         rowName<LoggedCall>);
INSTANTIATE_TEST_SUITE_P(CurrentTime, LoggedCallTest, testing::ValuesIn(TIME_CALLS),
                         rowName<LoggedCall>);

class SwitchTest : public PlatformTest, public testing::WithParamInterface<Switch> {
protected:
    const Switch& row = GetParam();
};

INSTANTIATE_TEST_SUITE_P(Every, SwitchTest, testing::ValuesIn(SWITCHES), rowName<Switch>);

TEST_P(SwitchTest, FailedReadIsOff)
{
    for (const int code : SETTING_FAILURES) {
        platform().answer(row.call, code);
        EXPECT_FALSE(row.answer()) << code;
    }
}

TEST_P(SwitchTest, ResultCodePlaysNoPart)
{
    for (const int code : SETTING_FAILURES)
        for (const bool value : {true, false}) {
            platform().answer(row.call, code, value);
            EXPECT_EQ(row.answer(), value) << code;
        }
}

TEST_P(SwitchTest, NothingIsCached)
{
    for (const bool value : {true, false, true}) {
        platform().answer(row.call, 0, value);
        EXPECT_EQ(row.answer(), value);
    }
}

class SettingsTest : public PlatformTest {};

TEST_F(SettingsTest, SalesCodeIsThePlatformsOwnString)
{
    platform().answer(SALES_CODE_CALL, 0, std::string("KOO"));
    char* const value = system.GetCSC();
    EXPECT_THAT(value, StrEq("KOO"));
    EXPECT_EQ(ledger().live(), Texts{"platform: KOO"});
    EXPECT_EQ(ledger().origin(value), "platform: KOO");
    std::free(value);
    EXPECT_THAT(ledger().live(), IsEmpty());
}

TEST_F(SettingsTest, OddSalesCodesPassThroughUnchanged)
{
    for (const std::string& odd :
         {std::string(), std::string("%s%n"), std::string(" \n\xff"), std::string(10 << 20, 'c')}) {
        platform().answer(SALES_CODE_CALL, 0, odd);
        char* const value = system.GetCSC();
        EXPECT_TRUE(value == odd);
        std::free(value);
    }
}

TEST_F(SettingsTest, FontSizeThatCannotBeReadIsZero)
{
    platform().debugMode = 1;
    for (const int code : SETTING_FAILURES) {
        platform().forgetEvents();
        platform().answer(FONT_SIZE_CALL, code);
        EXPECT_EQ(fontSize(code), 0);
        EXPECT_EQ(platform().trace(), fontSizeTrace(FONT_SIZES[1]));
    }
}

TEST_F(SettingsTest, FontSizeIsStoredWhateverTheResult)
{
    for (const int code : SETTING_FAILURES) {
        platform().answer(FONT_SIZE_CALL, code, 3);
        EXPECT_EQ(fontSize(code), 3);
    }
}

TEST_F(SettingsTest, TimeIsCopiedWholeWhateverTheResult)
{
    for (const int code : SETTING_FAILURES) {
        platform().answer(TIME_CALL, code, brokenDown());
        expectSame(currentTime(code), brokenDown());
    }
}

TEST_F(SettingsTest, TimeThatCannotBeReadIsCleared)
{
    for (const int code : SETTING_FAILURES) {
        platform().answer(TIME_CALL, code);
        expectSame(currentTime(code), std::tm());
    }
}

TEST_F(SettingsTest, TimeOutOfRangePassesThrough)
{
    platform().debugMode = 1;
    std::tm odd = brokenDown();
    odd.tm_mday = -1;
    odd.tm_hour = INT32_MAX;
    odd.tm_min = 60;
    odd.tm_sec = INT32_MIN;
    odd.tm_gmtoff = -34200;
    odd.tm_zone = nullptr;
    platform().answer(TIME_CALL, 0, odd);
    expectSame(currentTime(0), odd);
    EXPECT_EQ(platform().trace(), timeTrace("day -1,  2147483647:60:-2147483648"));
}

} // namespace
