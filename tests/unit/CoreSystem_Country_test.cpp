// SPDX-License-Identifier: Apache-2.0
// The country questions: the searches of SimManager, and the facade's ways to them.
#include "support/PlatformTest.h"
#include "support/Together.h"

using namespace fake;
using testing::IsEmpty;
using testing::StrEq;

namespace {

struct Converter {
    std::string name;
    void (CoreSystem::*question)(const char* key, char** slot);
    std::string keyName;
    std::string key;
    std::string value;
    std::string valueName;
    std::string entry = name; // SimManager's text before the key
    std::string success = "success to get ";
};

// An entry that names another method and a success that is marked are meant.
#define CONVERTER(name) #name, &CoreSystem::name
const std::vector<Converter> CONVERTERS = {
    {CONVERTER(GetCountryCodeFromMcc), "mcc", "450", "kr", "countrycode", "GetMccToCountryCode"},
    {CONVERTER(GetCountryNameFromMcc), "mcc", "450", "Korea, South", "countryName"},
    {CONVERTER(GetMccFromCountryCode), "countryCode", "kr", "450", "mcc"},
    {CONVERTER(GetMccFromServiceCountryCode), "serviceCountryCode", "ko_KR", "450", "mcc"},
    {CONVERTER(GetServiceCountryCodeFromMcc), "mcc", "450", "ko_KR", "serviceCountryCode",
     "GetServiceCountryCodeFromMcc", "!! success to get "},
    {CONVERTER(GetMccFromCountryCallingCode), "countryCallingCode", "82", "450", "mcc"},
    {CONVERTER(GetCountryCallingCodeFromMcc), "mcc", "450", "82", "countryCallingCode"},
    {CONVERTER(GetAlpha3CountryCodeFromMcc), "mcc", "450", "KOR", "alpha3CountryCode"},
};
#undef CONVERTER

// The log lines of SimManager for a key that it finds, and for one that it does not.
Texts foundTrace(const Converter& row, const std::string& key, const std::string& value)
{
    return {SIM_MANAGER.debug(row.name, row.entry + " [" + row.keyName + " : " + key + "]"),
            SIM_MANAGER.debug(row.name, row.success + row.valueName + " : " + value)};
}

Texts missedTrace(const Converter& row, const std::string& key)
{
    return {SIM_MANAGER.debug(row.name, row.entry + " [" + row.keyName + " : " + key + "]"),
            SIM_MANAGER.error(row.name, "fail to get " + row.valueName)};
}

// Keys that no table holds; the tables' own tests ask for more.
Texts strangeKeys(const std::string& key)
{
    std::string everyByte;
    for (int byte = 1; byte < 256; ++byte)
        everyByte += static_cast<char>(byte);
    return {"-1", "%s%n", everyByte, " " + key, key + "0", std::string(10 << 20, '4')};
}

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
    for (const Converter& row : CONVERTERS) {
        const Texts entry = entryLine(row.name);
        const auto add = [&](const std::string& name, const std::string& key, const Texts& trace,
                             const std::string& value) {
            const auto run = [=] {
                char preset = 'p';
                char* const answer = ask(row.question, key.c_str(), &preset);
                EXPECT_EQ(answer != nullptr ? answer : "(null)", value);
                EXPECT_EQ(ledger().live(), answer ? Texts{"copy: " + row.value} : Texts());
                std::free(answer); // the caller's
            };
            const std::string line = row.valueName + " : " + value;
            calls.push_back(
                {row.name + name, run,
                 entry + SIM_MANAGER.access() + trace + Texts{CORE_SYSTEM.debug(row.name, line)}});
        };
        add("Found", row.key, foundTrace(row, row.key, row.value), row.value);
        add("Missed", "KR 9", missedTrace(row, "KR 9"), "(null)");
        const Texts refusal = entry + emptyKeyError(row.name, row.keyName);
        calls.push_back(refusedCall(row.name + "EmptyKey", row.question, "", refusal));
        calls.push_back(refusedCall(row.name + "NullKey", row.question, nullptr, refusal));
    }
    return calls;
}

const char* const NAME = "GetCountryNameFromCountryCallingCode";
const char* const ALPHA2 = "GetCountryNameAlpha2FromCountryCallingCode";
const Question ASK_NAME = &CoreSystem::GetCountryNameFromCountryCallingCode;
const Question ASK_ALPHA2 = &CoreSystem::GetCountryNameAlpha2FromCountryCallingCode;

std::vector<LoggedCall> chainedCalls()
{
    const Converter& toName = CONVERTERS[1];
    const Converter& toMcc = CONVERTERS[5];
    const Texts found = SIM_MANAGER.access() + foundTrace(toMcc, "596", "340");
    const Texts missed = SIM_MANAGER.access() + missedTrace(toMcc, "999");
    // Names another method than the one that was asked.
    const Texts step = {CORE_SYSTEM.debug(NAME, "CoreSystem::GetCountryCallingCodeFromMcc")};
    std::vector<LoggedCall> calls = {
        {"NameOfCallingCodeFound", [] { std::free(ask(ASK_NAME, "596")); },
         entryLine(NAME) + found + step + SIM_MANAGER.access() +
             foundTrace(toName, "340", "Guadeloupe (France)") +
             Texts{CORE_SYSTEM.debug(NAME, "countryName : Guadeloupe (France)")}},
        {"Alpha2OfCallingCodeFound", [] { EXPECT_THAT(ask(ASK_ALPHA2, "596"), StrEq("mq")); },
         entryLine(ALPHA2) + found + Texts{CORE_SYSTEM.debug(ALPHA2, "countryNameAlpha2 : mq")}},
        refusedCall("NameOfCallingCodeMissed", ASK_NAME, "999",
                    entryLine(NAME) + missed + step + emptyKeyError(NAME, "mcc")),
        refusedCall("Alpha2OfCallingCodeMissed", ASK_ALPHA2, "999",
                    entryLine(ALPHA2) + missed + emptyKeyError(ALPHA2, "mcc")),
    };
    for (const auto& [method, question] : {std::pair{NAME, ASK_NAME}, {ALPHA2, ASK_ALPHA2}}) {
        const Texts trace = entryLine(method) + emptyKeyError(method, "countryCallingCode");
        calls.push_back(refusedCall(method + std::string("Empty"), question, "", trace));
        calls.push_back(refusedCall(method + std::string("Null"), question, nullptr, trace));
    }
    return calls;
}

// An MCC may be asked for as const and as mutable.

typedef bool (*Predicate)(const char* key);

const Predicate IS_VALID = [](const char* mcc) { return coreSystem().IsValidMcc(mcc); };
const Predicate IS_VALID_MUTABLE = [](const char* mcc) {
    return coreSystem().IsValidMcc(const_cast<char*>(mcc));
};
const Predicate IS_MO_SUPPORT = [](const char* mcc) { return coreSystem().IsMoSupportMcc(mcc); };
LoggedCall predicateCall(const std::string& name, Predicate ask, const char* mcc, bool answer,
                         const Texts& trace)
{
    return {name, [=] { EXPECT_EQ(ask(mcc), answer); }, trace};
}

Texts validity(const std::string& mcc, bool isValid)
{
    const std::string method = "IsValidMcc";
    return {SIM_MANAGER.debug(method, "IsValidMcc [mcc : " + mcc + "]"),
            isValid ? SIM_MANAGER.debug(method, "mcc is valid")
                    : SIM_MANAGER.error(method, "mcc is invalid")};
}

std::vector<LoggedCall> predicateCalls()
{
    const std::string mo = "IsMoSupportMcc";
    const Texts moAsked = {SIM_MANAGER.debug(mo, "IsMoSupportMcc [mcc : 505]"),
                           SIM_MANAGER.debug(mo, "IsMOSupportMcc? : true")};
    const Texts entry = entryLine("IsValidMcc");
    const Texts refusal = entry + emptyKeyError("IsValidMcc", "mcc");
    std::vector<LoggedCall> calls = {
        predicateCall("MoSupport", IS_MO_SUPPORT, "505", true, SIM_MANAGER.access() + moAsked),
        predicateCall("MoSupportEmpty", IS_MO_SUPPORT, "", false, emptyKeyError(mo, "mcc")),
        predicateCall("MoSupportNull", IS_MO_SUPPORT, nullptr, false, emptyKeyError(mo, "mcc")),
    };
    for (const Predicate ask : {IS_VALID, IS_VALID_MUTABLE}) {
        const std::string name = ask == IS_VALID ? "ConstMcc" : "MutableMcc";
        for (const auto& [mcc, isValid] : {std::pair{"450", true}, {"999", false}})
            calls.push_back(predicateCall(name + mcc, ask, mcc, isValid,
                                          entry + SIM_MANAGER.access() + validity(mcc, isValid)));
        calls.push_back(predicateCall(name + "Empty", ask, "", false, refusal));
        calls.push_back(predicateCall(name + "Null", ask, nullptr, false, refusal));
    }
    return calls;
}

LOGGED_CALLS(Converters, converterCalls());
LOGGED_CALLS(CallingCodes, chainedCalls());
LOGGED_CALLS(Predicates, predicateCalls());

class CountryTest : public PlatformTest {
protected:
    char preset = 'p';
};

TEST_F(CountryTest, UnknownKeysGiveNullAndKeepNothing)
{
    for (const int mode : {0, 1})
        for (const Converter& row : CONVERTERS) {
            platform().debugMode = mode;
            for (const std::string& key : strangeKeys(row.key))
                EXPECT_EQ(ask(row.question, key.c_str(), &preset), nullptr)
                    << row.name << key.substr(0, 100);
        }
    for (const std::string& code : strangeKeys("596"))
        for (const Question question : {ASK_NAME, ASK_ALPHA2})
            EXPECT_EQ(ask(question, code.c_str(), &preset), &preset) << code.substr(0, 100);
    EXPECT_THAT(ledger().live(), IsEmpty());
}

TEST_F(CountryTest, FailedCopyGivesNull)
{
    platform().debugMode = 1;
    for (const Converter& row : CONVERTERS) {
        platform().forgetEvents();
        const FailingAllocation failure(Allocation::STRDUP);
        EXPECT_EQ(ask(row.question, row.key.c_str(), &preset), nullptr);
        EXPECT_TRUE(failure.happened());
        EXPECT_THAT(platform().trace(), testing::IsSupersetOf(foundTrace(row, row.key, "(null)")));
    }
}

TEST_F(CountryTest, SlotIsWrittenAfterTheSearch)
{
    for (const Converter& row : CONVERTERS) {
        const Question question = row.question;
        char* slot = &preset;
        const char* seen = nullptr;
        platform().debugMode = 1;
        platform().onEvent = [&](const Event& event) {
            if (event.text == foundTrace(row, row.key, row.value).back())
                seen = slot;
        };
        (system.*question)(row.key.c_str(), &slot);
        EXPECT_EQ(seen, &preset) << row.name;
        std::free(slot);
    }
}

TEST_F(CountryTest, NameIsCopyAndItsMccIsKept)
{
    char* const answer = ask(ASK_NAME, "596", &preset);
    EXPECT_EQ(ledger().live(), (Texts{"copy: 340", "copy: Guadeloupe (France)"}));
    std::free(answer);
    EXPECT_EQ(ledger().live(), Texts{"copy: 340"});
}

TEST_F(CountryTest, Alpha2IsTheTablesOwnTextAndItsMccIsKept)
{
    const char* const answer = ask(ASK_ALPHA2, "596", &preset);
    EXPECT_EQ(ask(ASK_ALPHA2, "590", &preset), answer);
    EXPECT_EQ(ledger().origin(answer), "");
    EXPECT_EQ(ledger().live(), (Texts{"copy: 340", "copy: 340"}));
}

TEST_F(CountryTest, FailedCopyOfTheChainedMccLeavesTheSlot)
{
    for (const Question question : {ASK_NAME, ASK_ALPHA2}) {
        const FailingAllocation failure(Allocation::STRDUP);
        EXPECT_EQ(ask(question, "596", &preset), &preset);
        EXPECT_TRUE(failure.happened());
    }
}

TEST_F(CountryTest, FailedCopyOfTheChainedNameGivesNull)
{
    const FailingAllocation failure(Allocation::STRDUP, 1);
    EXPECT_EQ(ask(ASK_NAME, "596", &preset), nullptr);
    EXPECT_TRUE(failure.happened());
}

TEST_F(CountryTest, StrangeMccsAreInvalidAndSupportMo)
{
    for (const std::string& key : strangeKeys("412")) {
        EXPECT_FALSE(IS_VALID(key.c_str())) << key.substr(0, 100);
        EXPECT_TRUE(IS_MO_SUPPORT(key.c_str()));
    }
    // The facade alone refuses an empty key.
    EXPECT_FALSE(sim.IsValidMcc(""));
    EXPECT_TRUE(sim.IsMoSupportMcc(""));
    char* slot = &preset;
    sim.GetMccFromCountryCode("", &slot);
    EXPECT_EQ(slot, nullptr);
}

TEST_F(CountryTest, ManyThreadsMayAskAtOnce)
{
    together(8, [](int) {
        for (const Converter& row : CONVERTERS) {
            char* const value = ask(row.question, row.key.c_str());
            EXPECT_EQ(value, row.value);
            std::free(value);
        }
    });
}

} // namespace
