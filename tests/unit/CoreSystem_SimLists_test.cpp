// SPDX-License-Identifier: Apache-2.0
// The facade's lists: what every card says.
#include "IdentityReads.h"

using namespace fake;
using testing::ElementsAre;
using testing::ElementsAreArray;
using testing::IsEmpty;
using testing::UnorderedElementsAreArray;

namespace {

const int UNTOUCHED = 77;

// The answers of a list read, and its count.
struct Answers {
    std::vector<char*> values;
    int count = UNTOUCHED;

    // Frees what the library handed out.
    Texts take()
    {
        Texts texts;
        for (char* const value : values) {
            texts.push_back(value != nullptr ? value : "null");
            std::free(value);
        }
        values.clear();
        return texts;
    }
};

void ask(const IdentityRead& read, Answers& answers)
{
    (coreSystem().*read.readAll)(answers.values, &answers.count);
}

Texts valuesOf(const IdentityRead& read, const std::vector<Card>& cards)
{
    Texts values;
    for (const Card& card : cards)
        values.push_back(read.valueOf(card));
    return values;
}

Texts listEntryOf(const IdentityRead& read)
{
    return {CORE_SYSTEM.debug(read.name, read.allEntry)};
}

Texts addedOf(const IdentityRead& read, const std::string& value, int count)
{
    const std::string shownValue = read.isSecret ? "" : shown(read, value) + " ";
    return {CORE_SYSTEM.debug(read.name,
                              read.added + shownValue + "count: [" + std::to_string(count) + "]")};
}

LoggedCall listCall(const IdentityRead& read, const std::string& name,
                    const std::vector<std::optional<Card>>& slots)
{
    const auto count = static_cast<unsigned int>(slots.size());
    Texts trace = listEntryOf(read) + accessed(listTaken(count));
    std::vector<Card> cards;
    for (int slot = 0; static_cast<unsigned int>(slot) < count; ++slot) {
        const std::optional<Card>& card = slots[static_cast<std::size_t>(slot)];
        if (!card) {
            trace = trace + accessed(slotUnavailable(read, slot, count));
            continue;
        }
        cards.push_back(*card);
        trace = trace + accessed(slotRead(read, slot, count, read.valueOf(*card))) +
                addedOf(read, read.valueOf(*card), static_cast<int>(cards.size()));
    }
    return {read.name + name,
            [=] {
                setSlots(slots);
                Answers answers;
                ask(read, answers);
                EXPECT_EQ(answers.count, static_cast<int>(cards.size()));
                EXPECT_THAT(ledger().live(),
                            UnorderedElementsAreArray(copies(read, cards) + kept(read, cards)));
                EXPECT_EQ(answers.take(), valuesOf(read, cards));
                EXPECT_THAT(ledger().freeAll(), UnorderedElementsAreArray(kept(read, cards)));
                EXPECT_THAT(platform().liveHandles(), IsEmpty());
            },
            trace + accessed(listReleased(count))};
}

LoggedCall noListCall(const IdentityRead& read)
{
    return {read.name + "ListWithoutTelephony",
            [=] {
                setNoTelephony();
                Answers answers;
                ask(read, answers);
                EXPECT_EQ(answers.count, UNTOUCHED);
                EXPECT_THAT(answers.values, IsEmpty());
            },
            listEntryOf(read) + accessed(noListTaken())};
}

LoggedCall unreadableCall(const IdentityRead& read)
{
    return {read.name + "ListOfOneUnreadable",
            [=] {
                setSlots({KOREAN_CARD, AMERICAN_CARD});
                platform().answer(readCall(read, 0), -1);
                Answers answers;
                ask(read, answers);
                EXPECT_EQ(answers.count, 1);
                EXPECT_EQ(answers.take(), valuesOf(read, {AMERICAN_CARD}));
                ledger().freeAll();
            },
            listEntryOf(read) + accessed(listTaken(2)) + accessed(slotFailed(read, 0, 2)) +
                accessed(slotRead(read, 1, 2, read.valueOf(AMERICAN_CARD))) +
                addedOf(read, read.valueOf(AMERICAN_CARD), 1) + accessed(listReleased(2))};
}

std::vector<LoggedCall> listCalls()
{
    std::vector<LoggedCall> calls;
    for (const IdentityRead& read : identityReads())
        for (const LoggedCall& call :
             {listCall(read, "ListOfTwo", {KOREAN_CARD, AMERICAN_CARD}),
              listCall(read, "ListOfSecondSlotOnly", {NO_CARD, AMERICAN_CARD}),
              listCall(read, "ListOfFirstSlotOnly", {KOREAN_CARD, NO_CARD}),
              listCall(read, "ListWithGap", {KOREAN_CARD, NO_CARD, AMERICAN_CARD}),
              listCall(read, "ListOfNone", {NO_CARD, NO_CARD}), noListCall(read),
              unreadableCall(read)})
            calls.push_back(call);
    return calls;
}

INSTANTIATE_TEST_SUITE_P(SimLists, LoggedCallTest, testing::ValuesIn(listCalls()),
                         rowName<LoggedCall>);

class SimListTest : public PlatformTest, public testing::WithParamInterface<IdentityRead> {
protected:
    const IdentityRead& read = GetParam();
    Answers answers;
};

INSTANTIATE_TEST_SUITE_P(Every, SimListTest, testing::ValuesIn(identityReads()),
                         rowName<IdentityRead>);

TEST_P(SimListTest, NewValuesFollowWhatTheVectorHolds)
{
    char first = '1';
    char second = '2';
    answers.values = {&first, &second, nullptr};
    setSlots({KOREAN_CARD});
    ask(read, answers);
    ASSERT_EQ(answers.values.size(), 4u);
    EXPECT_THAT(std::vector<char*>(answers.values.begin(), answers.values.begin() + 3),
                ElementsAre(&first, &second, nullptr));
    EXPECT_EQ(answers.values.back(), read.valueOf(KOREAN_CARD));
    EXPECT_EQ(answers.count, 1);
    ledger().freeAll();
}

TEST_P(SimListTest, CountIsOfThisQuestionOnly)
{
    setSlots({KOREAN_CARD, AMERICAN_CARD});
    for (const std::size_t size : {2u, 4u, 6u}) {
        ask(read, answers);
        EXPECT_EQ(answers.count, 2);
        EXPECT_EQ(answers.values.size(), size);
    }
    setSlots({NO_CARD});
    ask(read, answers);
    EXPECT_EQ(answers.count, 0);
    ledger().freeAll();
}

TEST_P(SimListTest, NoSlotsLeaveVectorAndCountUntouched)
{
    setSlotCount(0);
    char held = 'h';
    answers.values = {&held};
    ask(read, answers);
    EXPECT_EQ(answers.count, UNTOUCHED);
    EXPECT_THAT(answers.values, ElementsAre(&held));
    EXPECT_THAT(platform().liveHandles(), ElementsAre("list of 0"));
    EXPECT_THAT(ledger().live(), IsEmpty());
}

TEST_P(SimListTest, CountIsZeroBeforeTheFirstSlotIsAsked)
{
    setSlots({KOREAN_CARD});
    int countThen = UNTOUCHED;
    platform().onEvent = [&](const Event& event) {
        if (event.text == stateCall(0))
            countThen = answers.count;
    };
    ask(read, answers);
    EXPECT_EQ(countThen, 0);
    ledger().freeAll();
}

TEST_P(SimListTest, IntermediateCopyIsFreedSlotBySlot)
{
    setSlots({KOREAN_CARD, AMERICAN_CARD});
    Texts atSecondSlot;
    platform().onEvent = [&](const Event& event) {
        if (event.text == stateCall(1))
            atSecondSlot = ledger().live();
    };
    ask(read, answers);
    EXPECT_THAT(atSecondSlot,
                ElementsAreArray(copies(read, {KOREAN_CARD}) + kept(read, {KOREAN_CARD})));
    ledger().freeAll();
}

TEST_P(SimListTest, FailedCopyIsNullElement)
{
    platform().debugMode = 1;
    for (const int skipped : {0, 1}) {
        platform().reset();
        platform().debugMode = 1;
        setSlots({KOREAN_CARD, AMERICAN_CARD});
        const FailingAllocation failure(Allocation::STRDUP, skipped);
        ask(read, answers);
        EXPECT_TRUE(failure.happened());
        EXPECT_EQ(answers.count, 2);
        EXPECT_EQ(answers.take(), (Texts{"null", read.valueOf(AMERICAN_CARD)}));
        const Texts keptFirst = read.isNumber || skipped == 1 ? kept(read, {KOREAN_CARD}) : Texts();
        EXPECT_THAT(ledger().freeAll(),
                    UnorderedElementsAreArray(keptFirst + kept(read, {AMERICAN_CARD})));
    }
}

// The caller's vector: its failure is the caller's too.
TEST_P(SimListTest, VectorThatCannotGrowStaysAsItIs)
{
    setSlots({KOREAN_CARD});
    const FailingAllocation failure(Allocation::THROWING);
    EXPECT_THROW(ask(read, answers), std::bad_alloc);
    EXPECT_TRUE(failure.happened());
    EXPECT_THAT(answers.values, IsEmpty());
    EXPECT_EQ(answers.count, 0);
    ledger().freeAll();
}

TEST_P(SimListTest, SecretsAreNeverFormatted)
{
    for (const int mode : {0, 1}) {
        platform().debugMode = mode;
        setSlots({KOREAN_CARD, AMERICAN_CARD});
        ask(read, answers);
        for (const Card& card : {KOREAN_CARD, AMERICAN_CARD}) {
            EXPECT_FALSE(isIdentityTold(card));
            EXPECT_EQ(isTold(read.valueOf(card)), mode == 1 && !read.isSecret);
        }
        ledger().freeAll();
        platform().reset();
    }
}

} // namespace
