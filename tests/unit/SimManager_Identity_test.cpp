// SPDX-License-Identifier: Apache-2.0
// MCC, MNC, IMSI and phone number: of one slot as SimManager reads them, and of the first slot and
// of all as the facade does.
#include "IdentityReads.h"

using namespace fake;
using testing::ElementsAre;
using testing::ElementsAreArray;
using testing::IsEmpty;
using testing::UnorderedElementsAreArray;

namespace {

typedef std::vector<std::optional<Card>> Slots;

// A value as the lines show it, "" of one that they do not.
std::string shown(const IdentityRead& read, const std::string& value)
{
    return read.isSecret ? "" : "[" + value + "]";
}

Texts readEntered(const IdentityRead& read, int slot, unsigned int count)
{
    Texts trace = {SIM_MANAGER.debug(read.name, read.name + " : slot " + std::to_string(slot + 1))};
    if (read.isNumber)
        trace.push_back(SIM_MANAGER.debug(read.name, "GetTelephonyHandle. handle count : " +
                                                         std::to_string(count)));
    return trace;
}

std::string readCall(const IdentityRead& read, int slot)
{
    return read.isNumber ? numberCall(slot) : imsiCall(slot);
}

// Up to the read itself.
Texts readBegun(const IdentityRead& read, int slot, unsigned int count)
{
    const Texts opened = {"tel_get_cp_name_list()", initCall(slot)};
    return readEntered(read, slot, count) + availabilityAsked(slot, count, true) +
           (read.isNumber ? Texts() : opened) + lockedAround(readCall(read, slot));
}

Texts readEnded(const IdentityRead& read, int slot)
{
    return read.isNumber ? Texts() : Texts{modemCall("tel_deinit", slot)};
}

Texts failureLogged(const IdentityRead& read)
{
    return {SIM_MANAGER.error(read.name, read.failureLine)};
}

// A card that is read; `value` as the lines show it.
Texts slotRead(const IdentityRead& read, int slot, unsigned int count, const std::string& value)
{
    Texts lines;
    if (read.part == nullptr)
        for (const char* line : {"Mcc exist", "Mnc exist", "Msin exist"})
            lines.push_back(SIM_MANAGER.debug(read.name, line));
    lines.push_back(SIM_MANAGER.debug(read.name, read.foundLine + shown(read, value)));
    return readBegun(read, slot, count) + lines + readEnded(read, slot);
}

Texts slotUnavailable(const IdentityRead& read, int slot, unsigned int count)
{
    return readEntered(read, slot, count) + availabilityAsked(slot, count, false) +
           failureLogged(read);
}

// A card that is available but cannot be read.
Texts slotFailed(const IdentityRead& read, int slot, unsigned int count)
{
    return readBegun(read, slot, count) + readEnded(read, slot) + failureLogged(read);
}

// The facade's walk over `count` slots.
Texts walked(const IdentityRead& read, const std::string& entry, unsigned int count,
             const Texts& steps)
{
    return Texts{CORE_SYSTEM.debug(read.name, entry)} + accessed(listTaken(count)) + steps +
           accessed(listReleased(count));
}

Texts valuesOf(const IdentityRead& read, const std::vector<Card>& cards,
               const std::string& owner = "")
{
    Texts texts;
    for (const Card& card : cards)
        texts.push_back(owner + read.valueOf(card));
    return texts;
}

Texts copies(const IdentityRead& read, const std::vector<Card>& cards)
{
    return valuesOf(read, cards, "copy: ");
}

// What SimManager keeps once it has read these cards: the platform's own numbers. Meant.
Texts keptBySim(const IdentityRead& read, const std::vector<Card>& cards)
{
    return read.isNumber ? valuesOf(read, cards, "platform: ") : Texts();
}

// What is kept after the facade has read them: copies of MCC and MNC, too. Meant.
Texts kept(const IdentityRead& read, const std::vector<Card>& cards)
{
    return read.isSecret ? keptBySim(read, cards) : copies(read, cards);
}

// Reads with a slot that holds `preset`; what the slot holds then.
char* readSlot(const IdentityRead& read, unsigned int count, int slot, int expectedResult,
               char* preset = nullptr)
{
    char* value = preset;
    EXPECT_EQ((simManager().*read.read)(openList(count), slot, &value), expectedResult);
    // Only the caller's list is open: the modem is released on every way out.
    EXPECT_THAT(platform().liveHandles(), ElementsAre(listName(count)));
    return value;
}

std::vector<LoggedCall> slotCalls(const IdentityRead& read)
{
    std::vector<LoggedCall> calls; // what succeeds does so for the facade
    const auto fails = [&](const std::string& name, const Texts& trace, const auto& prepare) {
        calls.push_back({"Slot" + read.name + name,
                         [=] {
                             setSlots({KOREAN_CARD, AMERICAN_CARD});
                             prepare();
                             char preset = 'p';
                             EXPECT_EQ(readSlot(read, 2, 0, read.failure(), &preset), nullptr);
                             EXPECT_THAT(ledger().freeAll(), IsEmpty());
                         },
                         trace});
    };
    fails("WithoutCard", slotUnavailable(read, 0, 2), [] { setState(0, 0); });
    const Texts failed = slotFailed(read, 0, 2);
    fails("Refused", failed, [=] { platform().answer(readCall(read, 0), -13); });
    fails("RefusedAboveZero", failed, [=] { platform().answer(readCall(read, 0), 4); });
    if (read.isNumber) {
        fails("Null", failed, [] { platform().answer(numberCall(0), 0); });
        return calls;
    }
    const Texts begin =
        readEntered(read, 0, 2) + availabilityAsked(0, 2, true) + Texts{"tel_get_cp_name_list()"};
    fails("WithoutModemNames", begin + failureLogged(read),
          [] { platform().setModems(std::nullopt); });
    fails("WithoutModem", begin + Texts{initCall(0)} + failureLogged(read),
          [] { platform().answer(initCall(0), -1); });
    return calls;
}

char* readFirst(const IdentityRead& read, int expectedResult, char* preset = nullptr)
{
    char* value = preset;
    EXPECT_EQ((coreSystem().*read.readFirst)(&value), expectedResult);
    EXPECT_THAT(platform().liveHandles(), IsEmpty());
    return value;
}

Texts firstFound(const IdentityRead& read, const std::string& value)
{
    if (read.firstFound.empty())
        return {};
    return {CORE_SYSTEM.debug(read.name, read.firstFound + shown(read, value))};
}

// The first `empty` slots hold no card.
LoggedCall firstCall(const IdentityRead& read, const std::string& name, const Slots& slots,
                     int empty)
{
    const auto count = static_cast<unsigned int>(slots.size());
    const Card card = *slots[static_cast<std::size_t>(empty)];
    Texts steps;
    for (int slot = 0; slot < empty; ++slot)
        steps = steps + accessed(slotUnavailable(read, slot, count));
    steps = steps + accessed(slotRead(read, empty, count, read.valueOf(card))) +
            firstFound(read, read.valueOf(card));
    return {"First" + read.name + name,
            [=] {
                setSlots(slots);
                char* const value = readFirst(read, 0);
                EXPECT_EQ(value, read.valueOf(card));
                EXPECT_EQ(ledger().origin(value), "copy: " + read.valueOf(card));
                EXPECT_THAT(ledger().freeAll(),
                            UnorderedElementsAreArray(copies(read, {card}) + kept(read, {card})));
            },
            walked(read, read.firstEntry, count, steps)};
}

std::vector<LoggedCall> firstCalls(const IdentityRead& read)
{
    std::vector<LoggedCall> calls = {
        firstCall(read, "OfOnlySlot", {KOREAN_CARD}, 0),
        firstCall(read, "OfThirdSlot", {NO_CARD, NO_CARD, KOREAN_CARD, AMERICAN_CARD}, 2),
        firstCall(read, "OfEmptyCard", {Card{"", "", "", ""}, KOREAN_CARD}, 0),
    };
    const auto fails = [&](const std::string& name, int result, const Texts& trace,
                           const auto& prepare) {
        calls.push_back({"First" + read.name + name,
                         [=] {
                             prepare();
                             char preset = 'p';
                             EXPECT_EQ(readFirst(read, result, &preset), &preset);
                             EXPECT_EQ(preset, 'p');
                             EXPECT_THAT(ledger().live(), IsEmpty());
                         },
                         trace});
    };
    const auto ofBoth = [&](const auto& step) {
        return walked(read, read.firstEntry, 2,
                      accessed(step(read, 0, 2u)) + accessed(step(read, 1, 2u)));
    };
    fails("OfNoSlot", read.failure(), ofBoth(slotUnavailable), [] {
        setSlots({NO_CARD, NO_CARD});
    });
    fails("OfUnreadableCards", read.failure(), ofBoth(slotFailed), [=] {
        setSlots({KOREAN_CARD, AMERICAN_CARD});
        platform().answer(readCall(read, 0), -1);
        platform().answer(readCall(read, 1), -1);
    });
    fails("WithoutTelephony", read.failureWithoutList,
          Texts{CORE_SYSTEM.debug(read.name, read.firstEntry)} + accessed(noListTaken()),
          [] { setNoTelephony(); });
    return calls;
}

const int UNTOUCHED_COUNT = 77;

// The answers of a list read, and its count.
struct Answers {
    std::vector<char*> values;
    int count = UNTOUCHED_COUNT;

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

std::string addedLine(const IdentityRead& read, const std::string& value, std::size_t count)
{
    const std::string shownValue = read.isSecret ? "" : shown(read, value) + " ";
    return CORE_SYSTEM.debug(read.name,
                             read.added + shownValue + "count: [" + std::to_string(count) + "]");
}

// `unreadable` is a slot whose card cannot be read.
LoggedCall listCall(const IdentityRead& read, const std::string& name, const Slots& slots,
                    int unreadable = -1)
{
    const auto count = static_cast<unsigned int>(slots.size());
    Texts steps;
    std::vector<Card> cards;
    for (int slot = 0; static_cast<unsigned int>(slot) < count; ++slot) {
        const std::optional<Card>& card = slots[static_cast<std::size_t>(slot)];
        if (!card || slot == unreadable) {
            const auto step = card ? slotFailed : slotUnavailable;
            steps = steps + accessed(step(read, slot, count));
            continue;
        }
        cards.push_back(*card);
        steps = steps + accessed(slotRead(read, slot, count, read.valueOf(*card))) +
                Texts{addedLine(read, read.valueOf(*card), cards.size())};
    }
    return {"List" + read.name + name,
            [=] {
                setSlots(slots);
                if (unreadable >= 0)
                    platform().answer(readCall(read, unreadable), -1);
                Answers answers;
                ask(read, answers);
                EXPECT_EQ(answers.count, static_cast<int>(cards.size()));
                EXPECT_THAT(ledger().live(),
                            UnorderedElementsAreArray(copies(read, cards) + kept(read, cards)));
                EXPECT_EQ(answers.take(), valuesOf(read, cards));
                EXPECT_THAT(ledger().freeAll(), UnorderedElementsAreArray(kept(read, cards)));
                EXPECT_THAT(platform().liveHandles(), IsEmpty());
            },
            walked(read, read.allEntry, count, steps)};
}

std::vector<LoggedCall> listCalls(const IdentityRead& read)
{
    return {listCall(read, "WithGap", {KOREAN_CARD, NO_CARD, AMERICAN_CARD}),
            listCall(read, "OfNone", {NO_CARD, NO_CARD}),
            listCall(read, "OfOneUnreadable", {KOREAN_CARD, AMERICAN_CARD}, 0),
            {"List" + read.name + "WithoutTelephony",
             [=] {
                 setNoTelephony();
                 Answers answers;
                 ask(read, answers);
                 EXPECT_EQ(answers.count, UNTOUCHED_COUNT);
                 EXPECT_THAT(answers.values, IsEmpty());
             },
             Texts{CORE_SYSTEM.debug(read.name, read.allEntry)} + accessed(noListTaken())}};
}

std::vector<LoggedCall> identityCalls()
{
    std::vector<LoggedCall> all;
    for (const IdentityRead& read : IDENTITY_READS)
        for (const auto& calls : {slotCalls(read), firstCalls(read), listCalls(read)})
            all.insert(all.end(), calls.begin(), calls.end());
    return all;
}

LOGGED_CALLS(SimIdentity, identityCalls());

class IdentityReadTest : public PlatformTest, public testing::WithParamInterface<IdentityRead> {
protected:
    // What is alive when the platform is called this way.
    static void noteLiveAt(const std::string& call, Texts& live)
    {
        platform().onEvent = [call, &live](const Event& event) {
            if (event.text == call)
                live = ledger().live();
        };
    }

    const IdentityRead& read = GetParam();
    const std::string value = read.valueOf(KOREAN_CARD);
    char preset = 'p';
    Answers answers;
};

INSTANTIATE_TEST_SUITE_P(Every, IdentityReadTest, testing::ValuesIn(IDENTITY_READS),
                         rowName<IdentityRead>);

TEST_P(IdentityReadTest, SecretsAreNeverFormatted)
{
    for (const int mode : {0, 1})
        for (const int way : {0, 1, 2}) {
            platform().reset();
            platform().debugMode = mode;
            setSlots({KOREAN_CARD});
            if (way == 0)
                readSlot(read, 1, 0, 0);
            else if (way == 1)
                readFirst(read, 0);
            else
                ask(read, answers);
            EXPECT_FALSE(isIdentityTold(KOREAN_CARD)) << way;
            // The same search finds what may be told.
            EXPECT_EQ(isTold(value), mode == 1 && !read.isSecret) << way;
            EXPECT_EQ(isInFormatBuffer(value), mode == 1 && !read.isSecret) << way;
            ledger().freeAll();
        }
}

TEST_P(IdentityReadTest, ValueOfFailedReadIsNeitherTakenNorFormatted)
{
    for (const int code : {-13, 4}) {
        platform().reset();
        platform().debugMode = 1;
        setSlots({KOREAN_CARD});
        platform().answer(readCall(read, 0), code,
                          read.isNumber ? std::any(value) : std::any(imsiInfo(KOREAN_CARD)));
        EXPECT_EQ(readSlot(read, 1, 0, read.failure(), &preset), nullptr);
        EXPECT_FALSE(isIdentityTold(KOREAN_CARD));
        EXPECT_EQ(ledger().freeAll(), keptBySim(read, {KOREAN_CARD}));
    }
}

TEST_P(IdentityReadTest, FailedCopyOfOneSlotIsStillAnAnswer)
{
    platform().debugMode = 1;
    setSlots({KOREAN_CARD});
    {
        const FailingAllocation failure(Allocation::STRDUP);
        EXPECT_EQ(readSlot(read, 1, 0, 0, &preset), nullptr);
        EXPECT_TRUE(failure.happened());
    }
    EXPECT_EQ(platform().trace(), slotRead(read, 0, 1, "(null)"));
    ledger().freeAll();
}

TEST_P(IdentityReadTest, FailedCopyOfTheFirstSlotAnswersNull)
{
    for (const int skipped : {0, 1}) { // the intermediate copy, and the caller's
        platform().reset();
        platform().debugMode = 1;
        setSlots({KOREAN_CARD});
        const FailingAllocation failure(Allocation::STRDUP, skipped);
        EXPECT_EQ(readFirst(read, 0), nullptr);
        EXPECT_TRUE(failure.happened());
        EXPECT_EQ(ledger().freeAll(),
                  skipped == 1 ? kept(read, {KOREAN_CARD}) : keptBySim(read, {KOREAN_CARD}));
        EXPECT_THAT(platform().trace(), testing::IsSupersetOf(firstFound(read, "(null)")));
    }
}

TEST_P(IdentityReadTest, FailedCopyIsNullElementOfTheList)
{
    for (const int skipped : {0, 1}) {
        platform().reset();
        setSlots({KOREAN_CARD, AMERICAN_CARD});
        const FailingAllocation failure(Allocation::STRDUP, skipped);
        ask(read, answers);
        EXPECT_TRUE(failure.happened());
        EXPECT_EQ(answers.count, 2);
        EXPECT_EQ(answers.take(), (Texts{"null", read.valueOf(AMERICAN_CARD)}));
        const Texts keptFirst =
            skipped == 1 ? kept(read, {KOREAN_CARD}) : keptBySim(read, {KOREAN_CARD});
        EXPECT_THAT(ledger().freeAll(),
                    UnorderedElementsAreArray(keptFirst + kept(read, {AMERICAN_CARD})));
    }
}

TEST_P(IdentityReadTest, IntermediateCopyOutlivesTheList)
{
    setSlots({KOREAN_CARD});
    Texts atRelease;
    noteLiveAt(deinitCall(1), atRelease);
    readFirst(read, 0);
    EXPECT_EQ(atRelease, copies(read, {KOREAN_CARD, KOREAN_CARD}) + keptBySim(read, {KOREAN_CARD}));
    ledger().freeAll();
}

TEST_P(IdentityReadTest, IntermediateCopyIsFreedSlotBySlot)
{
    setSlots({KOREAN_CARD, AMERICAN_CARD});
    Texts atSecondSlot;
    noteLiveAt(stateCall(1), atSecondSlot);
    ask(read, answers);
    EXPECT_THAT(atSecondSlot,
                ElementsAreArray(copies(read, {KOREAN_CARD}) + kept(read, {KOREAN_CARD})));
    ledger().freeAll();
}

TEST_P(IdentityReadTest, NoSlotsLeaveWhatTheCallerHolds)
{
    setSlotCount(0);
    char* answer = &preset;
    EXPECT_EQ((system.*read.readFirst)(&answer), read.failureWithoutList);
    EXPECT_EQ(answer, &preset);
    EXPECT_THAT(platform().liveHandles(), ElementsAre("list of 0"));
    answers.values = {&preset};
    ask(read, answers);
    EXPECT_EQ(answers.count, UNTOUCHED_COUNT);
    EXPECT_THAT(answers.values, ElementsAre(&preset));
    EXPECT_THAT(platform().liveHandles(), ElementsAre("list of 0", "list of 0"));
    EXPECT_THAT(ledger().live(), IsEmpty());
}

TEST_P(IdentityReadTest, NewValuesFollowWhatTheVectorHolds)
{
    char second = '2';
    answers.values = {&preset, &second, nullptr};
    setSlots({KOREAN_CARD});
    ask(read, answers);
    ASSERT_EQ(answers.values.size(), 4u);
    EXPECT_EQ(answers.values.back(), value);
    answers.values.pop_back();
    EXPECT_THAT(answers.values, ElementsAre(&preset, &second, nullptr));
    EXPECT_EQ(answers.count, 1);
    ledger().freeAll();
}

TEST_P(IdentityReadTest, CountIsZeroBeforeTheFirstSlotIsAsked)
{
    setSlots({KOREAN_CARD});
    int countThen = UNTOUCHED_COUNT;
    platform().onEvent = [&](const Event& event) {
        if (event.text == stateCall(0))
            countThen = answers.count;
    };
    ask(read, answers);
    EXPECT_EQ(countThen, 0);
    ledger().freeAll();
}

// The caller's vector: its failure is the caller's too.
TEST_P(IdentityReadTest, VectorThatCannotGrowStaysAsItIs)
{
    setSlots({KOREAN_CARD});
    const FailingAllocation failure(Allocation::THROWING);
    EXPECT_THROW(ask(read, answers), std::bad_alloc);
    EXPECT_TRUE(failure.happened());
    EXPECT_THAT(answers.values, IsEmpty());
    EXPECT_EQ(answers.count, 0);
    ledger().freeAll();
}

// The reads that answer parts of the IMSI.
class ImsiReadTest : public IdentityReadTest {};

INSTANTIATE_TEST_SUITE_P(Every, ImsiReadTest,
                         testing::ValuesIn(IDENTITY_READS.begin(), IDENTITY_READS.end() - 1),
                         rowName<IdentityRead>);

TEST_P(ImsiReadTest, PartsAreNeitherPaddedNorCut)
{
    for (const Card& card :
         {Card{"001", "01", "0", ""}, Card{"45", "5", "12", ""}, Card{"", "05", "", ""},
          Card{"450", "", "8", ""},
          // Fields without their NUL end where they end.
          Card{"4501", "05", "8173926450", ""}, Card{"450", "2601", "8173926450", ""},
          Card{"450", "260", "81739264501", ""}, Card{"4501", "2601", "81739264501", ""}}) {
        platform().reset();
        setSlots({card});
        char* const answer = readSlot(read, 1, 0, 0);
        EXPECT_EQ(answer, read.valueOf(card));
        std::free(answer);
    }
}

TEST_P(ImsiReadTest, SlotAtTheEndOfTheNamesIsPassedOn)
{
    setState(2, TELEPHONY_SIM_STATE_AVAILABLE);
    platform().setModems(Texts{"cp0", "cp1"});
    platform().answer("tel_init(null)", -1);
    EXPECT_EQ(readSlot(read, 3, 2, 4, &preset), nullptr);
    EXPECT_EQ(platform().texts(Event::Kind::CALL),
              (Texts{stateCall(2), "tel_get_cp_name_list()", "tel_init(null)"}));
}

TEST_P(ImsiReadTest, ModemIsReleasedAfterTheCopyWhateverItsReleaseAnswers)
{
    setSlots({KOREAN_CARD});
    platform().answer(modemCall("tel_deinit", 0), -1);
    Texts atRelease;
    noteLiveAt(modemCall("tel_deinit", 0), atRelease);
    std::free(readSlot(read, 1, 0, 0));
    EXPECT_EQ(atRelease, copies(read, {KOREAN_CARD}));
}

class NumberReadTest : public PlatformTest {};

TEST_F(NumberReadTest, NumberIsCopiedAsItIs)
{
    for (const std::string& number : ODD_TEXTS) {
        platform().reset();
        platform().debugMode = 1;
        setSlots({Card{"450", "05", "1", number}});
        EXPECT_EQ(readSlot(IDENTITY_READS.back(), 1, 0, 0), number);
        ledger().freeAll();
    }
}

} // namespace
