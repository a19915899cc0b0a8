// SPDX-License-Identifier: Apache-2.0
// Valid and invalid device files, and the message about each mistake.
#include <ctime>
#include <functional>

#include "devicefile/DeviceFile.h"
#include "port/facts/Facts.h"
#include "port/facts/Privacy.h"
#include "support/DeviceFileTest.h"

using port::CardStatus;
using port::CellularState;
using port::FontSize;
using port::LinkState;
using port::devicefile::DeviceFile;
using port::devicefile::Fault;
using port::devicefile::Meaning;
using testing::EndsWith;
using testing::HasSubstr;

namespace {

class SimulatorSchemaTest : public DeviceFileTest {
protected:
    // A value that is not what a key may be.
    std::string refusal(const std::string& section, const std::string& assignment)
    {
        return problemOf(section + "\n" + assignment + "\n");
    }

    DeviceFile file{path};
};

TEST_F(SimulatorSchemaTest, EveryKindOfValueIsReadWithItsLine)
{
    describe(
        "[device]\nserial = 'R58'\ntelephony = false\n[settings]\nfont_size = 'huge'\n"
        "utc_offset = -18000\n[network]\ncellular = 'call_only_available'\nwifi = 'connected'\n"
        "[storage]\nblocks = 9223372036854775807\n");
    expectAnswer("R58", line(3), file.get<std::string>("device", "serial"));
    expectAnswer(false, line(4), file.get<bool>("device", "telephony"));
    expectAnswer(FontSize::Huge, line(6), file.get<FontSize>("settings", "font_size"));
    expectAnswer(-18000, line(7), file.get<int>("settings", "utc_offset"));
    expectAnswer(CellularState::CallOnlyAvailable, line(9),
                 file.get<CellularState>("network", "cellular"));
    expectAnswer(LinkState::Connected, line(10), file.get<LinkState>("network", "wifi"));
    expectAnswer(std::numeric_limits<std::int64_t>::max(), line(12),
                 file.get<std::int64_t>("storage", "blocks"));
}

TEST_F(SimulatorSchemaTest, AbsentKeyAndAbsentSectionAreNotAvailable)
{
    describe("[network]\n");
    for (const char* const key : {"cellular", "bluetooth"})
        expectError(port::Error::Kind::NotAvailable, line(2) + ": [network] has no " + key,
                    file.get<LinkState>("network", key));
    expectError(port::Error::Kind::NotAvailable, path + ": [storage] has no blocks",
                file.get<std::int64_t>("storage", "blocks"));
}

TEST_F(SimulatorSchemaTest, DeviceMayLackARadio)
{
    describe("[network]\nwifi = 'not_supported'\n");
    expectError(port::Error::Kind::NotSupported, line(3) + ": this device has no wifi",
                file.get<LinkState>("network", "wifi"));
}

TEST_F(SimulatorSchemaTest, SwitchesAreTrueOrFalse)
{
    const std::string refused = " must be true or false";
    for (const char* const value : {"'true'", "0", "1", "'on'", "[true]"})
        EXPECT_EQ(":3:15: \"flight_mode\"" + refused,
                  refusal("[settings]", "flight_mode = " + std::string(value)))
            << value;
    for (const char* const key : {"flight_mode", "data_roaming", "mobile_data", "packet_data"})
        EXPECT_EQ("", refusal("[settings]", std::string(key) + " = true"));
    EXPECT_EQ("", refusal("[device]", "telephony = true"));
}

TEST_F(SimulatorSchemaTest, WholeNumbersHaveBounds)
{
    const std::string refused = ":3:14: \"utc_offset\" must be a whole number from -86399 to 86399";
    for (const char* const value : {"86400", "-86400", "1.5", "'0'", "true", "1e3"})
        EXPECT_EQ(refused, refusal("[settings]", "utc_offset = " + std::string(value))) << value;
    for (const char* const value : {"86399", "-86399", "0"})
        EXPECT_EQ("", refusal("[settings]", "utc_offset = " + std::string(value)));
    for (const char* const key : {"block_size", "fragment_size", "blocks", "available_blocks"}) {
        EXPECT_THAT(refusal("[storage]", std::string(key) + " = -1"),
                    EndsWith(" must be a whole number from 0"));
        EXPECT_EQ("", refusal("[storage]", std::string(key) + " = 9223372036854775807"));
    }
}

TEST_F(SimulatorSchemaTest, NamesAreListedWhenOneIsUnknown)
{
    EXPECT_EQ(":3:8: \"wifi\" must be one of \"deactivated\", \"disconnected\", \"connected\", "
              "\"not_supported\"",
              refusal("[network]", "wifi = 'on'"));
    EXPECT_THAT(refusal("[network]", "wifi = 1"), HasSubstr(":3:8: \"wifi\" must be one of "));
    EXPECT_EQ(":3:13: \"font_size\" must be one of \"small\", \"normal\", \"large\", \"huge\", "
              "\"giant\", or a whole number from 5",
              refusal("[settings]", "font_size = 4"));
    EXPECT_EQ(":3:8: \"data\" must be one of \"unknown\", or a whole number from 0 to 1",
              refusal("[subscriptions]", "data = 2"));
}

TEST_F(SimulatorSchemaTest, EveryNameIsTaken)
{
    const struct {
        const char* section;
        const char* key;
        std::vector<const char*> names;
    } rows[] = {
        {"settings", "font_size", {"small", "normal", "large", "huge", "giant"}},
        {"network",
         "cellular",
         {"out_of_service", "flight_mode", "roaming_off", "call_only_available", "available",
          "connected", "not_supported"}},
        {"network", "wifi", {"deactivated", "disconnected", "connected", "not_supported"}},
        {"network", "bluetooth", {"deactivated", "disconnected", "connected", "not_supported"}},
        {"network",
         "wifi_connection",
         {"failure", "disconnected", "association", "configuration", "connected", "not_supported"}},
        {"subscriptions", "voice", {"unknown", "current_network", "ask_always", "slot0", "slot1"}},
        {"subscriptions", "network", {"unknown"}},
        {"subscriptions", "data", {"unknown"}},
    };
    for (const auto& row : rows)
        for (std::size_t i = 0; i < row.names.size(); ++i) {
            const std::string name = row.names[i];
            describe("[" + std::string(row.section) + "]\n" + row.key + " = '" + name + "'\n");
            const auto value = file.get<std::int64_t>(row.section, row.key);
            ASSERT_EQ("", backend->deviceFileProblem());
            if (name == "not_supported")
                EXPECT_EQ(port::Error::Kind::NotSupported, value.error().kind);
            else if (row.names.size() == 1)
                EXPECT_EQ(-1, value.value().value);
            else
                EXPECT_EQ(static_cast<std::int64_t>(i), value.value().value) << name;
        }
}

TEST_F(SimulatorSchemaTest, FontSizesBeyondTheNamedOnesArePassedThrough)
{
    describe("[settings]\nfont_size = 7\n");
    expectAnswer(static_cast<FontSize>(7), line(3), file.get<FontSize>("settings", "font_size"));
}

TEST_F(SimulatorSchemaTest, DigitsAreCounted)
{
    const auto refused = [this](const std::string& assignment) {
        return refusal("[[slot]]", assignment);
    };
    for (const char* const mcc : {"'45'", "'4500'", "'45a'", "''", "450", "' 45'"})
        EXPECT_EQ(":3:7: \"mcc\" must be 3 digits in quotes", refused("mcc = " + std::string(mcc)))
            << mcc;
    for (const char* const mnc : {"'1'", "'0001'", "'0x'", "5"})
        EXPECT_EQ(":3:7: \"mnc\" must be 2 to 3 digits in quotes",
                  refused("mnc = " + std::string(mnc)))
            << mnc;
    for (const char* const msin : {"''", "'01234567890'", "'-1'", "5"})
        EXPECT_EQ(":3:8: \"msin\" must be 1 to 10 digits in quotes",
                  refused("msin = " + std::string(msin)))
            << msin;
    for (const char* const imei : {"'4901542032375'", "'49015420323751812'", "490154203237518"})
        EXPECT_EQ(":3:8: \"imei\" must be 14 to 16 digits in quotes",
                  refused("imei = " + std::string(imei)))
            << imei;
    EXPECT_EQ("", refused("mcc = '001'\nmnc = '01'\nmsin = '0123456789'"));
}

TEST_F(SimulatorSchemaTest, ImsiHasFifteenDigitsAtMost)
{
    EXPECT_EQ(":4:8: \"msin\" must be 1 to 9 digits in quotes after an mnc of three",
              refusal("[[slot]]", "mnc = '260'\nmsin = '0123456789'"));
    EXPECT_EQ("", refusal("[[slot]]", "mnc = '260'\nmsin = '012345678'"));
    EXPECT_EQ("", refusal("[[slot]]", "mnc = '26'\nmsin = '0123456789'"));
}

TEST_F(SimulatorSchemaTest, NumbersAreDialable)
{
    const std::string refused = ":3:10: \"number\" must be a phone number in quotes, or \"null\"";
    for (const char* const number :
         {"''", "'+'", "'12 34'", "'++1'", "'1+1'", "'nil'", "5", "'123456789012345678901'"})
        EXPECT_EQ(refused, refusal("[[slot]]", "number = " + std::string(number))) << number;
    for (const char* const number : {"'+15550100'", "'*100#'", "'7'", "'null'"})
        EXPECT_EQ("", refusal("[[slot]]", "number = " + std::string(number))) << number;
}

TEST_F(SimulatorSchemaTest, ModemNamesDifferFromSlotToSlot)
{
    EXPECT_EQ(":5:11: every slot must have another cp_name",
              problemOf("[[slot]]\ncp_name = 'a'\n[[slot]]\ncp_name = 'a'\n"));
    EXPECT_EQ(":3:11: \"cp_name\" must be a text in quotes that is not empty",
              problemOf("[[slot]]\ncp_name = ''\n"));
    EXPECT_EQ(":4:1: every slot must have another cp_name", // the second one's own name is cp1
              problemOf("[[slot]]\ncp_name = 'cp1'\n[[slot]]\n"));
    EXPECT_EQ("", problemOf("[[slot]]\n[[slot]]\ncp_name = 'cp2'\n"));
}

TEST_F(SimulatorSchemaTest, SlotsAreAList)
{
    EXPECT_EQ(":2:1: [[slot]] must be a list of sections", problemOf("[slot]\n"));
    EXPECT_EQ(":2:8: [[slot]] must be a list of sections", problemOf("slot = 'x'\n"));
    EXPECT_EQ(":2:9: [[slot]] must be a list of sections", problemOf("slot = [1]\n"));
    EXPECT_EQ(":3:1: unknown key \"colour\" in [[slot]]", problemOf("[[slot]]\ncolour = 1\n"));
    EXPECT_EQ("", problemOf("slot = [{}, {}]\n"));
    EXPECT_EQ("", problemOf("slot = []\n"));
}

std::string repeated(std::size_t count, const std::function<std::string(std::size_t)>& text,
                     std::size_t bytes = port::devicefile::SIZE_LIMIT - 2048)
{
    std::string all;
    for (std::size_t i = 0; i < count && all.size() < bytes; ++i)
        all += text(i);
    return all;
}

TEST_F(SimulatorSchemaTest, NumberOfSlotsAndOfChangesHasALimit)
{
    const auto slots = [](std::size_t) { return "[[slot]]\n"; };
    EXPECT_EQ("", problemOf(repeated(64, slots)));
    EXPECT_EQ(":66:1: more than 64 slots", problemOf(repeated(65, slots)));
    const auto change = [](std::size_t i) {
        return "\"packages.p" + std::to_string(i) + "\" = '1'\n";
    };
    EXPECT_EQ("", problemOf("[[step]]\n[step.set]\n" + repeated(10000, change)));
    EXPECT_THAT(problemOf("[[step]]\n[step.set]\n" + repeated(10001, change)),
                EndsWith(":1: more than 10000 changes in all steps"));
}

// That this process has had, however busy the machine is.
double processorSeconds()
{
    return static_cast<double>(std::clock()) / CLOCKS_PER_SEC;
}

// Files of the size limit, made to be slow.
TEST_F(SimulatorSchemaTest, NoFileTakesLong)
{
// An eighth where a sanitizer, or the emulator of another processor, takes many times as long.
#if defined(WITH_SANITIZERS) || !defined(__x86_64__)
    constexpr std::size_t BYTES = port::devicefile::SIZE_LIMIT / 8;
    constexpr double LIMIT = 10;
#else
    constexpr std::size_t BYTES = port::devicefile::SIZE_LIMIT - 2048;
    constexpr double LIMIT = 2;
#endif
    const auto filled = [](const std::function<std::string(std::size_t)>& text) {
        return repeated(BYTES, text, BYTES);
    };
    const std::string longName(990, 'x');
    const auto number = [](std::size_t i) { return std::to_string(i); };
    const std::string texts[] = {
        filled([](std::size_t) { return "[[slot]]\n"; }),
        filled([](std::size_t) { return "[[step]]\n"; }),
        "[fault]\n" + filled([&](std::size_t i) { return "get_imei" + number(i) + "=1\n"; }),
        "[fault]\n" + filled([&](std::size_t i) { return longName + number(i) + "=1\n"; }),
        "[settings]\n" +
            filled([&](std::size_t i) { return "s" + number(i) + "='" + longName + "'\n"; }),
        "[packages]\n" + filled([&](std::size_t i) { return "p" + number(i) + "='1'\n"; }),
        "[[step]]\n[step.set]\n" +
            filled([&](std::size_t i) { return "x.y" + number(i) + "=1\n"; }),
        filled([&](std::size_t i) {
            return "a" + number(i) + repeated(400, [](std::size_t) { return ".a"; }) + "=1\n";
        }),
    };
    for (const std::string& text : texts) {
        describe(text);
        const double start = processorSeconds();
        const std::string first = backend->deviceFileProblem();
        const double took = processorSeconds() - start;
        EXPECT_LT(took, LIMIT) << text.substr(0, 60);
        const double again = processorSeconds();
        for (int question = 0; question < 10; ++question)
            EXPECT_EQ(first, backend->deviceFileProblem());
        EXPECT_LT(processorSeconds() - again, took + 0.2)
            << "what was found broken is not read again: " << text.substr(0, 60);
    }
}

TEST_F(SimulatorSchemaTest, PackagesHaveNamesOfTheirOwn)
{
    describe("[packages]\n\"org.example.app\" = '1.2'\n'with blank' = ''\n");
    expectAnswer("1.2", line(3), file.get<std::string>("packages", "org.example.app"));
    expectAnswer("", line(4), file.get<std::string>("packages", "with blank"));
    ASSERT_TRUE(file.device());
    EXPECT_EQ(nullptr, file.device().value()->section("packages").find("other"));
    EXPECT_EQ(":3:7: \"app\" must be a text in quotes", problemOf("[packages]\napp = 1\n"));
    EXPECT_THAT(problemOf("[packages]\norg.app = '1'\n"),
                EndsWith("\"org\" must be a text in quotes"));
}

TEST_F(SimulatorSchemaTest, FaultIsAnErrorByItsName)
{
    describe("[fault]\ntelephony_init = 'TELEPHONY_ERROR_PERMISSION_DENIED'\n"
             "tel_get_sim_imsi = 'TAPI_SIM_ACCESS_CARD_ERROR'\nvconf_get_str = 'null'\n");
    const auto refused = file.get<Fault>("fault", "telephony_init");
    ASSERT_TRUE(refused) << backend->deviceFileProblem();
    EXPECT_EQ(line(3), refused.value().source);
    EXPECT_EQ("TELEPHONY_ERROR_PERMISSION_DENIED", refused.value().value.error);
    EXPECT_EQ(-13, refused.value().value.meaning.number);
    EXPECT_EQ(0, refused.value().value.delayMs);
    EXPECT_EQ(0, refused.value().value.call);
    EXPECT_EQ(1, file.get<Fault>("fault", "tel_get_sim_imsi").value().value.meaning.number);
    EXPECT_TRUE(file.get<Fault>("fault", "vconf_get_str").value().value.meaning ==
                Meaning::Kind::Nothing);
    EXPECT_FALSE(file.get<Fault>("fault", "wifi_initialize"));
}

TEST_F(SimulatorSchemaTest, FaultMayBeLateAndOfOneCall)
{
    describe("[fault]\ntelephony_sim_get_state = { error = 'TELEPHONY_ERROR_OPERATION_FAILED', "
             "delay_ms = 200, call = 2 }\nwifi_initialize.delay_ms = 60000\n"
             "[fault.GetSerial]\nerror = 'org.freedesktop.DBus.Error.AccessDenied'\ncall = 1\n");
    const auto state = file.get<Fault>("fault", "telephony_sim_get_state");
    ASSERT_TRUE(state) << backend->deviceFileProblem();
    EXPECT_EQ("TELEPHONY_ERROR_OPERATION_FAILED", state.value().value.error);
    EXPECT_EQ(-39845887, state.value().value.meaning.number);
    EXPECT_EQ(200, state.value().value.delayMs);
    EXPECT_EQ(2, state.value().value.call);
    EXPECT_EQ("", file.get<Fault>("fault", "wifi_initialize").value().value.error);
    EXPECT_EQ(60000, file.get<Fault>("fault", "wifi_initialize").value().value.delayMs);
    EXPECT_EQ("org.freedesktop.DBus.Error.AccessDenied",
              file.get<Fault>("fault", "GetSerial").value().value.error);
}

TEST_F(SimulatorSchemaTest, BusOfAProgramMayBeMissing)
{
    describe("[fault]\ng_bus_get_sync = 'no_bus'\n");
    expectAnswer(port::devicefile::BusFault::NoBus, line(3),
                 file.get<port::devicefile::BusFault>("fault", "g_bus_get_sync"));
    EXPECT_EQ(":3:18: \"g_bus_get_sync\" must be one of \"no_bus\"",
              refusal("[fault]", "g_bus_get_sync = 'off'"));
}

TEST_F(SimulatorSchemaTest, FaultHasANameOfItsOwnInterface)
{
    EXPECT_EQ(":3:1: unknown key \"telephony_inti\" in [fault]; did you mean \"telephony_init\"?",
              refusal("[fault]", "telephony_inti = 'TELEPHONY_ERROR_PERMISSION_DENIED'"));
    EXPECT_EQ(":3:19: \"wifi_initialize\" must be one of \"WIFI_ERROR_INVALID_PARAMETER\", "
              "\"WIFI_ERROR_OUT_OF_MEMORY\", \"WIFI_ERROR_INVALID_OPERATION\", "
              "\"WIFI_ERROR_OPERATION_FAILED\", \"WIFI_ERROR_PERMISSION_DENIED\", "
              "\"WIFI_ERROR_NOT_SUPPORTED\"; did you mean "
              "\"WIFI_ERROR_PERMISSION_DENIED\"?",
              refusal("[fault]", "wifi_initialize = 'TELEPHONY_ERROR_PERMISSION_DENIED'"));
    EXPECT_EQ(":3:26: \"error\" must be one of \"DLOG_ERROR_NOT_PERMITTED\", "
              "\"DLOG_ERROR_INVALID_PARAMETER\"",
              refusal("[fault]", "__dlog_print = { error = -1 }"));
    EXPECT_EQ(":3:12: \"tel_init\" must be one of \"null\"",
              refusal("[fault]", "tel_init = 'TAPI_API_ACCESS_DENIED'"));
    for (const char* const name : {"'x'", "'a..b'", "''", "1", "'a.1b'"})
        EXPECT_EQ(
            ":3:13: \"GetSerial\" must be \"not_a_string\", or an error name of D-Bus in quotes",
            refusal("[fault]", "GetSerial = " + std::string(name)))
            << name;
    EXPECT_EQ("", refusal("[fault]", "GetSerial = 'not_a_string'"));
}

TEST_F(SimulatorSchemaTest, FaultsTableSaysWhatHappens)
{
    EXPECT_EQ(":3:12: \"tel_init\" must have an error or a delay_ms",
              refusal("[fault]", "tel_init = { call = 2 }"));
    EXPECT_EQ(":3:14: unknown key \"delay\" in a fault, which has error, delay_ms and call",
              refusal("[fault]", "tel_init = { delay = 2 }"));
    for (const char* const delay : {"0", "60001", "-1", "'1'", "1.5"})
        EXPECT_EQ(":3:25: \"delay_ms\" must be a whole number from 1 to 60000",
                  refusal("[fault]", "tel_init = { delay_ms = " + std::string(delay) + " }"))
            << delay;
    EXPECT_EQ(":3:37: \"call\" must be a whole number from 1",
              refusal("[fault]", "tel_init = { error = 'null', call = 0 }"));
}

TEST_F(SimulatorSchemaTest, NulIsRefusedInAnyText)
{
    EXPECT_EQ(":3:7: \"app\" must not hold a NUL", problemOf("[packages]\napp = \"1\\u0000\"\n"));
    EXPECT_EQ(":3:11: \"cp_name\" must not hold a NUL",
              problemOf("[[slot]]\ncp_name = \"a\\u0000\"\n"));
}

TEST(PrivacyTest, WhatIsPrivateIsMaskedByCharacters)
{
    constexpr struct {
        const char* text;
        const char* masked;
        const char* zeroed;
    } ROWS[] = {
        {"", "", ""},
        {"1234", "****", "0000"},
        {"12345", "***45", "00000"},
        {"+49 30-x", "******-x", "+00 00-0"},
        {"\u00e9t\u00e9 \u0439\u0446", "****\u0439\u0446", "000 00"},
    };
    for (const auto& row : ROWS) {
        EXPECT_EQ(row.masked, port::masked(row.text));
        EXPECT_EQ(row.zeroed, port::zeroed(row.text));
    }
    EXPECT_TRUE(port::isPrivate("device", "platform_id"));
    EXPECT_TRUE(port::isPrivate("slot", "msin"));
    EXPECT_FALSE(port::isPrivate("slot", "mcc"));
    EXPECT_FALSE(port::isPrivate("packages", "msin"));
}

} // namespace
