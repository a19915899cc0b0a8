// SPDX-License-Identifier: Apache-2.0
// The facade's questions about the cards: is one there, are two, and what does the first one say.
#include "IdentityReads.h"

using namespace fake;
using testing::ElementsAre;
using testing::IsEmpty;
using testing::UnorderedElementsAreArray;

namespace {

const int AVAILABLE = TELEPHONY_SIM_STATE_AVAILABLE;
const int LOCKED = TELEPHONY_SIM_STATE_LOCKED;
const int ABSENT = TELEPHONY_SIM_STATE_UNAVAILABLE;

bool isSimAvailable()
{
    return coreSystem().IsSimAvailable();
}

typedef bool (*Question)();

void setStates(const std::vector<int>& states)
{
    setSlotCount(static_cast<unsigned int>(states.size()));
    for (std::size_t slot = 0; slot < states.size(); ++slot)
        setState(static_cast<int>(slot), states[slot]);
}

Texts slotsAsked(const std::vector<int>& states, std::size_t asked)
{
    Texts trace;
    for (std::size_t slot = 0; slot < asked; ++slot)
        trace = trace + accessed(availabilityAsked(static_cast<int>(slot),
                                                   static_cast<unsigned int>(states.size()),
                                                   states[slot] == AVAILABLE));
    return trace;
}

LoggedCall simCall(const std::string& name, Question ask, const std::function<void()>& prepare,
                   bool expected, const Texts& live, const Texts& trace)
{
    return {name,
            [=] {
                prepare();
                EXPECT_EQ(ask(), expected);
                EXPECT_EQ(platform().liveHandles(), live);
            },
            trace};
}

// `asked` slots are asked in order.
LoggedCall availableCall(const std::string& name, const std::vector<int>& states, std::size_t asked,
                         bool expected)
{
    const auto count = static_cast<unsigned int>(states.size());
    return simCall(
        "SimAvailable" + name, &isSimAvailable, [=] { setStates(states); }, expected, {},
        Texts{CORE_SYSTEM.debug("IsSimAvailable", "CoreSystem IsSimAvailable()")} +
            accessed(listTaken(count)) + slotsAsked(states, asked) + accessed(listReleased(count)));
}

// Handed on without a line of the facade's own.
LoggedCall existsCall(const std::string& name, int state, const std::string& stateName,
                      bool expected)
{
    const auto line = [](const std::string& text) { return SIM_MANAGER.debug("IsSimExist", text); };
    return simCall(
        "SimExists" + name, [] { return coreSystem().IsSimExist(); }, [=] { setStates({state}); },
        expected, {},
        accessed(lockedThroughout({"telephony_init()", stateCall(0),
                                   line("RESULT sim_get_state[0] : 0 | 0"),
                                   line("SIM STATE[0] : " + stateName), deinitCall(1)})));
}

const std::string DUAL_ENTRY =
    CORE_SYSTEM.debug("IsDualSimAvailable", "CoreSystem IsDualSimAvailable()");

LoggedCall dualCall(const std::string& name, const std::vector<int>& states, std::size_t asked,
                    bool expected)
{
    const auto count = static_cast<unsigned int>(states.size());
    return simCall(
        "DualSim" + name, &CoreSystemInternals::isDualSimAvailable, [=] { setStates(states); },
        expected, {},
        Texts{DUAL_ENTRY} + accessed(listTaken(count)) + slotsAsked(states, asked) +
            Texts{CORE_SYSTEM.debug("IsDualSimAvailable",
                                    expected ? "DualSimAvailable." : "NO DualSim MODE")} +
            accessed(listReleased(count)));
}

std::vector<LoggedCall> simCalls()
{
    const Texts entry = {CORE_SYSTEM.debug("IsSimAvailable", "CoreSystem IsSimAvailable()")};
    return {
        availableCall("InOnlySlot", {AVAILABLE}, 1, true),
        availableCall("InFirstSlotAndNoOtherIsAsked", {AVAILABLE, AVAILABLE, ABSENT}, 1, true),
        availableCall("InSecondSlotOnly", {ABSENT, AVAILABLE}, 2, true),
        availableCall("InLastSlotOnly", {LOCKED, ABSENT, AVAILABLE}, 3, true),
        availableCall("NotWhereLocked", {LOCKED}, 1, false),
        availableCall("InNoSlot", {ABSENT, LOCKED, 3, 7, -1}, 5, false),
        simCall(
            "SimAvailableWithoutTelephony", &isSimAvailable, [] { setNoTelephony(); }, false, {},
            entry + accessed(noListTaken())),
        simCall(
            "SimAvailableWithoutSlots", &isSimAvailable, [] { setSlotCount(0); }, false,
            {"list of 0"}, entry + accessed(noListTaken())),
        existsCall("Present", AVAILABLE, "TELEPHONY_SIM_STATE_AVAILABLE", true),
        existsCall("Locked", LOCKED, "TELEPHONY_SIM_STATE_LOCKED", false),
        dualCall("InBothSlots", {AVAILABLE, AVAILABLE}, 2, true),
        dualCall("InFirstSlotOnly", {AVAILABLE, ABSENT}, 2, false),
        dualCall("InSecondSlotOnlyAndItIsNotAsked", {ABSENT, AVAILABLE}, 1, false),
        dualCall("NotWhereLocked", {LOCKED, LOCKED}, 1, false),
        dualCall("NotInSecondAndThirdSlot", {ABSENT, AVAILABLE, AVAILABLE}, 1, false),
        dualCall("InFirstTwoOfThreeSlots", {AVAILABLE, AVAILABLE, AVAILABLE}, 2, true),
        // The one list that is not released: meant.
        simCall(
            "DualSimOnSingleSlotKeepsTheList", &CoreSystemInternals::isDualSimAvailable,
            [] { setStates({AVAILABLE}); }, false, {"list of 1"},
            Texts{DUAL_ENTRY} + accessed(listTaken(1)) +
                Texts{CORE_SYSTEM.error("IsDualSimAvailable",
                                        "[Single Sim Device] Not support Dual Sim.")}),
        simCall(
            "DualSimWithoutTelephony", &CoreSystemInternals::isDualSimAvailable,
            [] { setNoTelephony(); }, false, {}, Texts{DUAL_ENTRY} + accessed(noListTaken())),
        simCall(
            "DualSimWithoutSlots", &CoreSystemInternals::isDualSimAvailable,
            [] { setSlotCount(0); }, false, {"list of 0"},
            Texts{DUAL_ENTRY} + accessed(noListTaken())),
    };
}

int askFirst(const IdentityRead& read, char** value)
{
    return (coreSystem().*read.readFirst)(value);
}

// Reads with a slot that holds `preset`; what the slot holds then.
char* readFirst(const IdentityRead& read, int expectedResult, char* preset = nullptr)
{
    char* value = preset;
    EXPECT_EQ(askFirst(read, &value), expectedResult);
    EXPECT_THAT(platform().liveHandles(), IsEmpty());
    return value;
}

void expectNoAnswer(const IdentityRead& read, int expectedResult)
{
    char preset = 'p';
    EXPECT_EQ(readFirst(read, expectedResult, &preset), &preset);
    EXPECT_EQ(preset, 'p');
    EXPECT_THAT(ledger().live(), IsEmpty());
}

Texts entryOf(const IdentityRead& read)
{
    return {CORE_SYSTEM.debug(read.name, read.firstEntry)};
}

Texts foundOf(const IdentityRead& read, const std::string& value)
{
    if (read.firstFound.empty())
        return {};
    return {CORE_SYSTEM.debug(read.name, read.firstFound + shown(read, value))};
}

// `cards` are as many slots; the first `empty` of them hold none.
LoggedCall foundCall(const IdentityRead& read, const std::string& name,
                     const std::vector<std::optional<Card>>& cards, int empty)
{
    const auto count = static_cast<unsigned int>(cards.size());
    const Card card = *cards[static_cast<std::size_t>(empty)];
    Texts trace = entryOf(read) + accessed(listTaken(count));
    for (int slot = 0; slot < empty; ++slot)
        trace = trace + accessed(slotUnavailable(read, slot, count));
    return {read.name + name,
            [=] {
                setSlots(cards);
                char* const value = readFirst(read, 0);
                EXPECT_EQ(value, read.valueOf(card));
                EXPECT_THAT(ledger().freeAll(),
                            UnorderedElementsAreArray(copies(read, {card}) + kept(read, {card})));
            },
            trace + accessed(slotRead(read, empty, count, read.valueOf(card))) +
                foundOf(read, read.valueOf(card)) + accessed(listReleased(count))};
}

LoggedCall noAnswerCall(const IdentityRead& read, const std::string& name,
                        const std::function<void()>& prepare, int result, const Texts& steps)
{
    return {read.name + name,
            [=] {
                prepare();
                expectNoAnswer(read, result);
            },
            entryOf(read) + steps};
}

std::vector<LoggedCall> readCalls(const IdentityRead& read)
{
    return {
        foundCall(read, "OfOnlySlot", {KOREAN_CARD}, 0),
        foundCall(read, "OfFirstSlotOnlyOfTwo", {KOREAN_CARD, AMERICAN_CARD}, 0),
        foundCall(read, "OfSecondSlot", {NO_CARD, AMERICAN_CARD}, 1),
        foundCall(read, "OfThirdSlot", {NO_CARD, NO_CARD, KOREAN_CARD, AMERICAN_CARD}, 2),
        noAnswerCall(
            read, "OfNoSlot",
            [] {
                setSlots({NO_CARD, NO_CARD});
            },
            read.failure,
            accessed(listTaken(2)) + accessed(slotUnavailable(read, 0, 2)) +
                accessed(slotUnavailable(read, 1, 2)) + accessed(listReleased(2))),
        noAnswerCall(
            read, "OfUnreadableCards",
            [read] {
                setSlots({KOREAN_CARD, AMERICAN_CARD});
                platform().answer(readCall(read, 0), -1);
                platform().answer(readCall(read, 1), -1);
            },
            read.failure,
            accessed(listTaken(2)) + accessed(slotFailed(read, 0, 2)) +
                accessed(slotFailed(read, 1, 2)) + accessed(listReleased(2))),
        noAnswerCall(
            read, "WithoutTelephony", [] { setNoTelephony(); }, read.failureWithoutList,
            accessed(noListTaken())),
    };
}

std::vector<LoggedCall> firstReadCalls()
{
    std::vector<LoggedCall> calls;
    for (const IdentityRead& read : identityReads())
        for (const LoggedCall& call : readCalls(read))
            calls.push_back(call);
    return calls;
}

INSTANTIATE_TEST_SUITE_P(Sim, LoggedCallTest, testing::ValuesIn(simCalls()), rowName<LoggedCall>);
INSTANTIATE_TEST_SUITE_P(FirstRead, LoggedCallTest, testing::ValuesIn(firstReadCalls()),
                         rowName<LoggedCall>);

class CoreSystemSimTest : public PlatformTest {};

TEST_F(CoreSystemSimTest, SecondSlotTakesOneErrorLineBeforeTheAnswer)
{
    setStates({ABSENT, AVAILABLE});
    EXPECT_TRUE(system.IsSimAvailable());
    const auto lines = platform().lines();
    ASSERT_EQ(lines.size(), 1u);
    EXPECT_EQ(lines[0].plain, "Sim is not available");
}

TEST_F(CoreSystemSimTest, ChangeBetweenTwoQuestionsIsSeen)
{
    for (const int state : {ABSENT, AVAILABLE, LOCKED, AVAILABLE, 3}) {
        setStates({state, AVAILABLE});
        EXPECT_EQ(CoreSystemInternals::isDualSimAvailable(), state == AVAILABLE);
        setStates({state});
        EXPECT_EQ(system.IsSimAvailable(), state == AVAILABLE);
        EXPECT_EQ(system.IsSimExist(), state == AVAILABLE);
    }
}

TEST_F(CoreSystemSimTest, CardThatGoesBetweenTwoSlotTestsIsNotAvailable)
{
    setStates({AVAILABLE, AVAILABLE});
    platform().onEvent = [](const Event& event) {
        if (event.text == stateCall(0))
            setState(1, ABSENT);
    };
    EXPECT_FALSE(CoreSystemInternals::isDualSimAvailable());
}

TEST_F(CoreSystemSimTest, EveryFailureCodeOfTelephonyIsOneAnswer)
{
    for (const int code : PLATFORM_FAILURES) {
        setNoTelephony(code);
        EXPECT_FALSE(system.IsSimAvailable());
        EXPECT_FALSE(CoreSystemInternals::isDualSimAvailable());
        for (const IdentityRead& read : identityReads())
            expectNoAnswer(read, read.failureWithoutList);
    }
}

class FirstReadTest : public PlatformTest, public testing::WithParamInterface<IdentityRead> {
protected:
    const IdentityRead& read = GetParam();
    const std::string value = read.valueOf(KOREAN_CARD);
};

INSTANTIATE_TEST_SUITE_P(Every, FirstReadTest, testing::ValuesIn(identityReads()),
                         rowName<IdentityRead>);

TEST_P(FirstReadTest, AnswerIsCopyOfItsOwn)
{
    setSlots({KOREAN_CARD});
    char* const answer = readFirst(read, 0);
    EXPECT_EQ(ledger().origin(answer), "copy: " + value);
    std::free(answer);
    EXPECT_THAT(ledger().freeAll(), UnorderedElementsAreArray(kept(read, {KOREAN_CARD})));
}

TEST_P(FirstReadTest, IntermediateCopyOutlivesTheList)
{
    setSlots({KOREAN_CARD});
    Texts atRelease;
    platform().onEvent = [&](const Event& event) {
        if (event.text == deinitCall(1))
            atRelease = ledger().live();
    };
    readFirst(read, 0);
    Texts expected = copies(read, {KOREAN_CARD, KOREAN_CARD});
    if (read.isNumber)
        expected.push_back("platform: " + value);
    EXPECT_EQ(atRelease, expected);
    ledger().freeAll();
}

TEST_P(FirstReadTest, FailedIntermediateCopyAnswersNull)
{
    platform().debugMode = 1;
    setSlots({KOREAN_CARD});
    const FailingAllocation failure(Allocation::STRDUP);
    EXPECT_EQ(readFirst(read, 0), nullptr);
    EXPECT_TRUE(failure.happened());
    const Texts rest = read.isNumber ? kept(read, {KOREAN_CARD}) : Texts();
    EXPECT_EQ(ledger().freeAll(), rest);
}

TEST_P(FirstReadTest, FailedCopyAnswersNull)
{
    platform().debugMode = 1;
    setSlots({KOREAN_CARD});
    const FailingAllocation failure(Allocation::STRDUP, 1);
    EXPECT_EQ(readFirst(read, 0), nullptr);
    EXPECT_TRUE(failure.happened());
    EXPECT_EQ(ledger().freeAll(), kept(read, {KOREAN_CARD}));
    if (!read.isSecret) {
        EXPECT_THAT(platform().trace(),
                    testing::Contains(CORE_SYSTEM.debug(read.name, read.firstFound + "[(null)]")));
    }
}

TEST_P(FirstReadTest, EmptyValueIsAnAnswer)
{
    const Card empty = {"", "", "", ""};
    setSlots({empty, KOREAN_CARD});
    char* const answer = readFirst(read, 0);
    EXPECT_STREQ(answer, "");
    ledger().freeAll();
}

TEST_P(FirstReadTest, UnreadableCardYieldsToTheNextSlot)
{
    setSlots({KOREAN_CARD, AMERICAN_CARD});
    platform().answer(readCall(read, 0), -1);
    EXPECT_EQ(readFirst(read, 0), read.valueOf(AMERICAN_CARD));
    ledger().freeAll();
}

TEST_P(FirstReadTest, ResultIsOfTheLastSlotsRead)
{
    setSlots({NO_CARD, NO_CARD, KOREAN_CARD});
    platform().answer(readCall(read, 2), -22);
    expectNoAnswer(read, read.failure);
}

TEST_P(FirstReadTest, SlotsWithoutListAreUntouched)
{
    setSlotCount(0);
    char preset = 'p';
    char* answer = &preset;
    EXPECT_EQ(askFirst(read, &answer), read.failureWithoutList);
    EXPECT_EQ(answer, &preset);
    EXPECT_THAT(platform().liveHandles(), ElementsAre("list of 0"));
}

TEST_P(FirstReadTest, SecretsAreNeverFormatted)
{
    for (const int mode : {0, 1}) {
        platform().debugMode = mode;
        setSlots({KOREAN_CARD});
        readFirst(read, 0);
        EXPECT_FALSE(isIdentityTold(KOREAN_CARD));
        EXPECT_EQ(isTold(value), mode == 1 && !read.isSecret);
        ledger().freeAll();
        platform().reset();
    }
}

TEST_P(FirstReadTest, NothingIsCached)
{
    for (const Card& card : {KOREAN_CARD, AMERICAN_CARD}) {
        setSlots({card});
        EXPECT_EQ(readFirst(read, 0), read.valueOf(card));
        setSlots({NO_CARD});
        char preset = 'p';
        EXPECT_EQ(readFirst(read, read.failure, &preset), &preset);
        ledger().freeAll();
    }
}

TEST_P(FirstReadTest, EveryQuestionKeepsWhatItKeeps)
{
    setSlots({KOREAN_CARD});
    Texts expected;
    for (int i = 0; i < 3; ++i) {
        std::free(readFirst(read, 0));
        expected = expected + kept(read, {KOREAN_CARD});
    }
    EXPECT_EQ(ledger().freeAll(), expected);
}

} // namespace
