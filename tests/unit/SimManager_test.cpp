// SPDX-License-Identifier: Apache-2.0
// The country searches.
#include "Converters.h"

using namespace fake;
using testing::IsEmpty;
using testing::StrEq;

namespace {

// The slot's content after a search that begins with `preset` in it.
char* search(const Converter& row, const std::string& key, char* preset = nullptr)
{
    char* slot = preset;
    (simManager().*row.search)(key.c_str(), &slot);
    return slot;
}

LoggedCall predicateCall(const std::string& name, bool (SimManager::*ask)(const char*),
                         const std::string& key, bool answer, const Texts& trace)
{
    return {name, [=] { EXPECT_EQ((simManager().*ask)(key.c_str()), answer); }, trace};
}

std::vector<LoggedCall> converterCalls()
{
    std::vector<LoggedCall> calls;
    for (const Converter& row : converters()) {
        calls.push_back({row.name + "Found", [row] { std::free(search(row, row.key)); },
                         foundTrace(row, row.key, row.value)});
        calls.push_back({row.name + "Missed", [row] { EXPECT_EQ(search(row, "KR 9"), nullptr); },
                         missedTrace(row, "KR 9")});
        calls.push_back({row.name + "EmptyKey", [row] { EXPECT_EQ(search(row, ""), nullptr); },
                         missedTrace(row, "")});
    }
    return calls;
}

const LoggedCall PREDICATE_CALLS[] = {
    predicateCall("ValidMcc", &SimManager::IsValidMcc, "412", true,
                  {SIM_MANAGER.debug("IsValidMcc", "IsValidMcc [mcc : 412]"),
                   SIM_MANAGER.debug("IsValidMcc", "mcc is valid")}),
    predicateCall("InvalidMcc", &SimManager::IsValidMcc, "4120", false,
                  {SIM_MANAGER.debug("IsValidMcc", "IsValidMcc [mcc : 4120]"),
                   SIM_MANAGER.error("IsValidMcc", "mcc is invalid")}),
    predicateCall("EmptyMcc", &SimManager::IsValidMcc, "", false,
                  {SIM_MANAGER.debug("IsValidMcc", "IsValidMcc [mcc : ]"),
                   SIM_MANAGER.error("IsValidMcc", "mcc is invalid")}),
    predicateCall("MoSupport", &SimManager::IsMoSupportMcc, "505", true,
                  {SIM_MANAGER.debug("IsMoSupportMcc", "IsMoSupportMcc [mcc : 505]"),
                   SIM_MANAGER.debug("IsMoSupportMcc", "IsMOSupportMcc? : true")}),
};

INSTANTIATE_TEST_SUITE_P(SimConverters, LoggedCallTest, testing::ValuesIn(converterCalls()),
                         rowName<LoggedCall>);
INSTANTIATE_TEST_SUITE_P(SimPredicates, LoggedCallTest, testing::ValuesIn(PREDICATE_CALLS),
                         rowName<LoggedCall>);

class SimConverterTest : public PlatformTest, public testing::WithParamInterface<Converter> {
protected:
    const Converter& row = GetParam();
    char preset = 'p';
};

INSTANTIATE_TEST_SUITE_P(Every, SimConverterTest, testing::ValuesIn(converters()),
                         rowName<Converter>);

TEST_P(SimConverterTest, AnswerIsCopyThatTheCallerFrees)
{
    char* const value = search(row, row.key, &preset);
    EXPECT_THAT(value, StrEq(row.value));
    EXPECT_EQ(ledger().live(), Texts{"copy: " + row.value});
    std::free(value);
    EXPECT_THAT(ledger().live(), IsEmpty());
}

TEST_P(SimConverterTest, UnknownKeysGiveNull)
{
    for (const int mode : {0, 1}) {
        platform().debugMode = mode;
        for (const std::string& key : strangeKeys(row.key))
            EXPECT_EQ(search(row, key, &preset), nullptr) << key.substr(0, 100);
    }
    EXPECT_THAT(ledger().live(), IsEmpty());
}

TEST_P(SimConverterTest, EmptyKeyGivesNull)
{
    EXPECT_EQ(search(row, "", &preset), nullptr);
}

TEST_P(SimConverterTest, FailedCopyGivesNull)
{
    platform().debugMode = 1;
    const FailingAllocation failure(Allocation::STRDUP);
    EXPECT_EQ(search(row, row.key, &preset), nullptr);
    EXPECT_TRUE(failure.happened());
    EXPECT_EQ(platform().trace(), foundTrace(row, row.key, "(null)"));
}

class SimManagerTest : public PlatformTest {
protected:
    // The answer of a converter, "null" for none.
    static std::string answer(void (SimManager::*question)(const char*, char**), const char* key)
    {
        char* slot = nullptr;
        (::simManager().*question)(key, &slot);
        const std::string text = slot != nullptr ? slot : "null";
        std::free(slot);
        return text;
    }
};

TEST_F(SimManagerTest, FirstOfSharedMccRowsAnswers)
{
    EXPECT_EQ(answer(&SimManager::GetCountryCodeFromMcc, "340"), "gp");
    EXPECT_EQ(answer(&SimManager::GetCountryNameFromMcc, "340"), "Guadeloupe (France)");
    EXPECT_EQ(answer(&SimManager::GetCountryCallingCodeFromMcc, "340"), "590");
    EXPECT_EQ(answer(&SimManager::GetAlpha3CountryCodeFromMcc, "340"), "GLP");
}

TEST_F(SimManagerTest, FirstOfSharedAlpha2RowsAnswers)
{
    const std::map<const char*, std::string> firsts = {{"cn", "460"}, {"in", "404"}, {"jp", "441"},
                                                       {"ae", "424"}, {"gb", "234"}, {"us", "310"},
                                                       {"kh", "456"}};
    for (const auto& [key, mcc] : firsts)
        EXPECT_EQ(answer(&SimManager::GetMccFromCountryCode, key), mcc) << key;
}

TEST_F(SimManagerTest, FirstOfSharedCallingCodeRowsAnswers)
{
    const std::map<const char*, std::string> firsts = {
        {"1", "544"},   {"7", "401"},  {"86", "460"},  {"81", "441"}, {"91", "404"},
        {"971", "424"}, {"44", "234"}, {"590", "340"}, {"596", "340"}};
    for (const auto& [key, mcc] : firsts)
        EXPECT_EQ(answer(&SimManager::GetMccFromCountryCallingCode, key), mcc) << key;
}

TEST_F(SimManagerTest, FirstOfSharedLocaleRowsAnswers)
{
    const std::map<const char*, std::string> firsts = {{"ja_JP", "440"}, {"hi_IN", "404"},
                                                       {"en_US", "310"}, {"en_GB", "234"},
                                                       {"zh_CN", "460"}, {"en_AE", "424"}};
    for (const auto& [key, mcc] : firsts)
        EXPECT_EQ(answer(&SimManager::GetMccFromServiceCountryCode, key), mcc) << key;
}

TEST_F(SimManagerTest, KeysAreNeitherTrimmedNorFolded)
{
    for (const char* key : {"KH", "CN", "Kr", " kr", "kr "})
        EXPECT_EQ(answer(&SimManager::GetMccFromCountryCode, key), "null") << key;
    for (const char* key : {" 456", "456 ", "4560", "0456", "45"})
        EXPECT_EQ(answer(&SimManager::GetCountryCodeFromMcc, key), "null") << key;
    for (const char* key : {"+1", "001", "01", "1 "})
        EXPECT_EQ(answer(&SimManager::GetMccFromCountryCallingCode, key), "null") << key;
    for (const char* key : {"en_gb", "EN_GB", "en-GB", "en", "en_GB.UTF-8"})
        EXPECT_EQ(answer(&SimManager::GetMccFromServiceCountryCode, key), "null") << key;
}

TEST_F(SimManagerTest, MccsOfOneTableOnlyAreInvalid)
{
    EXPECT_EQ(answer(&SimManager::GetServiceCountryCodeFromMcc, "406"), "hi_IN");
    EXPECT_EQ(answer(&SimManager::GetAlpha3CountryCodeFromMcc, "659"), "SSD");
    EXPECT_EQ(answer(&SimManager::GetCountryCodeFromMcc, "659"), "null");
    EXPECT_FALSE(sim.IsValidMcc("406"));
    EXPECT_FALSE(sim.IsValidMcc("659"));
}

TEST_F(SimManagerTest, ValidityIsMembershipInTheTable)
{
    EXPECT_TRUE(sim.IsValidMcc("412"));
    EXPECT_TRUE(sim.IsValidMcc("648"));
    for (const std::string& key : strangeKeys("412"))
        EXPECT_FALSE(sim.IsValidMcc(key.c_str())) << key.substr(0, 100);
}

TEST_F(SimManagerTest, EveryMccSupportsMo)
{
    EXPECT_TRUE(sim.IsMoSupportMcc("505"));
    EXPECT_TRUE(sim.IsMoSupportMcc("232"));
    EXPECT_TRUE(sim.IsMoSupportMcc("999"));
    EXPECT_TRUE(sim.IsMoSupportMcc(""));
    for (const std::string& key : strangeKeys("505"))
        EXPECT_TRUE(sim.IsMoSupportMcc(key.c_str()));
}

} // namespace
