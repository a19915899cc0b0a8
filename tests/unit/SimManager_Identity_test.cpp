// SPDX-License-Identifier: Apache-2.0
// MCC, MNC, IMSI and phone number of one slot.
#include "IdentityReads.h"

using namespace fake;
using testing::AnyOf;
using testing::ElementsAre;
using testing::IsEmpty;

namespace {

int askSlot(const IdentityRead& read, unsigned int count, int slot, char** value)
{
    SimManager& sim = simManager();
    return (sim.*read.read)(openList(count), slot, value);
}

// Reads with a slot that holds `preset`; what the slot holds then.
char* readSlot(const IdentityRead& read, unsigned int count, int slot, int expectedResult,
               char* preset = nullptr)
{
    char* value = preset;
    EXPECT_EQ(askSlot(read, count, slot, &value), expectedResult);
    // Only the caller's list is open: the modem is released on every way out.
    EXPECT_THAT(platform().liveHandles(), ElementsAre(listName(count)));
    return value;
}

void expectFailure(const IdentityRead& read, int slot = 0)
{
    char preset = 'p';
    EXPECT_EQ(readSlot(read, 2, slot, read.failure, &preset), nullptr);
}

LoggedCall foundCall(const IdentityRead& read, const std::string& name, int slot,
                     unsigned int count, const Card& card)
{
    return {read.name + name,
            [=] {
                setSlots(std::vector<std::optional<Card>>(count, KOREAN_CARD));
                setCard(slot, card);
                char* const value = readSlot(read, count, slot, 0);
                EXPECT_EQ(value, read.valueOf(card));
                std::free(value);
                ledger().freeAll();
            },
            slotRead(read, slot, count, read.valueOf(card))};
}

LoggedCall failureCall(const IdentityRead& read, const std::string& name,
                       const std::function<void()>& prepare, const Texts& trace)
{
    return {read.name + name,
            [=] {
                setSlots({KOREAN_CARD, AMERICAN_CARD});
                prepare();
                expectFailure(read);
                EXPECT_THAT(ledger().freeAll(), IsEmpty());
            },
            trace};
}

// Steps that the reads of IMSI parts alone have.
std::vector<LoggedCall> modemCalls(const IdentityRead& read)
{
    const Texts begin =
        readEntered(read, 0, 2) + availabilityAsked(0, 2, true) + Texts{"tel_get_cp_name_list()"};
    return {failureCall(
                read, "WithoutModemNames", [] { platform().setModems(std::nullopt); },
                begin + failureLogged(read)),
            failureCall(
                read, "WithoutModem", [] { platform().answer(initCall(0), -1); },
                begin + Texts{initCall(0)} + failureLogged(read)),
            failureCall(
                read, "ModemReadFailed", [] { platform().answer(imsiCall(0), 4); },
                slotFailed(read, 0, 2)),
            failureCall(
                read, "ModemReadFailedButFilled",
                [] { platform().answer(imsiCall(0), -1, imsiInfo(KOREAN_CARD)); },
                slotFailed(read, 0, 2)),
            foundCall(read, "OfEmptyCard", 0, 1, {"", "", "", ""})};
}

std::vector<LoggedCall> numberCalls(const IdentityRead& read)
{
    return {
        failureCall(
            read, "Null", [] { platform().answer(numberCall(0), 0); }, slotFailed(read, 0, 2)),
        failureCall(
            read, "Refused", [] { platform().answer(numberCall(0), -13); }, slotFailed(read, 0, 2)),
        foundCall(read, "Empty", 0, 1, {"450", "05", "1", ""})};
}

std::vector<LoggedCall> identityCalls()
{
    std::vector<LoggedCall> calls;
    for (const IdentityRead& read : identityReads()) {
        for (const LoggedCall& call :
             {foundCall(read, "InFirstSlot", 0, 1, KOREAN_CARD),
              foundCall(read, "InSecondSlot", 1, 2, AMERICAN_CARD),
              failureCall(
                  read, "WithoutCard", [] { setState(0, 0); }, slotUnavailable(read, 0, 2)),
              failureCall(
                  read, "LockedCard", [] { setState(0, 1); }, slotUnavailable(read, 0, 2)),
              failureCall(
                  read, "UnknownState", [] { setState(0, 7); }, slotUnavailable(read, 0, 2)),
              failureCall(
                  read, "StateReadFailed", [] { setState(0, 2, -13); },
                  slotUnavailable(read, 0, 2))})
            calls.push_back(call);
        for (const LoggedCall& call : read.isNumber ? numberCalls(read) : modemCalls(read))
            calls.push_back(call);
    }
    return calls;
}

INSTANTIATE_TEST_SUITE_P(SimIdentity, LoggedCallTest, testing::ValuesIn(identityCalls()),
                         rowName<LoggedCall>);

class SlotReadTest : public PlatformTest, public testing::WithParamInterface<IdentityRead> {
protected:
    const IdentityRead& read = GetParam();
    char preset = 'p';
};

INSTANTIATE_TEST_SUITE_P(Every, SlotReadTest, testing::ValuesIn(identityReads()),
                         rowName<IdentityRead>);

TEST_P(SlotReadTest, AnswerIsCopyThatTheCallerFrees)
{
    setSlots({KOREAN_CARD});
    char* const value = readSlot(read, 1, 0, 0, &preset);
    EXPECT_EQ(value, read.valueOf(KOREAN_CARD));
    EXPECT_EQ(ledger().origin(value), "copy: " + read.valueOf(KOREAN_CARD));
    std::free(value);
    // The platform's own number is kept: meant.
    const Texts rest = read.isNumber ? Texts{"platform: " + KOREAN_CARD.number} : Texts{};
    EXPECT_EQ(ledger().freeAll(), rest);
}

TEST_P(SlotReadTest, FailedCopyIsStillAnAnswer)
{
    platform().debugMode = 1;
    setSlots({KOREAN_CARD});
    {
        const FailingAllocation failure(Allocation::STRDUP);
        EXPECT_EQ(readSlot(read, 1, 0, 0, &preset), nullptr);
        EXPECT_TRUE(failure.happened());
    }
    Texts expected = slotRead(read, 0, 1, "");
    if (!read.isSecret)
        expected = readBegun(read, 0, 1) +
                   Texts{SIM_MANAGER.debug(read.name, read.foundLines.back() + "[(null)]")} +
                   readEnded(read, 0);
    EXPECT_EQ(platform().trace(), expected);
    ledger().freeAll();
}

TEST_P(SlotReadTest, EveryFailureCodeOfTheReadIsOneResult)
{
    setSlots({KOREAN_CARD, AMERICAN_CARD});
    for (const int code : PLATFORM_FAILURES) {
        platform().answer(readCall(read, 0), code);
        expectFailure(read);
        platform().reset();
        setSlots({KOREAN_CARD, AMERICAN_CARD});
    }
}

TEST_P(SlotReadTest, OtherSlotsAreNotAsked)
{
    setSlots({KOREAN_CARD, AMERICAN_CARD, KOREAN_CARD});
    std::free(readSlot(read, 3, 1, 0));
    for (const std::string& call : platform().texts(Event::Kind::CALL)) {
        EXPECT_EQ(call.find("slot 0"), std::string::npos) << call;
        EXPECT_EQ(call.find("slot 2"), std::string::npos) << call;
        EXPECT_EQ(call.find("cp0"), std::string::npos) << call;
        EXPECT_EQ(call.find("cp2"), std::string::npos) << call;
    }
    ledger().freeAll();
}

TEST_P(SlotReadTest, SecretsAreNeverFormatted)
{
    for (const int mode : {0, 1}) {
        platform().debugMode = mode;
        setSlots({KOREAN_CARD});
        std::free(readSlot(read, 1, 0, 0));
        EXPECT_FALSE(isIdentityTold(KOREAN_CARD));
        // The same search finds what may be told.
        EXPECT_EQ(isTold(read.valueOf(KOREAN_CARD)), mode == 1 && !read.isSecret);
        EXPECT_EQ(isInFormatBuffer(read.valueOf(KOREAN_CARD)), mode == 1 && !read.isSecret);
        ledger().freeAll();
        platform().reset();
    }
}

TEST_P(SlotReadTest, SecretsOfFailedReadsAreNeverFormatted)
{
    platform().debugMode = 1;
    setSlots({KOREAN_CARD});
    if (read.isNumber)
        platform().answer(numberCall(0), -1, KOREAN_CARD.number);
    else
        platform().answer(imsiCall(0), -1, imsiInfo(KOREAN_CARD));
    EXPECT_EQ(readSlot(read, 1, 0, read.failure), nullptr);
    EXPECT_FALSE(isIdentityTold(KOREAN_CARD));
    ledger().freeAll();
}

class ImsiReadTest : public SlotReadTest {
protected:
    // The value of a card, from any slot.
    std::string valueOf(const Card& card)
    {
        setSlots({card});
        char* const value = readSlot(read, 1, 0, 0);
        const std::string text = value;
        std::free(value);
        platform().reset();
        return text;
    }
};

INSTANTIATE_TEST_SUITE_P(Every, ImsiReadTest, testing::ValuesIn(imsiReads()),
                         rowName<IdentityRead>);

TEST_P(ImsiReadTest, PartsAreNeitherPaddedNorCut)
{
    for (const Card& card :
         {KOREAN_CARD, AMERICAN_CARD, Card{"001", "01", "0", ""}, Card{"45", "5", "12", ""},
          Card{"", "05", "", ""}, Card{"450", "", "8", ""}, Card{"", "", "", ""}})
        EXPECT_EQ(valueOf(card), read.valueOf(card));
}

TEST_P(ImsiReadTest, FieldWithoutItsNulEndsWhereTheFieldEnds)
{
    for (const Card& card :
         {Card{"4501", "05", "8173926450", ""}, Card{"450", "2601", "8173926450", ""},
          Card{"450", "260", "81739264501", ""}, Card{"4501", "2601", "81739264501", ""}})
        EXPECT_EQ(valueOf(card), read.valueOf(card));
}

TEST_P(ImsiReadTest, SlotAtTheEndOfTheNamesIsPassedOn)
{
    setState(2, TELEPHONY_SIM_STATE_AVAILABLE);
    platform().setModems(Texts{"cp0", "cp1"});
    platform().answer("tel_init(null)", -1);
    char* value = &preset;
    EXPECT_EQ(askSlot(read, 3, 2, &value), 4);
    EXPECT_EQ(value, nullptr);
    EXPECT_EQ(platform().texts(Event::Kind::CALL),
              (Texts{stateCall(2), "tel_get_cp_name_list()", "tel_init(null)"}));
}

TEST_P(ImsiReadTest, ModemIsReleasedAfterTheCopyWhateverItsReleaseAnswers)
{
    setSlots({KOREAN_CARD});
    platform().answer(modemCall("tel_deinit", 0), -1);
    Texts copiesThen;
    platform().onEvent = [&](const Event& event) {
        if (event.text == modemCall("tel_deinit", 0))
            copiesThen = ledger().live();
    };
    std::free(readSlot(read, 1, 0, 0));
    EXPECT_EQ(copiesThen, Texts{"copy: " + read.valueOf(KOREAN_CARD)});
}

class NumberReadTest : public PlatformTest {
protected:
    const IdentityRead& read = identityReads().back();
    char preset = 'p';
};

TEST_F(NumberReadTest, NumberIsCopiedAsItIs)
{
    for (const std::string& number : {std::string("+"), std::string("*#06#"), std::string("%s%n"),
                                      std::string("\xff\xc3\xa9\n"), std::string(1 << 20, '4')}) {
        platform().debugMode = 1;
        setSlots({Card{"450", "05", "1", number}});
        char* const value = readSlot(read, 1, 0, 0);
        EXPECT_EQ(value, number);
        std::free(value);
        ledger().freeAll();
        platform().reset();
    }
}

TEST_F(NumberReadTest, NumberOfFailedReadIsNotTaken)
{
    setSlots({KOREAN_CARD});
    platform().answer(numberCall(0), -1, KOREAN_CARD.number);
    EXPECT_EQ(readSlot(read, 1, 0, SIM_NOT_AVAILABLE, &preset), nullptr);
    EXPECT_THAT(ledger().freeAll(), ElementsAre("platform: " + KOREAN_CARD.number));
}

TEST_F(NumberReadTest, FailureIsThePlatformsCode)
{
    EXPECT_EQ(static_cast<int>(TELEPHONY_ERROR_SIM_NOT_AVAILABLE), SIM_NOT_AVAILABLE);
    EXPECT_EQ(static_cast<unsigned int>(SIM_NOT_AVAILABLE), 0xFDA01001u);
    EXPECT_EQ(read.failure, SIM_NOT_AVAILABLE);
}

} // namespace
