// SPDX-License-Identifier: Apache-2.0
// The facade's questions about the cards: is one there, are two?
#include "SimSlots.h"

using namespace fake;

namespace {

const int AVAILABLE = TELEPHONY_SIM_STATE_AVAILABLE;
const int LOCKED = TELEPHONY_SIM_STATE_LOCKED;
const int ABSENT = TELEPHONY_SIM_STATE_UNAVAILABLE;

void setStates(const std::vector<int>& states)
{
    setSlotCount(static_cast<unsigned int>(states.size()));
    int slot = 0;
    for (const int state : states)
        setState(slot++, state);
}

class SimCalls : public std::vector<LoggedCall> {
public:
    typedef std::function<bool()> Question;

    void add(const std::string& name, const Question& ask, bool expected, const Texts& live,
             const Texts& trace, const std::function<void()>& prepare)
    {
        const auto run = [=] {
            prepare();
            EXPECT_EQ(ask(), expected);
            EXPECT_EQ(platform().liveHandles(), live);
        };
        push_back({name, run, trace});
    }

    // `asked` slots are asked in order; a line of the facade's own may follow.
    void addWalk(const std::string& name, const Question& ask, const std::string& entry,
                 const std::vector<int>& states, int asked, bool expected, const Texts& result = {})
    {
        const auto count = static_cast<unsigned int>(states.size());
        Texts trace = Texts{entry} + accessed(listTaken(count));
        for (int slot = 0; slot < asked; ++slot) {
            const bool available = states[static_cast<std::size_t>(slot)] == AVAILABLE;
            trace = trace + accessed(availabilityAsked(slot, count, available));
        }
        add(name, ask, expected, {}, trace + result + accessed(listReleased(count)),
            [=] { setStates(states); });
    }

    void addWithoutList(const std::string& name, const Question& ask, const std::string& entry)
    {
        const Texts trace = Texts{entry} + accessed(noListTaken());
        add(name + "WithoutTelephony", ask, false, {}, trace, [] { setNoTelephony(); });
        add(name + "WithoutSlots", ask, false, {"list of 0"}, trace, [] { setSlotCount(0); });
    }
};

SimCalls availableCalls()
{
    const auto ask = [] { return coreSystem().IsSimAvailable(); };
    const std::string entry = CORE_SYSTEM.debug("IsSimAvailable", "CoreSystem IsSimAvailable()");
    SimCalls calls;
    const auto add = [&](const std::string& name, const std::vector<int>& states, int asked,
                         bool expected) {
        calls.addWalk("SimAvailable" + name, ask, entry, states, asked, expected);
    };
    add("InOnlySlot", {AVAILABLE}, 1, true);
    add("InFirstSlotAndNoOtherIsAsked", {AVAILABLE, AVAILABLE, ABSENT}, 1, true);
    add("InSecondSlotOnly", {ABSENT, AVAILABLE}, 2, true);
    add("InLastSlotOnly", {LOCKED, ABSENT, AVAILABLE}, 3, true);
    add("NotWhereLocked", {LOCKED}, 1, false);
    add("InNoSlot", {ABSENT, LOCKED, 3, 7, -1}, 5, false);
    calls.addWithoutList("SimAvailable", ask, entry);
    return calls;
}

SimCalls dualCalls()
{
    const auto ask = &CoreSystemInternals::isDualSimAvailable;
    const std::string method = "IsDualSimAvailable";
    const std::string entry = CORE_SYSTEM.debug(method, "CoreSystem IsDualSimAvailable()");
    SimCalls calls;
    const auto add = [&](const std::string& name, const std::vector<int>& states, int asked,
                         bool expected) {
        const std::string result = expected ? "DualSimAvailable." : "NO DualSim MODE";
        calls.addWalk("DualSim" + name, ask, entry, states, asked, expected,
                      {CORE_SYSTEM.debug(method, result)});
    };
    add("InBothSlots", {AVAILABLE, AVAILABLE}, 2, true);
    add("InFirstSlotOnly", {AVAILABLE, ABSENT}, 2, false);
    add("InSecondSlotOnlyAndItIsNotAsked", {ABSENT, AVAILABLE}, 1, false);
    add("NotWhereLocked", {LOCKED, LOCKED}, 1, false);
    add("NotInSecondAndThirdSlot", {ABSENT, AVAILABLE, AVAILABLE}, 1, false);
    add("InFirstTwoOfThreeSlots", {AVAILABLE, AVAILABLE, AVAILABLE}, 2, true);
    calls.addWithoutList("DualSim", ask, entry);
    // The one list that is not released: meant.
    const std::string single = "[Single Sim Device] Not support Dual Sim.";
    calls.add("DualSimOnSingleSlotKeepsTheList", ask, false, {"list of 1"},
              Texts{entry} + accessed(listTaken(1)) + Texts{CORE_SYSTEM.error(method, single)},
              [] { setStates({AVAILABLE}); });
    return calls;
}

// Handed on without a line of the facade's own.
SimCalls existsCalls()
{
    SimCalls calls;
    for (const auto& [state, name] : {std::pair{AVAILABLE, "AVAILABLE"}, {LOCKED, "LOCKED"}}) {
        const auto line = [](const std::string& text) {
            return SIM_MANAGER.debug("IsSimExist", text);
        };
        calls.add(
            std::string("SimExists") + name, [] { return coreSystem().IsSimExist(); },
            state == AVAILABLE, {},
            accessed(lockedThroughout(
                {"telephony_init()", stateCall(0), line("RESULT sim_get_state[0] : 0 | 0"),
                 line(std::string("SIM STATE[0] : TELEPHONY_SIM_STATE_") + name), deinitCall(1)})),
            [state = state] { setStates({state}); });
    }
    return calls;
}

LOGGED_CALLS(SimAvailable, availableCalls());
LOGGED_CALLS(DualSim, dualCalls());
LOGGED_CALLS(SimExists, existsCalls());

class CoreSystemSimTest : public PlatformTest {};

TEST_F(CoreSystemSimTest, CardThatGoesBetweenTwoSlotTestsIsNotAvailable)
{
    setStates({AVAILABLE, AVAILABLE});
    platform().onEvent = [](const Event& event) {
        if (event.text == stateCall(0))
            setState(1, ABSENT);
    };
    EXPECT_FALSE(CoreSystemInternals::isDualSimAvailable());
}

} // namespace
