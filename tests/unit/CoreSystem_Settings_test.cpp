// SPDX-License-Identifier: Apache-2.0
// Flight mode, data roaming, mobile data, sales code, font size and the current time.
#include <cstring>
#include <map>

#include "support/PlatformTest.h"

using namespace fake;

namespace {

struct Switch {
    std::string name;
    bool (CoreSystem::*ask)();
    std::string call;
    std::string text; // before " ON" or " OFF"

    Texts trace(bool isOn) const
    {
        return {CORE_SYSTEM.debug(name, "CoreSystem::" + name), call,
                CORE_SYSTEM.debug(name, text + (isOn ? " ON" : " OFF"))};
    }
};

const Switch SWITCHES[] = {
    {"IsFlightMode", &CoreSystem::IsFlightMode, "runtime_info_get_value_bool(0)", "FlightMode"},
    {"IsDataRoamingEnabled", &CoreSystem::IsDataRoamingEnabled, "runtime_info_get_value_bool(10)",
     "DataRoaming"},
    {"IsMobileData", &CoreSystem::IsMobileData, "system_settings_get_value_bool(8)", "MobileData"},
};

std::vector<LoggedCall> switchCalls()
{
    std::vector<LoggedCall> calls;
    for (const Switch& row : SWITCHES)
        for (const int code : {0, -22, 1})
            for (const std::any& value : {std::any(true), std::any(false), std::any()}) {
                const bool isOn = value.has_value() && std::any_cast<bool>(value);
                const std::string read = isOn ? "On" : value.has_value() ? "Off" : "Unwritten";
                calls.push_back({row.name + read + (code ? "Code" + std::to_string(code + 22) : ""),
                                 [=] {
                                     platform().answer(row.call, code, value);
                                     EXPECT_EQ((coreSystem().*row.ask)(),
                                               isOn); // whatever the result
                                 },
                                 row.trace(isOn)});
            }
    return calls;
}

const std::string SALES_CODE_CALL = "vconf_get_str(db/csc/salescode)";
const Texts SALES_CODE_TRACE = {CORE_SYSTEM.debug("GetCSC", "CoreSystem::GetCSC"), SALES_CODE_CALL};

const std::vector<LoggedCall> SALES_CODE_CALLS = {
    {"GetCSCAnswered",
     [] {
         platform().answer(SALES_CODE_CALL, 0, std::string("KOO"));
         char* const value = coreSystem().GetCSC();
         EXPECT_EQ(value, std::string("KOO"));
         EXPECT_EQ(ledger().origin(value), "platform: KOO"); // the platform's own string
         EXPECT_EQ(ledger().freeAll(), Texts{"platform: KOO"});
     },
     SALES_CODE_TRACE},
    {"GetCSCWithoutKey",
     [] {
         platform().answer(SALES_CODE_CALL, 0);
         EXPECT_EQ(coreSystem().GetCSC(), nullptr);
     },
     SALES_CODE_TRACE},
};

const std::string FONT_SIZE_CALL = "system_settings_get_value_int(3)";

// The text of the result line; of no other size there is a line.
const std::map<int, std::string> FONT_SIZES = {
    {0, "small"}, {1, "normal"}, {2, "large"}, {3, "huge"}, {4, "giant"}};

std::vector<LoggedCall> fontSizeCalls()
{
    std::vector<LoggedCall> calls;
    const auto add = [&](const std::string& name, int code, int size, const std::any& written) {
        Texts trace = {CORE_SYSTEM.debug("GetFontSize", "CoreSystem::GetFontSize"), FONT_SIZE_CALL};
        if (FONT_SIZES.count(size) > 0)
            trace.push_back(CORE_SYSTEM.debug("GetFontSize", "FontSize is " + FONT_SIZES.at(size)));
        calls.push_back({"GetFontSize" + name,
                         [=] {
                             platform().answer(FONT_SIZE_CALL, code, written);
                             int slot = 99;
                             EXPECT_EQ(CoreSystemInternals::fontSize(&slot), code);
                             EXPECT_EQ(slot, size);
                         },
                         trace});
    };
    // What cannot be read is zero, unless it is written.
    for (const int code : {0, -22, 1}) {
        for (const int size : {-1, 0, 1, 2, 3, 4, 5})
            add(std::to_string(size + 1) + "Code" + std::to_string(code + 22), code, size, size);
        add("UnwrittenCode" + std::to_string(code + 22), code, 0, {});
    }
    return calls;
}

const std::string TIME_CALL = "alarm_get_current_time()";

const char* const ZONE = "ZONE";
const std::tm BROKEN_DOWN = {59, 58, 23, 31, 11, 126, 4, 364, 1, 32400, ZONE};
const std::tm OUT_OF_RANGE = {INT32_MIN, 60, INT32_MAX, -1, 11, 126, 4, 364, 1, -34200, nullptr};

auto fieldsOf(const std::tm& time)
{
    return std::make_tuple(time.tm_sec, time.tm_min, time.tm_hour, time.tm_mday, time.tm_mon,
                           time.tm_year, time.tm_wday, time.tm_yday, time.tm_isdst, time.tm_gmtoff,
                           static_cast<const void*>(time.tm_zone)); // not its text
}

Texts timeTrace(const std::string& text)
{
    return {CORE_SYSTEM.debug("GetCurrentTime", "CoreSystem::GetCurrentTime"), TIME_CALL,
            CORE_SYSTEM.debug("GetCurrentTime", "currentTime : " + text)};
}

std::vector<LoggedCall> timeCalls()
{
    std::vector<LoggedCall> calls;
    const auto add = [&](const std::string& name, int code, const std::any& written,
                         const std::tm& expected, const std::string& text) {
        calls.push_back({"GetCurrentTime" + name,
                         [=] {
                             platform().answer(TIME_CALL, code, written);
                             std::tm slot;
                             std::memset(&slot, 0x7f, sizeof slot);
                             EXPECT_EQ(CoreSystemInternals::currentTime(&slot), code);
                             EXPECT_EQ(fieldsOf(slot), fieldsOf(expected));
                         },
                         timeTrace(text)});
    };
    add("Answered", 0, BROKEN_DOWN, BROKEN_DOWN, "day 31,  23:58:59");
    add("OutOfRange", 0, OUT_OF_RANGE, OUT_OF_RANGE, "day -1,  2147483647:60:-2147483648");
    for (const int code : {-22, 1}) { // what cannot be read is cleared, unless it is written
        const std::string name = "Failure" + std::to_string(static_cast<unsigned int>(code));
        add(name, code, {}, std::tm(), "day 0,  0:0:0");
        add(name + "Written", code, BROKEN_DOWN, BROKEN_DOWN, "day 31,  23:58:59");
    }
    return calls;
}

LOGGED_CALLS(Switches, switchCalls());
LOGGED_CALLS(SalesCode, SALES_CODE_CALLS);
LOGGED_CALLS(FontSizes, fontSizeCalls());
LOGGED_CALLS(CurrentTime, timeCalls());

class SettingsTest : public PlatformTest {};

TEST_F(SettingsTest, OddSalesCodesPassThroughUnchanged)
{
    for (const std::string& odd : ODD_TEXTS) {
        platform().answer(SALES_CODE_CALL, 0, odd);
        EXPECT_TRUE(system.GetCSC() == odd);
        ledger().freeAll();
    }
}

} // namespace
