// SPDX-License-Identifier: Apache-2.0
// The display language.
#include <limits>

#include "support/PlatformTest.h"

using namespace fake;
using testing::IsEmpty;

namespace {

const std::string READ = "system_settings_get_value_string(13)";
const std::string LANGUAGE_METHOD = "GetDeviceLanguageCode";
const char* const UNTOUCHED = "untouched";

// The language code, or UNTOUCHED; everything else must be freed again.
std::string languageCode(bool convertToISO639, int expectedResult)
{
    char preset[] = "untouched";
    char* slot = preset;
    EXPECT_EQ(coreSystem().GetDeviceLanguageCode(&slot, convertToISO639), expectedResult);
    const std::string code(slot);
    if (slot != preset) {
        EXPECT_EQ(ledger().live(), Texts{"copy: " + code});
        std::free(slot);
    }
    EXPECT_THAT(ledger().live(), IsEmpty());
    return code;
}

std::string languageCodeOf(const std::string& setting, bool convertToISO639)
{
    platform().answer(READ, 0, setting);
    return languageCode(convertToISO639, 0);
}

// The lines up to the language part; the same in all cases.
Texts readingTrace(int result, int position)
{
    return {
        CORE_SYSTEM.debug(LANGUAGE_METHOD, "CoreSystem::GetDeviceLanguageCode"),
        READ,
        CORE_SYSTEM.debug(LANGUAGE_METHOD, "GetDeviceLanguageCode ret : " + std::to_string(result)),
        CORE_SYSTEM.debug("GetTagStartPosition", "CoreSystem::GetTagStartPosition"),
        CORE_SYSTEM.debug("GetTagStartPosition", "[TAG: _] tag pos " + std::to_string(position)),
        CORE_SYSTEM.debug("GetValueFromPosition", "CoreSystem::GetValueFromPosition")};
}

Texts capital(const std::string& text)
{
    return {
        CORE_SYSTEM.debug("GetISO639LangCodeFromDeviceLang", "success to get capital : " + text)};
}

Texts converted(const std::string& text, const std::string& code)
{
    return capital(text) +
           Texts{CORE_SYSTEM.debug("GetISO639LangCodeFromDeviceLang",
                                   "success to get ISO639Lang : " + code),
                 CORE_SYSTEM.debug(LANGUAGE_METHOD,
                                   "GetDeviceLanguageCode[convertToISO639] : " + code + " ")};
}

Texts notConverted(const std::string& text)
{
    return {CORE_SYSTEM.debug(LANGUAGE_METHOD, "GetDeviceLanguageCode[notconvert] : " + text)};
}

// An empty setting stands for a read that gives nothing.
LoggedCall call(const std::string& name, int result, const std::string& setting, bool convert,
                const Texts& trace)
{
    return {name,
            [=] {
                platform().answer(READ, result, setting.empty() ? std::any() : std::any(setting));
                languageCode(convert, result);
            },
            trace};
}

const LoggedCall LANGUAGE_CALLS[] = {
    call("LanguageAsItIs", 0, "en_US.UTF-8", false, readingTrace(0, 2) + notConverted("EN")),
    call("LanguageConverted", 0, "ko_KR.UTF-8", true, readingTrace(0, 2) + converted("KO", "kor")),
    call("LanguageNotInTable", 0, "de_DE.UTF-8", true, readingTrace(0, 2) + capital("DE")),
    call("LanguageWithoutSeparator", 0, "C", false, readingTrace(0, -1) + notConverted("C")),
    call("LanguageWithoutSeparatorConverted", 0, "C", true, readingTrace(0, -1) + capital("C")),
    call("LanguageEmpty", 0, "_x", false, readingTrace(0, 0) + notConverted("")),
    call("LanguageEmptyConverted", 0, "_x", true, readingTrace(0, 0) + capital("")),
    call("LanguageReadFailed", -5, "", false, readingTrace(-5, 2) + notConverted("EN")),
    call("LanguageReadFailedConverted", -13, "", true,
         readingTrace(-13, 2) + converted("EN", "eng")),
    call("LanguageReadGaveNull", 0, "", false, readingTrace(0, 2) + notConverted("EN")),
};

LOGGED_CALLS(Language, LANGUAGE_CALLS);

class LanguageTest : public PlatformTest {};

TEST_F(LanguageTest, LanguagePartIsUpperCasedOrConverted)
{
    const struct {
        std::string setting;
        bool convert;
        std::string code;
    } rows[] = {
        {"azAZ_x", false, "AZAZ"},
        {"a_b_c", false, "A"},
        {"LG_x", true, "lug"},
        {"ie", true, "ine"},
        // Without the separator all of it is the language, and before it is what begins with it.
        {"c.utf-8", false, "C.UTF-8"},
        {"", false, ""},
        {"", true, UNTOUCHED},
        {"_", false, ""},
    };
    for (const auto& row : rows)
        EXPECT_EQ(languageCodeOf(row.setting, row.convert), row.code) << row.setting;
}

TEST_F(LanguageTest, LanguageThatTheTableLacksLeavesTheSlot)
{
    for (const std::string setting : {"de_DE.UTF-8", "fr_FR", "zh_CN", "C", "POSIX", "_x", "eng_GB",
                                      "en.UTF-8", " en_US", "e_n", "\xff_x"})
        EXPECT_EQ(languageCodeOf(setting, true), UNTOUCHED) << setting;
}

TEST_F(LanguageTest, OnlyAsciiLowerCaseLettersChange)
{
    for (int byte = 1; byte < 256; ++byte) {
        const char character = static_cast<char>(byte);
        if (character == '_')
            continue;
        const bool lowerCase = byte >= 97 && byte <= 122;
        const std::string expected(1, lowerCase ? static_cast<char>(byte - 32) : character);
        EXPECT_EQ(languageCodeOf(std::string(1, character) + "_x", false), expected) << byte;
    }
}

TEST_F(LanguageTest, RemainsOfFailedReadAreNeitherUsedNorFreed)
{
    char remains[] = "ko_KR";
    platform().answer(READ, -5, static_cast<char*>(remains));
    EXPECT_EQ(languageCode(false, -5), "EN");
    EXPECT_STREQ(remains, "ko_KR");
}

TEST_F(LanguageTest, HugeSettingIsHandled)
{
    const std::string huge(10 << 20, 'x');
    platform().debugMode = 1;
    EXPECT_TRUE(languageCodeOf(huge, false) == std::string(huge.size(), 'X'));
    EXPECT_TRUE(languageCodeOf("en_" + huge, false) == "EN");
    EXPECT_EQ(languageCodeOf(huge, true), UNTOUCHED);
}

TEST_F(LanguageTest, FailedCopyGivesNull)
{
    for (const bool convert : {false, true}) {
        platform().answer(READ, 0, std::string("en_US"));
        const FailingAllocation failure(Allocation::STRDUP);
        char* slot = nullptr;
        EXPECT_EQ(system.GetDeviceLanguageCode(&slot, convert), 0);
        EXPECT_EQ(slot, nullptr);
        EXPECT_TRUE(failure.happened());
        EXPECT_THAT(ledger().live(), IsEmpty());
    }
}

// Lets each allocation of the call fail in turn: none of them may come out as an exception, and
// whatever happens the platform's string is freed.
TEST_F(LanguageTest, NoAllocationFailureLeavesTheMethod)
{
    const std::string setting = std::string(100, 'x') + "_X";
    for (const int mode : {0, 1}) {
        platform().debugMode = mode;
        bool happened = true;
        int failures = 0;
        for (; happened && failures < 100; ++failures) {
            platform().answer(READ, 0, setting);
            char preset = 'p';
            char* slot = &preset;
            {
                const FailingAllocation failure(Allocation::THROWING, failures);
                EXPECT_NO_THROW(EXPECT_EQ(system.GetDeviceLanguageCode(&slot, false), 0));
                happened = failure.happened();
            }
            // With lines, it may be a line that is lost.
            EXPECT_TRUE(happened ? mode == 1 || slot == &preset : slot == std::string(100, 'X'));
            if (slot != &preset)
                std::free(slot);
            EXPECT_THAT(ledger().live(), IsEmpty());
        }
        EXPECT_GT(failures, 2) << "nothing was allocated";
    }
}

TEST_F(LanguageTest, TagPositionIsThatOfTheFirstOccurrence)
{
    const auto positionOf = &CoreSystemInternals::tagStartPosition;
    EXPECT_EQ(positionOf("en_US", "_"), 2);
    EXPECT_EQ(positionOf("a__b", "__"), 1);
    EXPECT_EQ(positionOf("abc", "_"), -1);
    EXPECT_EQ(positionOf("", "_"), -1);
    platform().debugMode = 1;
    EXPECT_EQ(positionOf("a<b>", "<b>"), 1);
    EXPECT_EQ(platform().trace().back(),
              CORE_SYSTEM.debug("GetTagStartPosition", "[TAG: <b>] tag pos 1"));
}

TEST_F(LanguageTest, ValueReachesFromStartToEndInclusive)
{
    const int least = std::numeric_limits<int>::min();
    const int most = std::numeric_limits<int>::max();
    const struct {
        std::string text;
        int start;
        int end;
        std::string value;
    } rows[] = {
        {"abcdef", 0, 1, "ab"},
        {"abcdef", 2, 2, "c"},
        {"abcdef", 3, 2, ""},
        // A negative length means the whole rest.
        {"abcdef", 0, -2, "abcdef"},
        {"abcdef", 1, least, "bcdef"},
        // The value ends with the text.
        {"abcdef", 4, most, "ef"},
        {"abcdef", 6, 8, ""},
        // A start outside the text.
        {"abcdef", 7, 8, ""},
        {"abcdef", -1, 3, ""},
        {"abcdef", least, most, ""},
    };
    for (const auto& [text, start, end, value] : rows)
        EXPECT_EQ(CoreSystemInternals::valueFromPosition(text, start, end), value)
            << text << ' ' << start << ' ' << end;
}

TEST_F(LanguageTest, ConversionIsExactAndAnswersWithTheTablesOwnText)
{
    const auto convert = &CoreSystemInternals::iso639;
    const char* const first = convert("EN", UNTOUCHED);
    EXPECT_STREQ(first, "eng");
    EXPECT_EQ(convert("EN", nullptr), first);
    EXPECT_THAT(ledger().live(), IsEmpty());
    for (const std::string unknown : {"en", "EN ", "E", "ENG", "", "DE"})
        EXPECT_EQ(convert(unknown, UNTOUCHED), nullptr) << unknown;
}

} // namespace
