// SPDX-License-Identifier: Apache-2.0
// Valid and invalid device files, and the message about each mistake.
#include <ctime>
#include <sstream>

#include "devicefile/DeviceFile.h"
#include "port/facts/Facts.h"
#include "port/facts/Privacy.h"
#include "support/Answer.h"
#include "support/DeviceFileTest.h"

using port::devicefile::BusFault;
using port::devicefile::DeviceFile;
using port::devicefile::Fault;
using port::devicefile::Meaning;
using testing::EndsWith;

namespace {

class SimulatorSchemaTest : public DeviceFileTest {
protected:
    // What is said of values that a key does not take; its place is theirs.
    void expectRefused(const std::string& section, const std::string& key,
                       const std::vector<std::string>& values, const std::string& wanted)
    {
        const std::string place = ":3:" + std::to_string(key.size() + 4);
        for (const std::string& value : values)
            EXPECT_EQ(place + ": \"" + key + "\" must " + wanted,
                      problemOf(section + "\n" + key + " = " + value + "\n"))
                << value;
    }
    void expectTaken(const std::string& section, const std::string& key,
                     const std::vector<std::string>& values)
    {
        for (const std::string& value : values)
            EXPECT_EQ("", problemOf(section + "\n" + key + " = " + value + "\n")) << value;
    }

    Fault faultOf(const char* key)
    {
        return valueOf(file.get<Fault>("fault", key));
    }

    DeviceFile file{path};
};

TEST_F(SimulatorSchemaTest, SwitchesAreTrueOrFalse)
{
    expectRefused("[settings]", "flight_mode", {"'true'", "0", "1", "'on'", "[true]"},
                  "be true or false");
    for (const char* const key : {"flight_mode", "data_roaming", "mobile_data", "packet_data"})
        expectTaken("[settings]", key, {"true"});
    expectTaken("[device]", "telephony", {"true"});
}

TEST_F(SimulatorSchemaTest, WholeNumbersHaveBounds)
{
    expectRefused("[settings]", "utc_offset", {"86400", "-86400", "1.5", "'0'", "true", "1e3"},
                  "be a whole number from -86399 to 86399");
    expectTaken("[settings]", "utc_offset", {"86399", "-86399", "0"});
    for (const char* const key : {"block_size", "fragment_size", "blocks", "available_blocks"}) {
        expectRefused("[storage]", key, {"-1"}, "be a whole number from 0");
        expectTaken("[storage]", key, {"9223372036854775807"});
    }
}

TEST_F(SimulatorSchemaTest, NamesAreListedWhenOneIsUnknown)
{
    expectRefused("[network]", "wifi", {"'on'", "1"},
                  "be one of \"deactivated\", \"disconnected\", \"connected\", \"not_supported\"");
    expectRefused("[settings]", "font_size", {"4"},
                  "be one of \"small\", \"normal\", \"large\", \"huge\", \"giant\", or a whole "
                  "number from 5");
    expectRefused("[subscriptions]", "data", {"2"},
                  "be one of \"unknown\", or a whole number from 0 to 1");
}

TEST_F(SimulatorSchemaTest, EveryNameIsTaken)
{
    const char* const RADIO = "deactivated disconnected connected not_supported";
    const struct {
        const char *section, *key, *names;
    } rows[] = {
        {"settings", "font_size", "small normal large huge giant"},
        {"network", "cellular",
         "out_of_service flight_mode roaming_off call_only_available available connected "
         "not_supported"},
        {"network", "wifi", RADIO},
        {"network", "bluetooth", RADIO},
        {"network", "wifi_connection",
         "failure disconnected association configuration connected not_supported"},
        {"subscriptions", "voice", "unknown current_network ask_always slot0 slot1"},
        {"subscriptions", "network", "unknown"},
        {"subscriptions", "data", "unknown"},
    };
    for (const auto& row : rows) {
        std::istringstream names(row.names);
        std::int64_t number = std::string(row.names) == "unknown" ? -1 : 0;
        for (std::string name; names >> name; ++number) {
            describe("[" + std::string(row.section) + "]\n" + row.key + " = '" + name + "'\n");
            const auto value = file.get<std::int64_t>(row.section, row.key);
            ASSERT_EQ("", backend->deviceFileProblem());
            if (name == "not_supported")
                EXPECT_EQ(port::Error::Kind::NotSupported, value.error().kind);
            else
                EXPECT_EQ(number, value.value().value) << name;
        }
    }
}

TEST_F(SimulatorSchemaTest, DigitsAreCounted)
{
    const std::string slot = "[[slot]]";
    expectRefused(slot, "mcc", {"'45'", "'4500'", "'45a'", "''", "450", "' 45'"},
                  "be 3 digits in quotes");
    expectRefused(slot, "mnc", {"'1'", "'0001'", "'0x'", "5"}, "be 2 to 3 digits in quotes");
    expectRefused(slot, "msin", {"''", "'01234567890'", "'-1'", "5"},
                  "be 1 to 10 digits in quotes");
    expectRefused(slot, "imei", {"'4901542032375'", "'49015420323751812'", "490154203237518"},
                  "be 14 to 16 digits in quotes");
    expectTaken(slot, "mcc", {"'001'\nmnc = '01'\nmsin = '0123456789'"});
    EXPECT_EQ(":4:8: \"msin\" must be 1 to 9 digits in quotes after an mnc of three",
              problemOf("[[slot]]\nmnc = '260'\nmsin = '0123456789'\n"));
    expectTaken(slot, "mnc", {"'260'\nmsin = '012345678'", "'26'\nmsin = '0123456789'"});
}

TEST_F(SimulatorSchemaTest, NumbersAreDialable)
{
    expectRefused(
        "[[slot]]", "number",
        {"''", "'+'", "'12 34'", "'++1'", "'1+1'", "'nil'", "5", "'123456789012345678901'"},
        "be a phone number in quotes, or \"null\"");
    expectTaken("[[slot]]", "number", {"'+15550100'", "'*100#'", "'7'", "'null'"});
}

TEST_F(SimulatorSchemaTest, SlotsAreAListWithNamesOfTheirOwn)
{
    const std::string list = " [[slot]] must be a list of sections";
    const std::string another = " every slot must have another cp_name";
    EXPECT_EQ(":2:1:" + list, problemOf("[slot]\n"));
    EXPECT_EQ(":2:8:" + list, problemOf("slot = 'x'\n"));
    EXPECT_EQ(":2:9:" + list, problemOf("slot = [1]\n"));
    EXPECT_EQ(":3:1: unknown key \"colour\" in [[slot]]", problemOf("[[slot]]\ncolour = 1\n"));
    EXPECT_EQ(":5:11:" + another, problemOf("[[slot]]\ncp_name = 'a'\n[[slot]]\ncp_name = 'a'\n"));
    EXPECT_EQ(":4:1:" + another, // the second one's own name is cp1
              problemOf("[[slot]]\ncp_name = 'cp1'\n[[slot]]\n"));
    expectRefused("[[slot]]", "cp_name", {"''"}, "be a text in quotes that is not empty");
    expectRefused("[[slot]]", "cp_name", {"\"a\\u0000\""}, "not hold a NUL");
    for (const char* const good :
         {"slot = [{}, {}]\n", "slot = []\n", "[[slot]]\n[[slot]]\ncp_name = 'cp2'\n"})
        EXPECT_EQ("", problemOf(good)) << good;
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
// An eighth where sanitizers, no optimisation or an emulator take many times as long.
#if defined(WITH_SANITIZERS) || !defined(__OPTIMIZE__) || !defined(__x86_64__)
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
    expectRefused("[packages]", "app", {"1"}, "be a text in quotes");
    expectRefused("[packages]", "app", {"\"1\\u0000\""}, "not hold a NUL");
    EXPECT_THAT(problemOf("[packages]\norg.app = '1'\n"),
                EndsWith("\"org\" must be a text in quotes"));
}

TEST_F(SimulatorSchemaTest, FaultIsAnErrorByItsName)
{
    describe("[fault]\ntelephony_init = 'TELEPHONY_ERROR_PERMISSION_DENIED'\n"
             "tel_get_sim_imsi = 'TAPI_SIM_ACCESS_CARD_ERROR'\nvconf_get_str = 'null'\n"
             "g_bus_get_sync = 'no_bus'\n");
    const Fault refused = faultOf("telephony_init");
    EXPECT_EQ(line(3), file.get<Fault>("fault", "telephony_init").value().source);
    EXPECT_EQ("TELEPHONY_ERROR_PERMISSION_DENIED", refused.error);
    EXPECT_EQ(-13, refused.meaning.number);
    EXPECT_EQ(0, refused.delayMs);
    EXPECT_EQ(0, refused.call);
    EXPECT_EQ(1, faultOf("tel_get_sim_imsi").meaning.number);
    EXPECT_TRUE(faultOf("vconf_get_str").meaning == Meaning::Kind::Nothing);
    EXPECT_FALSE(file.get<Fault>("fault", "wifi_initialize"));
    expectAnswer(BusFault::NoBus, line(6), file.get<BusFault>("fault", "g_bus_get_sync"));
}

TEST_F(SimulatorSchemaTest, FaultMayBeLateAndOfOneCall)
{
    describe("[fault]\ntelephony_sim_get_state = { error = 'TELEPHONY_ERROR_OPERATION_FAILED', "
             "delay_ms = 200, call = 2 }\nwifi_initialize.delay_ms = 60000\n"
             "[fault.GetSerial]\nerror = 'org.freedesktop.DBus.Error.AccessDenied'\ncall = 1\n");
    const Fault state = faultOf("telephony_sim_get_state");
    EXPECT_EQ("TELEPHONY_ERROR_OPERATION_FAILED", state.error);
    EXPECT_EQ(-39845887, state.meaning.number);
    EXPECT_EQ(200, state.delayMs);
    EXPECT_EQ(2, state.call);
    EXPECT_EQ("", faultOf("wifi_initialize").error);
    EXPECT_EQ(60000, faultOf("wifi_initialize").delayMs);
    EXPECT_EQ("org.freedesktop.DBus.Error.AccessDenied", faultOf("GetSerial").error);
}

TEST_F(SimulatorSchemaTest, FaultHasANameOfItsOwnInterface)
{
    EXPECT_EQ(":3:1: unknown key \"telephony_inti\" in [fault]; did you mean \"telephony_init\"?",
              problemOf("[fault]\ntelephony_inti = 'TELEPHONY_ERROR_PERMISSION_DENIED'\n"));
    expectRefused("[fault]", "wifi_initialize", {"'TELEPHONY_ERROR_PERMISSION_DENIED'"},
                  "be one of \"WIFI_ERROR_INVALID_PARAMETER\", \"WIFI_ERROR_OUT_OF_MEMORY\", "
                  "\"WIFI_ERROR_INVALID_OPERATION\", \"WIFI_ERROR_OPERATION_FAILED\", "
                  "\"WIFI_ERROR_PERMISSION_DENIED\", \"WIFI_ERROR_NOT_SUPPORTED\"; did you mean "
                  "\"WIFI_ERROR_PERMISSION_DENIED\"?");
    expectRefused("[fault]", "tel_init", {"'TAPI_API_ACCESS_DENIED'"}, "be one of \"null\"");
    expectRefused("[fault]", "g_bus_get_sync", {"'off'"}, "be one of \"no_bus\"");
    expectRefused("[fault]", "GetSerial", {"'x'", "'a..b'", "''", "1", "'a.1b'"},
                  "be \"not_a_string\", or an error name of D-Bus in quotes");
    expectTaken("[fault]", "GetSerial", {"'not_a_string'"});
}

TEST_F(SimulatorSchemaTest, FaultsTableSaysWhatHappens)
{
    expectRefused("[fault]", "tel_init", {"{ call = 2 }"}, "have an error or a delay_ms");
    for (const auto& [fault, problem] :
         {std::pair("__dlog_print = { error = -1 }",
                    "26: \"error\" must be one of \"DLOG_ERROR_NOT_PERMITTED\", "
                    "\"DLOG_ERROR_INVALID_PARAMETER\""),
          {"tel_init = { delay = 2 }",
           "14: unknown key \"delay\" in a fault, which has error, delay_ms and call"},
          {"tel_init = { error = 'null', call = 0 }",
           "37: \"call\" must be a whole number from 1"}})
        EXPECT_EQ(std::string(":3:") + problem, problemOf("[fault]\n" + std::string(fault) + "\n"));
    for (const std::string delay : {"0", "60001", "-1", "'1'", "1.5"})
        EXPECT_EQ(":3:25: \"delay_ms\" must be a whole number from 1 to 60000",
                  problemOf("[fault]\ntel_init = { delay_ms = " + delay + " }\n"));
}

TEST(PrivacyTest, WhatIsPrivateIsMaskedByCharacters)
{
    constexpr struct {
        const char *text, *masked, *zeroed;
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
