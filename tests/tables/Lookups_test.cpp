// SPDX-License-Identifier: Apache-2.0
// Every lookup, over every key there is and many that there are not, against a plain scan of the
// checked-in rows.
#include <set>

#include "Csv.h"
#include "support/PlatformTest.h"

using namespace fake;

namespace {

const std::string NONE = "none";

struct Lookup {
    std::string name;
    void (SimManager::*search)(const char* key, char** slot);
    void (CoreSystem::*question)(const char* key, char** slot);
    const Rows& (*table)();
    std::size_t key;
    std::size_t value;
};

std::ostream& operator<<(std::ostream& out, const Lookup& lookup)
{
    return out << lookup.name;
}

#define LOOKUP(name) #name, &SimManager::name, &CoreSystem::name
const Lookup LOOKUPS[] = {
    {LOOKUP(GetCountryCodeFromMcc), mccCountries, 0, 1},
    {LOOKUP(GetCountryNameFromMcc), mccCountries, 0, 2},
    {LOOKUP(GetMccFromCountryCode), mccCountries, 1, 0},
    {LOOKUP(GetMccFromServiceCountryCode), serviceCountries, 1, 0},
    {LOOKUP(GetServiceCountryCodeFromMcc), serviceCountries, 0, 1},
    {LOOKUP(GetMccFromCountryCallingCode), callingCodes, 1, 0},
    {LOOKUP(GetCountryCallingCodeFromMcc), callingCodes, 0, 1},
    {LOOKUP(GetAlpha3CountryCodeFromMcc), alpha3Countries, 0, 1},
};
#undef LOOKUP

// All cells of all tables, all numbers of up to three digits with and without leading zeros, and
// all pairs of letters in both cases.
std::set<std::string> makeKeys()
{
    std::set<std::string> keys;
    for (const auto table : {mccCountries, serviceCountries, callingCodes, alpha3Countries,
                             moSupportMccs, languageCodes})
        for (const Row& row : table())
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

template <class Singleton>
std::string answer(Singleton& asked, void (Singleton::*question)(const char*, char**),
                   const std::string& key)
{
    char* slot = nullptr;
    (asked.*question)(key.c_str(), &slot);
    const std::string text = slot != nullptr ? slot : NONE;
    std::free(slot);
    return text;
}

std::string firstOf(const std::vector<std::string>& cells)
{
    return cells.empty() ? NONE : cells.front();
}

std::string lastOf(const std::vector<std::string>& cells)
{
    return cells.empty() ? NONE : cells.back();
}

class LookupTest : public PlatformTest, public testing::WithParamInterface<Lookup> {
protected:
    const Lookup& lookup = GetParam();

    std::string expected(const std::string& key)
    {
        return firstOf(cellsOf(lookup.table(), lookup.key, key, lookup.value));
    }
};

INSTANTIATE_TEST_SUITE_P(Every, LookupTest, testing::ValuesIn(LOOKUPS), rowName<Lookup>);

TEST_P(LookupTest, SearchAnswersAsPlainScanDoes)
{
    for (const std::string& key : keys()) {
        ASSERT_EQ(answer(sim, lookup.search, key), expected(key)) << key;
        platform().forgetEvents();
    }
}

TEST_P(LookupTest, FacadeAnswersAsPlainScanDoes)
{
    for (const std::string& key : keys()) {
        ASSERT_EQ(answer(system, lookup.question, key), expected(key)) << key;
        platform().forgetEvents();
    }
}

class OtherLookupTest : public PlatformTest {
protected:
    static std::string mccOf(const std::string& code)
    {
        return firstOf(cellsOf(callingCodes(), 1, code, 0));
    }
};

TEST_F(OtherLookupTest, KeysCoverWhatTheyShould)
{
    EXPECT_GT(keys().size(), 1000u + 2 * 676u + 236u);
    for (const std::string key : {"000", "999", "aa", "zz", "AA", "ZZ", "0", "en_GB", "Zimbabwe"})
        EXPECT_EQ(keys().count(key), 1u) << key;
}

TEST_F(OtherLookupTest, NameOfCallingCodeIsThatOfItsFirstMcc)
{
    for (const std::string& key : keys()) {
        ASSERT_EQ(answer(system, &CoreSystem::GetCountryNameFromCountryCallingCode, key),
                  firstOf(cellsOf(mccCountries(), 0, mccOf(key), 2)))
            << key;
        platform().forgetEvents();
    }
}

TEST_F(OtherLookupTest, Alpha2OfCallingCodeIsThatOfTheLastRow)
{
    for (const std::string& key : keys()) {
        char* slot = nullptr;
        system.GetCountryNameAlpha2FromCountryCallingCode(key.c_str(), &slot);
        const std::string answer = slot != nullptr ? slot : NONE;
        ASSERT_EQ(answer, lastOf(cellsOf(mccCountries(), 0, mccOf(key), 1))) << key;
        platform().forgetEvents();
    }
}

TEST_F(OtherLookupTest, ValidMccsAreThoseOfTheTable)
{
    for (const std::string& key : keys()) {
        const bool valid = !cellsOf(mccCountries(), 0, key, 0).empty();
        ASSERT_EQ(sim.IsValidMcc(key.c_str()), valid) << key;
        ASSERT_EQ(system.IsValidMcc(key.c_str()), valid) << key;
        platform().forgetEvents();
    }
}

TEST_F(OtherLookupTest, EveryKeySupportsMo)
{
    for (const std::string& key : keys()) {
        ASSERT_TRUE(sim.IsMoSupportMcc(key.c_str())) << key;
        ASSERT_TRUE(system.IsMoSupportMcc(key.c_str())) << key;
        platform().forgetEvents();
    }
}

TEST_F(OtherLookupTest, LanguageIsConvertedAsPlainScanDoes)
{
    for (const std::string& key : keys()) {
        const char* const code = CoreSystemInternals::iso639(key, nullptr);
        ASSERT_EQ(code != nullptr ? code : NONE, firstOf(cellsOf(languageCodes(), 1, key, 0)))
            << key;
    }
}

} // namespace
