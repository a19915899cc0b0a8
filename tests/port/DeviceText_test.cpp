// SPDX-License-Identifier: Apache-2.0
// A device file's text when single values change.
#include <gmock/gmock.h>

#include "devicefile/DevicePath.h"
#include "devicefile/DeviceText.h"

using port::devicefile::changeText;
using port::devicefile::DevicePath;
using port::devicefile::Edit;
using port::devicefile::getValue;
using port::devicefile::parsePath;
using testing::ElementsAre;
using testing::HasSubstr;

namespace {

constexpr const char* FILE_NAME = "d.toml";

std::string changed(const std::string& text, const std::vector<Edit>& changes)
{
    const auto result = changeText(text, FILE_NAME, changes);
    return result ? result.value() : "refused: " + result.error().reason;
}

std::string withSet(const std::string& text, const std::string& path, const std::string& value)
{
    return changed(text, {{path, value}});
}

std::string without(const std::string& text, const std::string& path)
{
    return changed(text, {{path, std::nullopt}});
}

std::string valueOf(const std::string& text, const std::string& path)
{
    const auto value = getValue(text, FILE_NAME, path);
    return value ? value.value() : "none: " + value.error().reason;
}

DevicePath pathOf(const std::string& text)
{
    const auto path = parsePath(text);
    return path ? path.value() : DevicePath();
}

// With a byte order mark, both kinds of line endings, every kind of quotes, and no ending at last.
constexpr const char* ODD = "\xEF\xBB\xBF# Gerät №7 \xF0\x9F\x93\xB1\r\n"
                            "schema=1 # the only one\r\n"
                            "\r\n"
                            "  [ settings ]   # Einstellungen\r\n"
                            "\tdevice_name   =\t'Küche'   # für \"alle\"\r\n"
                            "  'language'=\"ko_KR\"#tight\r\n"
                            "flight_mode =   false\r\n"
                            "\r\n"
                            "# a radio\r\n"
                            "[network]\r\n"
                            "wifi = \"\"\"\\\r\n"
                            "   connected\"\"\" # long\n"
                            "\r\n"
                            "[device]\r\n"
                            "model_name = '''Two''' \r\n"
                            "telephony\t=\ttrue";

// The odd text with a part of it replaced by hand.
std::string oddWith(const std::string& part, const std::string& by)
{
    std::string text = ODD;
    const std::size_t at = text.find(part);
    EXPECT_NE(std::string::npos, at) << part;
    return text.replace(at, part.size(), by);
}

TEST(DeviceTextTest, OnlyTheValuesBytesChange)
{
    const struct {
        const char *path, *value, *was, *is;
    } rows[] = {
        {"settings.device_name", "Bad 浴室", "'Küche'", "'Bad 浴室'"},
        {"settings.device_name", "Anna's", "'Küche'", "\"Anna's\""},
        {"settings.device_name", "", "'Küche'", "''"},
        {"settings.language", "de_DE", "\"ko_KR\"", "\"de_DE\""},
        {"settings.language", "a\\b\"c", "\"ko_KR\"", "\"a\\\\b\\\"c\""},
        {"settings.flight_mode", "true", "false", "true"},
        {"network.wifi", "deactivated", "\"\"\"\\\r\n   connected\"\"\"", "\"deactivated\""},
        {"device.model_name", "Three", "'''Two'''", "\"Three\""},
        {"device.telephony", "false", "true", "false"},
    };
    for (const auto& row : rows)
        EXPECT_EQ(oddWith(row.was, row.is), withSet(ODD, row.path, row.value)) << row.path;
}

TEST(DeviceTextTest, ByteOrderMarkStaysFirst)
{
    const std::string mark = "\xEF\xBB\xBF";
    EXPECT_EQ(mark + "device.serial = 'b' # é\nschema = 1\n",
              withSet(mark + "device.serial = 'a' # é\nschema = 1\n", "device.serial", "b"));
    EXPECT_EQ(mark + "schema = 1\n[device]\n", withSet(mark + "[device]\n", "schema", "1"));
    EXPECT_EQ(mark + "schema = 1\n",
              without(mark + "device.serial = 'a'\nschema = 1\n", "device.serial"));
}

TEST(DeviceTextTest, NewKeyGoesToTheEndOfItsSection)
{
    EXPECT_EQ(
        oddWith("flight_mode =   false\r\n", "flight_mode =   false\r\nfont_size = \"huge\"\r\n"),
        withSet(ODD, "settings.font_size", "huge"));
    EXPECT_EQ(oddWith("# long\n", "# long\nbluetooth = \"not_supported\"\r\n"),
              withSet(ODD, "network.bluetooth", "not_supported"));
    EXPECT_EQ(std::string(ODD) + "\r\nserial = \"42\"", withSet(ODD, "device.serial", "42"));
}

TEST(DeviceTextTest, NewKeyIsIndentedLikeItsNeighbour)
{
    EXPECT_EQ("schema = 1\n[settings]\n\t language = 'a'\n\t sales_code = \"X\"\n",
              withSet("schema = 1\n[settings]\n\t language = 'a'\n", "settings.sales_code", "X"));
    EXPECT_EQ(
        "schema = 1\n[settings] # none yet\nsales_code = \"X\"\n\n[network]\n",
        withSet("schema = 1\n[settings] # none yet\n\n[network]\n", "settings.sales_code", "X"));
}

TEST(DeviceTextTest, NewSectionGoesToTheEndOfTheFile)
{
    EXPECT_EQ(std::string(ODD) + "\r\n\r\n[storage]\r\nblocks = 7",
              withSet(ODD, "storage.blocks", "7"));
    EXPECT_EQ("schema = 1\n\n[packages]\n\"org.example.app\" = \"1.0\"\n",
              withSet("schema = 1\n", "packages.org.example.app", "1.0"));
    EXPECT_EQ("schema = 1\n\n[[slot]]\nsim = \"absent\"\n",
              withSet("schema = 1\n", "slot[0].sim", "absent"));
}

TEST(DeviceTextTest, NextSlotGoesBehindTheLastOne)
{
    const std::string text = "schema = 1\n[[slot]]\nsim = \"pin\" # a\n\n[network]\n";
    EXPECT_EQ("schema = 1\n[[slot]]\nsim = \"pin\" # a\n\n[[slot]]\nroaming = true\n\n[network]\n",
              withSet(text, "slot[1].roaming", "true"));
    EXPECT_EQ("refused: slot[2].roaming cannot be set: the next one would be slot[1]",
              withSet(text, "slot[2].roaming", "true"));
    EXPECT_EQ("refused: slot[1].sim cannot be set: the first one is slot[0]",
              withSet("schema = 1\n", "slot[1].sim", "pin"));
}

TEST(DeviceTextTest, TablesInBracesStayInTheirLine)
{
    const std::string text = "schema = 1\nslot = [ {sim=\"pin\", mcc = '001'} , {} ] # two\n";
    EXPECT_EQ("schema = 1\nslot = [ {sim=\"puk\", mcc = '001'} , {} ] # two\n",
              withSet(text, "slot[0].sim", "puk"));
    EXPECT_EQ("schema = 1\nslot = [ {sim=\"pin\", mcc = '001', mnc = \"01\"} , {} ] # two\n",
              withSet(text, "slot[0].mnc", "01"));
    EXPECT_EQ("schema = 1\nslot = [ {sim=\"pin\", mcc = '001'} , { roaming = true } ] # two\n",
              withSet(text, "slot.1.roaming", "true"));
    EXPECT_EQ(
        "schema = 1\nslot = [ {sim=\"pin\", mcc = '001'} , {}, { sim = \"absent\" } ] # two\n",
        withSet(text, "slot[2].sim", "absent"));
    EXPECT_EQ("schema = 1\nslot = [ {sim=\"pin\"} , {} ] # two\n", without(text, "slot[0].mcc"));
    EXPECT_EQ("schema = 1\nslot = [ {mcc = '001'} , {} ] # two\n", without(text, "slot[0].sim"));
    EXPECT_EQ("schema = 1\nnetwork = {}\n",
              without("schema = 1\nnetwork = { wifi = \"connected\" }\n", "network.wifi"));
    EXPECT_EQ("schema = 1\nslot = [{ sim = \"pin\" }]\n",
              withSet("schema = 1\nslot = []\n", "slot[0].sim", "pin"));
}

TEST(DeviceTextTest, DottedKeysStayDotted)
{
    const std::string text = "schema = 1\n settings . language = 'a'\ndevice.serial = '1' # x\n";
    EXPECT_EQ("schema = 1\n settings . language = 'b'\ndevice.serial = '1' # x\n",
              withSet(text, "settings.language", "b"));
    EXPECT_EQ("schema = 1\n settings . language = 'a'\n settings . flight_mode = true\n"
              "device.serial = '1' # x\n",
              withSet(text, "settings.flight_mode", "true"));
    EXPECT_EQ("schema = 1\n settings . language = 'a'\n", without(text, "device.serial"));
}

TEST(DeviceTextTest, KeyGoesWithItsLineAndItsComment)
{
    EXPECT_EQ(oddWith("\tdevice_name   =\t'Küche'   # für \"alle\"\r\n", ""),
              without(ODD, "settings.device_name"));
    EXPECT_EQ(oddWith("wifi = \"\"\"\\\r\n   connected\"\"\" # long\n", ""),
              without(ODD, "network.wifi"));
    EXPECT_EQ(oddWith("\r\ntelephony\t=\ttrue", ""), without(ODD, "device.telephony"));
    EXPECT_EQ("refused: settings.sales_code cannot be removed: it is not there",
              without(ODD, "settings.sales_code"));
    EXPECT_EQ("refused: settings cannot be removed: it is a section", without(ODD, "settings"));
}

TEST(DeviceTextTest, ValueBecomesWhatItsKeyWants)
{
    const std::string text = "schema = 1\n[settings]\n";
    EXPECT_EQ(text + "font_size = 7\n", withSet(text, "settings.font_size", "7"));
    EXPECT_EQ(text + "device_name = \"7\"\n", withSet(text, "settings.device_name", "7"));
    EXPECT_EQ(text + "device_name = \"true\"\n", withSet(text, "settings.device_name", "true"));
    EXPECT_EQ(text + "utc_offset = -3600\n", withSet(text, "settings.utc_offset", "-3600"));
    EXPECT_EQ(text + "flight_mode = false\n", withSet(text, "settings.flight_mode", "false"));
    EXPECT_EQ("schema = 1\n\n[fault]\ntelephony_init = { error = \"empty\", call = 2 }\n",
              withSet("schema = 1\n", "fault.telephony_init", "{ error = \"empty\", call = 2 }"));
    EXPECT_EQ("schema = 1\n[fault]\ntel_init = { delay_ms = 5 , call = 3 }\n",
              withSet("schema = 1\n[fault]\ntel_init = { delay_ms = 5 , call = 2 }\n",
                      "fault.tel_init.call", "3"));
}

TEST(DeviceTextTest, ValueThatItsKeyDoesNotTakeIsRefused)
{
    const std::string text = "schema = 1\n[settings]\nflight_mode = true\n";
    EXPECT_EQ("refused: settings.flight_mode cannot be set: \"flight_mode\" must be true or false",
              withSet(text, "settings.flight_mode", "maybe"));
    EXPECT_THAT(withSet(text, "settings.fligth_mode", "true"),
                HasSubstr("did you mean \"flight_mode\"?"));
    EXPECT_THAT(withSet(text, "setings.flight_mode", "true"),
                HasSubstr("did you mean \"settings\"?"));
    EXPECT_THAT(withSet(text, "slot[0].imei", "12"), HasSubstr("14 to 16 digits"));
    EXPECT_THAT(withSet(text, "settings.device_name", std::string("a\0b", 3)),
                HasSubstr("must not hold a NUL"));
    EXPECT_EQ("refused: settings.device_name cannot be set: the value is no UTF-8",
              withSet(text, "settings.device_name", "\xFF"));
    EXPECT_THAT(withSet(text, "settings.device_name", std::string(2000, 'a')),
                HasSubstr("a line longer than"));
    EXPECT_THAT(withSet(text, "fault.telephony_init", "{ error = \"empty\" } # x"),
                HasSubstr("refused: "));
}

TEST(DeviceTextTest, AllChangesAreMadeOrNone)
{
    const std::string text = "schema = 1\n[[slot]]\nmnc = \"01\"\nmsin = \"0123456789\"\n";
    EXPECT_EQ("schema = 1\n[[slot]]\nmnc = \"001\"\nmsin = \"012345678\"\nmcc = \"001\"\n",
              changed(text, {{"slot[0].mnc", "001"}, // too long together with the old MSIN
                             {"slot[0].msin", "012345678"},
                             {"slot[0].mcc", "001"}}));
    EXPECT_THAT(changed(text, {{"slot[0].mcc", "001"}, {"slot[0].mnc", "1"}}),
                HasSubstr("refused: \"mnc\" must be 2 to 3 digits"));
}

TEST(DeviceTextTest, FileWithMistakesMayBeRepaired)
{
    const std::string text = "schema = 1\n[settings]\nflight_mode = \"on\"\nvolume = 3\n";
    EXPECT_EQ("schema = 1\n[settings]\nflight_mode = true\nvolume = 3\n",
              withSet(text, "settings.flight_mode", "true"));
    EXPECT_EQ("schema = 1\n[settings]\nflight_mode = \"on\"\n", without(text, "settings.volume"));
    EXPECT_THAT(withSet(text, "settings.data_roaming", "on"), HasSubstr("refused: "));
    EXPECT_EQ("refused: d.toml:2:2: a section header begins with a name",
              withSet("schema = 1\n[\n", "settings.language", "a"));
    EXPECT_EQ("schema = 1\n[device]\n", withSet("[device]\n", "schema", "1"));
}

TEST(DeviceTextTest, ValuesAreReadAsPlainText)
{
    EXPECT_EQ("Küche", valueOf(ODD, "settings.device_name"));
    EXPECT_EQ("false", valueOf(ODD, "settings.flight_mode"));
    EXPECT_EQ("connected", valueOf(ODD, "network.wifi"));
    EXPECT_EQ("1", valueOf(ODD, "schema"));
    EXPECT_EQ("none: d.toml has no settings.sales_code", valueOf(ODD, "settings.sales_code"));
    EXPECT_EQ("none: d.toml has no settings.fligth_mode; did you mean \"settings.flight_mode\"?",
              valueOf(ODD, "settings.fligth_mode"));
    EXPECT_EQ("none: d.toml has no slot[0].sim", valueOf(ODD, "slot[0].sim"));
    EXPECT_EQ("none: settings is a section", valueOf(ODD, "settings"));
    const std::string fault = "schema = 1\n[fault]\ntel_init = { delay_ms = 5 }\n";
    EXPECT_EQ("{ delay_ms = 5 }", valueOf(fault, "fault.tel_init"));
    EXPECT_EQ("5", valueOf(fault, "fault.tel_init.delay_ms"));
}

TEST(DeviceTextTest, EntriesStandInTheOrderOfTheText)
{
    const auto entries = port::devicefile::listEntries(ODD, FILE_NAME);
    ASSERT_TRUE(entries);
    std::vector<std::string> lines;
    for (const auto& entry : entries.value())
        lines.push_back(std::to_string(entry.line) + " " + entry.path());
    EXPECT_THAT(lines, ElementsAre("2 schema", "5 settings.device_name", "6 settings.language",
                                   "7 settings.flight_mode", "11 network.wifi",
                                   "15 device.model_name", "16 device.telephony"));
}

TEST(DevicePathTest, PathsAreWrittenInSeveralWays)
{
    EXPECT_THAT(pathOf("settings.flight_mode"), ElementsAre("settings", "flight_mode"));
    EXPECT_THAT(pathOf("slot[0].sim"), ElementsAre("slot", "0", "sim"));
    EXPECT_THAT(pathOf("slot.12.sim"), ElementsAre("slot", "12", "sim"));
    EXPECT_THAT(pathOf("packages.\"org.example[1].app=\""),
                ElementsAre("packages", "org.example[1].app="));
    EXPECT_THAT(pathOf("packages.org.example.app"), ElementsAre("packages", "org.example.app"));
    EXPECT_THAT(pathOf("schema"), ElementsAre("schema"));
}

TEST(DevicePathTest, OtherTextsAreNoPaths)
{
    for (const char* const text :
         {"", ".", "a.", ".a", "a b", "slot[0", "slot[x].sim", "a=1", "a = 0 #", "a\nb", "a=0\nb",
          "a = 0 } #", "packages.\"half", "[settings]", "#", "a..b"})
        EXPECT_THAT(pathOf(text), ElementsAre()) << text;
    EXPECT_THAT(pathOf(std::string(5000, 'a')), ElementsAre());
}

} // namespace
