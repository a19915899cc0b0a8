// SPDX-License-Identifier: Apache-2.0
// Every lookup, over every key there is and many that there are not, against a plain scan of the
// checked-in rows.
#include <map>
#include <set>

#include "Csv.h"
#include "support/PlatformTest.h"

using namespace fake;

namespace {

const std::string NONE = "none";
typedef std::vector<std::string> Cells;

// The answer of a search that gives a text, NONE of one that gives none.
typedef std::function<std::string(const std::string& key)> Answer;

struct Lookup {
    std::string name;
    Answer answer;
    Answer expected;
};

// All cells of all tables, all numbers of up to three digits with and without leading zeros, and
// all pairs of letters in both cases.
std::set<std::string> makeKeys()
{
    std::set<std::string> keys;
    for (const Rows* table : {&MCC_COUNTRIES, &SERVICE_COUNTRIES, &CALLING_CODES, &ALPHA3_COUNTRIES,
                              &MO_SUPPORT_MCCS, &LANGUAGE_CODES})
        for (const Row& row : *table)
            keys.insert(row.begin(), row.end());
    for (int number = 0; number < 1000; ++number) {
        const std::string digits = std::to_string(number);
        keys.insert({digits, std::string(3 - digits.size(), '0') + digits});
    }
    for (const char base : {'a', 'A'})
        for (int pair = 0; pair < 26 * 26; ++pair)
            keys.insert({static_cast<char>(base + pair / 26), static_cast<char>(base + pair % 26)});
    return keys;
}

const std::set<std::string>& keys()
{
    static const std::set<std::string> all = makeKeys();
    return all;
}

// The searches free what they give but for the one that gives the table's own text.
template <class Singleton>
Answer textOf(Singleton& (*asked)(), void (Singleton::*question)(const char*, char**),
              bool isCopy = true)
{
    return [=](const std::string& key) {
        char* slot = nullptr;
        (asked().*question)(key.c_str(), &slot);
        const std::string text = slot != nullptr ? slot : NONE;
        if (isCopy)
            std::free(slot);
        return text;
    };
}

std::string firstOf(const Cells& cells)
{
    return cells.empty() ? NONE : cells.front();
}

Answer firstOf(const Rows& rows, std::size_t key, std::size_t value)
{
    return [&rows, key, value](const std::string& text) {
        return firstOf(cellsOf(rows, key, text, value));
    };
}

std::string mccOfCallingCode(const std::string& code)
{
    return firstOf(cellsOf(CALLING_CODES, 1, code, 0));
}

std::string yesOrNo(bool answer)
{
    return answer ? "yes" : "no";
}

std::vector<Lookup> lookups()
{
    std::vector<Lookup> all;
#define LOOKUP(name, ...)                                                                \
    all.push_back({#name, textOf(simManager, &SimManager::name), firstOf(__VA_ARGS__)}); \
    all.push_back({"CoreSystem" #name, textOf(coreSystem, &CoreSystem::name), firstOf(__VA_ARGS__)})
    LOOKUP(GetCountryCodeFromMcc, MCC_COUNTRIES, 0, 1);
    LOOKUP(GetCountryNameFromMcc, MCC_COUNTRIES, 0, 2);
    LOOKUP(GetMccFromCountryCode, MCC_COUNTRIES, 1, 0);
    LOOKUP(GetMccFromServiceCountryCode, SERVICE_COUNTRIES, 1, 0);
    LOOKUP(GetServiceCountryCodeFromMcc, SERVICE_COUNTRIES, 0, 1);
    LOOKUP(GetMccFromCountryCallingCode, CALLING_CODES, 1, 0);
    LOOKUP(GetCountryCallingCodeFromMcc, CALLING_CODES, 0, 1);
    LOOKUP(GetAlpha3CountryCodeFromMcc, ALPHA3_COUNTRIES, 0, 1);
#undef LOOKUP
    const auto isMcc = [](const std::string& key) {
        return yesOrNo(!cellsOf(MCC_COUNTRIES, 0, key, 0).empty());
    };
    const auto yes = [](const std::string&) { return "yes"; };
    const std::vector<Lookup> others = {
        {"NameOfCallingCodeIsThatOfItsFirstMcc",
         textOf(coreSystem, &CoreSystem::GetCountryNameFromCountryCallingCode),
         [](const std::string& key) {
             return firstOf(cellsOf(MCC_COUNTRIES, 0, mccOfCallingCode(key), 2));
         }},
        {"Alpha2OfCallingCodeIsThatOfTheLastRow",
         textOf(coreSystem, &CoreSystem::GetCountryNameAlpha2FromCountryCallingCode, false),
         [](const std::string& key) {
             const Cells cells = cellsOf(MCC_COUNTRIES, 0, mccOfCallingCode(key), 1);
             return cells.empty() ? NONE : cells.back();
         }},
        {"IsValidMcc",
         [](const auto& key) { return yesOrNo(simManager().IsValidMcc(key.c_str())); }, isMcc},
        {"CoreSystemIsValidMcc",
         [](const auto& key) { return yesOrNo(coreSystem().IsValidMcc(key.c_str())); }, isMcc},
        {"IsMoSupportMcc",
         [](const auto& key) { return yesOrNo(simManager().IsMoSupportMcc(key.c_str())); }, yes},
        {"CoreSystemIsMoSupportMcc",
         [](const auto& key) { return yesOrNo(coreSystem().IsMoSupportMcc(key.c_str())); }, yes},
        {"GetISO639LangCodeFromDeviceLang",
         [](const std::string& key) {
             const char* const code = CoreSystemInternals::iso639(key, nullptr);
             return code != nullptr ? code : NONE;
         },
         firstOf(LANGUAGE_CODES, 1, 0)},
    };
    all.insert(all.end(), others.begin(), others.end());
    return all;
}

class LookupTest : public PlatformTest {};

TEST_F(LookupTest, EveryKeyIsAnsweredAsPlainScanDoes)
{
    for (const Lookup& lookup : lookups())
        for (const std::string& key : keys()) {
            ASSERT_EQ(lookup.answer(key), lookup.expected(key)) << lookup.name << ' ' << key;
            platform().forgetEvents();
        }
}

// Callers rely on which of several rows answers, and on what the tables lack.
TEST_F(LookupTest, AnswersThatMustStay)
{
    const char* const name = "NameOfCallingCodeIsThatOfItsFirstMcc";
    const char* const alpha2 = "Alpha2OfCallingCodeIsThatOfTheLastRow";
    const Row rows[] = {
        {"GetMccFromCountryCode", "kh", "456"},
        {"GetMccFromCountryCode", "KH", NONE},
        {"GetMccFromCountryCode", "CN", NONE},
        {"GetMccFromCountryCode", "", NONE},
        {"GetMccFromCountryCallingCode", "1", "544"},
        {"GetMccFromCountryCallingCode", "7", "401"},
        {"GetMccFromCountryCallingCode", "590", "340"},
        {"GetMccFromCountryCallingCode", "596", "340"},
        {"GetMccFromCountryCallingCode", "+1", NONE},
        {"GetMccFromCountryCallingCode", "001", NONE},
        {"GetCountryCodeFromMcc", "340", "gp"},
        {"GetCountryNameFromMcc", "340", "Guadeloupe (France)"},
        {name, "596", "Guadeloupe (France)"},
        {alpha2, "596", "mq"},
        {alpha2, "590", "mq"},
        {alpha2, "1", "as"},
        {"GetAlpha3CountryCodeFromMcc", "659", "SSD"},
        {"GetCountryCodeFromMcc", "659", NONE},
        {"GetCountryNameFromMcc", "659", NONE},
        {"GetCountryCallingCodeFromMcc", "659", NONE},
        {"GetServiceCountryCodeFromMcc", "659", NONE},
        {"GetServiceCountryCodeFromMcc", "406", "hi_IN"},
        {"GetCountryCodeFromMcc", "406", NONE},
        {"IsValidMcc", "406", "no"},
        {"IsValidMcc", "412", "yes"},
        {"IsValidMcc", "4120", "no"},
        {"IsValidMcc", "", "no"},
        {"IsMoSupportMcc", "505", "yes"},
        {"IsMoSupportMcc", "999", "yes"},
        {"IsMoSupportMcc", "", "yes"},
        {"CoreSystemIsMoSupportMcc", "123", "yes"},
        {"CoreSystemIsMoSupportMcc", "", "no"},
        {"GetISO639LangCodeFromDeviceLang", "KO", "kor"},
        {"GetISO639LangCodeFromDeviceLang", "DE", NONE},
    };
    std::map<std::string, Answer> answers;
    for (const Lookup& lookup : lookups())
        answers[lookup.name] = lookup.answer;
    for (const Row& row : rows)
        EXPECT_EQ(answers.at(row[0])(row[1]), row[2]) << row[0] << ' ' << row[1];
}

} // namespace
