// SPDX-License-Identifier: Apache-2.0
// The country questions of the facade.
#include <atomic>
#include <stdexcept>
#include <thread>

#include "Converters.h"

using namespace fake;
using testing::IsEmpty;
using testing::StrEq;

namespace {

typedef void (CoreSystem::*Question)(const char* key, char** slot);

// The slot's content after a question that begins with `preset` in it.
char* ask(Question question, const char* key, char* preset = nullptr)
{
    char* slot = preset;
    (coreSystem().*question)(key, &slot);
    return slot;
}

Texts entryLine(const std::string& method)
{
    return {CORE_SYSTEM.debug(method, "CoreSystem::" + method)};
}

Texts emptyKeyError(const std::string& method, const std::string& keyName)
{
    return {CORE_SYSTEM.error(method, keyName + " is empty. " + method + " finish.")};
}

// A question that is refused: the slot stays.
LoggedCall refusedCall(const std::string& name, Question question, const char* key,
                       const Texts& trace)
{
    return {name,
            [=] {
                char preset = 'p';
                EXPECT_EQ(ask(question, key, &preset), &preset);
            },
            trace};
}

std::vector<LoggedCall> converterCalls()
{
    std::vector<LoggedCall> calls;
    for (const Converter& row : converters()) {
        const Texts entry = entryLine(row.name);
        const auto result = [&row](const std::string& value) {
            return Texts{CORE_SYSTEM.debug(row.name, row.result + value)};
        };
        const Texts refusal = entry + emptyKeyError(row.name, row.keyName);
        calls.push_back({row.name + "Found",
                         [row] { std::free(ask(row.question, row.key.c_str())); },
                         entry + SIM_MANAGER.access() + foundTrace(row, row.key, row.value) +
                             result(row.value)});
        calls.push_back(
            {row.name + "Missed", [row] { EXPECT_EQ(ask(row.question, "KR 9"), nullptr); },
             entry + SIM_MANAGER.access() + missedTrace(row, "KR 9") + result("(null)")});
        calls.push_back(refusedCall(row.name + "EmptyKey", row.question, "", refusal));
        calls.push_back(refusedCall(row.name + "NullKey", row.question, nullptr, refusal));
    }
    return calls;
}

// The chained questions.

const char* const NAME = "GetCountryNameFromCountryCallingCode";
const char* const ALPHA2 = "GetCountryNameAlpha2FromCountryCallingCode";
const Question ASK_NAME = &CoreSystem::GetCountryNameFromCountryCallingCode;
const Question ASK_ALPHA2 = &CoreSystem::GetCountryNameAlpha2FromCountryCallingCode;

const Converter& converter(const char* name)
{
    for (const Converter& row : converters())
        if (row.name == name)
            return row;
    throw std::logic_error(name);
}

Texts mccSearched(const std::string& code, const std::string& mcc)
{
    const Converter& row = converter("GetMccFromCountryCallingCode");
    return SIM_MANAGER.access() +
           (mcc.empty() ? missedTrace(row, code) : foundTrace(row, code, mcc));
}

// Names another method than the one that was asked.
const Texts STEP_LINE = {CORE_SYSTEM.debug(NAME, "CoreSystem::GetCountryCallingCodeFromMcc")};

std::vector<LoggedCall> chainedCalls()
{
    return {
        {"NameOfCallingCodeFound", [] { std::free(ask(ASK_NAME, "596")); },
         entryLine(NAME) + mccSearched("596", "340") + STEP_LINE + SIM_MANAGER.access() +
             foundTrace(converter("GetCountryNameFromMcc"), "340", "Guadeloupe (France)") +
             Texts{CORE_SYSTEM.debug(NAME, "countryName : Guadeloupe (France)")}},
        refusedCall("NameOfCallingCodeMissed", ASK_NAME, "999",
                    entryLine(NAME) + mccSearched("999", "") + STEP_LINE +
                        emptyKeyError(NAME, "mcc")),
        refusedCall("NameOfEmptyCallingCode", ASK_NAME, "",
                    entryLine(NAME) + emptyKeyError(NAME, "countryCallingCode")),
        refusedCall("NameOfNullCallingCode", ASK_NAME, nullptr,
                    entryLine(NAME) + emptyKeyError(NAME, "countryCallingCode")),

        {"Alpha2OfCallingCodeFound", [] { EXPECT_THAT(ask(ASK_ALPHA2, "596"), StrEq("mq")); },
         entryLine(ALPHA2) + mccSearched("596", "340") +
             Texts{CORE_SYSTEM.debug(ALPHA2, "countryNameAlpha2 : mq")}},
        refusedCall("Alpha2OfCallingCodeMissed", ASK_ALPHA2, "999",
                    entryLine(ALPHA2) + mccSearched("999", "") + emptyKeyError(ALPHA2, "mcc")),
        refusedCall("Alpha2OfEmptyCallingCode", ASK_ALPHA2, "",
                    entryLine(ALPHA2) + emptyKeyError(ALPHA2, "countryCallingCode")),
        refusedCall("Alpha2OfNullCallingCode", ASK_ALPHA2, nullptr,
                    entryLine(ALPHA2) + emptyKeyError(ALPHA2, "countryCallingCode")),
    };
}

// The predicates.

bool isValidMcc(const char* mcc)
{
    return coreSystem().IsValidMcc(mcc);
}

bool isValidMutableMcc(const char* mcc)
{
    return coreSystem().IsValidMcc(const_cast<char*>(mcc));
}

bool isMoSupportMcc(const char* mcc)
{
    return coreSystem().IsMoSupportMcc(mcc);
}

LoggedCall predicateCall(const std::string& name, bool (*ask)(const char*), const char* mcc,
                         bool answer, const Texts& trace)
{
    return {name, [=] { EXPECT_EQ(ask(mcc), answer); }, trace};
}

std::vector<LoggedCall> validMccCalls(const std::string& name, bool (*ask)(const char*))
{
    const std::string method = "IsValidMcc";
    const Texts refusal = entryLine(method) + emptyKeyError(method, "mcc");
    const Texts search = entryLine(method) + SIM_MANAGER.access();
    return {
        predicateCall(name + "Valid", ask, "450", true,
                      search + Texts{SIM_MANAGER.debug(method, "IsValidMcc [mcc : 450]"),
                                     SIM_MANAGER.debug(method, "mcc is valid")}),
        predicateCall(name + "Invalid", ask, "999", false,
                      search + Texts{SIM_MANAGER.debug(method, "IsValidMcc [mcc : 999]"),
                                     SIM_MANAGER.error(method, "mcc is invalid")}),
        predicateCall(name + "Empty", ask, "", false, refusal),
        predicateCall(name + "Null", ask, nullptr, false, refusal),
    };
}

std::vector<LoggedCall> moSupportCalls()
{
    const std::string method = "IsMoSupportMcc";
    return {
        predicateCall("MoSupportAsked", isMoSupportMcc, "123", true,
                      SIM_MANAGER.access() +
                          Texts{SIM_MANAGER.debug(method, "IsMoSupportMcc [mcc : 123]"),
                                SIM_MANAGER.debug(method, "IsMOSupportMcc? : true")}),
        predicateCall("MoSupportEmpty", isMoSupportMcc, "", false, emptyKeyError(method, "mcc")),
        predicateCall("MoSupportNull", isMoSupportMcc, nullptr, false,
                      emptyKeyError(method, "mcc")),
    };
}

INSTANTIATE_TEST_SUITE_P(CountryConverters, LoggedCallTest, testing::ValuesIn(converterCalls()),
                         rowName<LoggedCall>);
INSTANTIATE_TEST_SUITE_P(CountryChains, LoggedCallTest, testing::ValuesIn(chainedCalls()),
                         rowName<LoggedCall>);
INSTANTIATE_TEST_SUITE_P(CountryValidity, LoggedCallTest,
                         testing::ValuesIn(validMccCalls("ConstMcc", isValidMcc)),
                         rowName<LoggedCall>);
INSTANTIATE_TEST_SUITE_P(CountryValidityMutable, LoggedCallTest,
                         testing::ValuesIn(validMccCalls("MutableMcc", isValidMutableMcc)),
                         rowName<LoggedCall>);
INSTANTIATE_TEST_SUITE_P(CountryMoSupport, LoggedCallTest, testing::ValuesIn(moSupportCalls()),
                         rowName<LoggedCall>);

class CountryQuestionTest : public PlatformTest, public testing::WithParamInterface<Converter> {
protected:
    const Converter& row = GetParam();
    char preset = 'p';
};

INSTANTIATE_TEST_SUITE_P(Every, CountryQuestionTest, testing::ValuesIn(converters()),
                         rowName<Converter>);

TEST_P(CountryQuestionTest, AnswerIsCopyThatTheCallerFrees)
{
    char* const value = ask(row.question, row.key.c_str(), &preset);
    EXPECT_THAT(value, StrEq(row.value));
    EXPECT_EQ(ledger().live(), Texts{"copy: " + row.value});
    std::free(value);
    EXPECT_THAT(ledger().live(), IsEmpty());
}

TEST_P(CountryQuestionTest, UnknownKeysGiveNull)
{
    for (const int mode : {0, 1}) {
        platform().debugMode = mode;
        for (const std::string& key : strangeKeys(row.key))
            EXPECT_EQ(ask(row.question, key.c_str(), &preset), nullptr) << key.substr(0, 100);
    }
}

TEST_P(CountryQuestionTest, SlotIsWrittenAfterTheSearch)
{
    const Question question = row.question;
    char* slot = &preset;
    const char* seen = nullptr;
    platform().debugMode = 1;
    platform().onEvent = [&](const Event& event) {
        if (event.text == foundTrace(row, row.key, row.value).back())
            seen = slot;
    };
    (coreSystem().*question)(row.key.c_str(), &slot);
    EXPECT_EQ(seen, &preset);
    std::free(slot);
}

TEST_P(CountryQuestionTest, FailedCopyGivesNull)
{
    const FailingAllocation failure(Allocation::STRDUP);
    EXPECT_EQ(ask(row.question, row.key.c_str(), &preset), nullptr);
    EXPECT_TRUE(failure.happened());
}

class CountryChainTest : public PlatformTest {
protected:
    std::string name(const char* code)
    {
        char* const answer = ask(ASK_NAME, code);
        const std::string text = answer;
        std::free(answer);
        return text;
    }

    char preset = 'p';
};

TEST_F(CountryChainTest, NameIsThatOfTheFirstMcc)
{
    EXPECT_EQ(name("1"), "American Samoa (US)");
    EXPECT_EQ(name("7"), "Kazakhstan");
    EXPECT_EQ(name("44"), "United Kingdom");
    EXPECT_EQ(name("590"), "Guadeloupe (France)");
    EXPECT_EQ(name("596"), "Guadeloupe (France)");
    EXPECT_EQ(name("82"), "Korea, South");
}

TEST_F(CountryChainTest, Alpha2IsThatOfTheLastRow)
{
    EXPECT_STREQ(ask(ASK_ALPHA2, "590"), "mq");
    EXPECT_STREQ(ask(ASK_ALPHA2, "596"), "mq");
    EXPECT_STREQ(ask(ASK_ALPHA2, "1"), "as");
    EXPECT_STREQ(ask(ASK_ALPHA2, "7"), "kz");
}

TEST_F(CountryChainTest, NameIsCopyAndItsMccIsKept)
{
    char* const answer = ask(ASK_NAME, "596", &preset);
    EXPECT_EQ(ledger().live(), (Texts{"copy: 340", "copy: Guadeloupe (France)"}));
    std::free(answer);
    EXPECT_EQ(ledger().live(), Texts{"copy: 340"});
}

TEST_F(CountryChainTest, Alpha2IsTheTablesOwnTextAndItsMccIsKept)
{
    const char* const answer = ask(ASK_ALPHA2, "596", &preset);
    EXPECT_EQ(ask(ASK_ALPHA2, "590", &preset), answer);
    EXPECT_EQ(ledger().origin(answer), "");
    EXPECT_EQ(ledger().live(), (Texts{"copy: 340", "copy: 340"}));
}

TEST_F(CountryChainTest, UnknownCodesLeaveTheSlotAndKeepNothing)
{
    for (const int mode : {0, 1}) {
        platform().debugMode = mode;
        for (const std::string& code : strangeKeys("596")) {
            EXPECT_EQ(ask(ASK_NAME, code.c_str(), &preset), &preset) << code.substr(0, 100);
            EXPECT_EQ(ask(ASK_ALPHA2, code.c_str(), &preset), &preset) << code.substr(0, 100);
        }
    }
    EXPECT_THAT(ledger().live(), IsEmpty());
}

TEST_F(CountryChainTest, FailedCopyOfTheMccLeavesTheSlot)
{
    for (const Question question : {ASK_NAME, ASK_ALPHA2}) {
        const FailingAllocation failure(Allocation::STRDUP);
        EXPECT_EQ(ask(question, "596", &preset), &preset);
        EXPECT_TRUE(failure.happened());
    }
}

TEST_F(CountryChainTest, FailedCopyOfTheNameGivesNull)
{
    const FailingAllocation failure(Allocation::STRDUP, 1);
    EXPECT_EQ(ask(ASK_NAME, "596", &preset), nullptr);
    EXPECT_TRUE(failure.happened());
}

class CountryPredicateTest : public PlatformTest {};

TEST_F(CountryPredicateTest, ConstAndMutableMccsAreTreatedAlike)
{
    for (const char* mcc : {"450", "340", "406", "659", "999", "", "45", "4500"})
        EXPECT_EQ(isValidMcc(mcc), isValidMutableMcc(mcc)) << mcc;
}

TEST_F(CountryPredicateTest, ValidityIsMembershipInTheTable)
{
    EXPECT_TRUE(isValidMcc("450"));
    EXPECT_FALSE(isValidMcc("406"));
    EXPECT_FALSE(isValidMcc("659"));
    for (const std::string& key : strangeKeys("412"))
        EXPECT_FALSE(isValidMcc(key.c_str())) << key.substr(0, 100);
}

TEST_F(CountryPredicateTest, EveryMccButTheEmptyOneSupportsMo)
{
    EXPECT_TRUE(isMoSupportMcc("505"));
    EXPECT_TRUE(isMoSupportMcc("123"));
    for (const std::string& key : strangeKeys("505"))
        EXPECT_TRUE(isMoSupportMcc(key.c_str()));
    EXPECT_FALSE(isMoSupportMcc(""));
    EXPECT_FALSE(isMoSupportMcc(nullptr));
}

class CountryThreadTest : public PlatformTest {};

TEST_F(CountryThreadTest, ManyThreadsMayAskAtOnce)
{
    std::vector<std::thread> threads;
    std::atomic<int> good{0};
    for (int i = 0; i < 8; ++i)
        threads.emplace_back([&good] {
            for (const Converter& row : converters()) {
                char* const value = ask(row.question, row.key.c_str());
                good += value != nullptr && row.value == value;
                std::free(value);
            }
        });
    for (std::thread& thread : threads)
        thread.join();
    EXPECT_EQ(good, 8 * static_cast<int>(converters().size()));
}

} // namespace
