// SPDX-License-Identifier: Apache-2.0
// The facade's questions about the cards: is one there, are two?
#include "SimSlots.h"

using namespace fake;

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

INSTANTIATE_TEST_SUITE_P(Sim, LoggedCallTest, testing::ValuesIn(simCalls()), rowName<LoggedCall>);

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
    }
}

} // namespace
