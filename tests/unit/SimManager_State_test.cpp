// SPDX-License-Identifier: Apache-2.0
// Handle lists and the state of the cards.
#include "SimSlots.h"

using namespace fake;
using testing::ElementsAre;
using testing::IsEmpty;

namespace {

const int AVAILABLE = TELEPHONY_SIM_STATE_AVAILABLE;

struct StateName {
    int state;
    std::string name;
};

// Every state of the platform, and some that it does not have.
const StateName STATES[] = {
    {0, "TELEPHONY_SIM_STATE_UNAVAILABLE"},
    {1, "TELEPHONY_SIM_STATE_LOCKED"},
    {2, "TELEPHONY_SIM_STATE_AVAILABLE"},
    {3, "TELEPHONY_SIM_STATE_UNKNOWN"},
    {4, "-"},
    {-1, "-"},
};

void expectNotTaken(const Texts& live)
{
    telephony_h preset = nullptr;
    telephony_handle_list_s list = {7, &preset};
    EXPECT_FALSE(simManager().SuccessToInitTelephonyHandle(&list));
    EXPECT_EQ(list.count, 7u);
    EXPECT_EQ(list.handle, &preset);
    EXPECT_EQ(platform().liveHandles(), live);
}

class StateCalls : public std::vector<LoggedCall> {
public:
    void add(const std::string& name, const Texts& trace, const std::function<void()>& run)
    {
        push_back({name, run, trace});
    }
};

void addListCalls(StateCalls& calls)
{
    calls.add("ListRefused", noListTaken(), [] {
        setNoTelephony(-22);
        expectNotTaken({});
    });
    calls.add("ListRefusedButFilled", noListTaken(), [] {
        platform().answer("telephony_init()", 1, 2u);
        expectNotTaken({"list of 2"});
    });
    // Not released: meant.
    calls.add("ListOfNoSlots", noListTaken(), [] {
        setSlotCount(0);
        expectNotTaken({"list of 0"});
    });
    calls.add("ListReleaseRefused", listReleased(2), [] {
        platform().answer("telephony_deinit(list of 2)", -22);
        simManager().DeleteTelephonyHandle(openList(2));
    });
    const Texts released = {listReleased(0)[0], "telephony_deinit(no list)"};
    calls.add("NoListReleased", released, [] {
        setNoTelephony();
        simManager().DeleteTelephonyHandle({0, nullptr});
    });
}

// What succeeds does so for the facade.
void addFailedAvailability(StateCalls& calls, const std::string& name, int code)
{
    calls.add(name, availabilityAsked(0, 3, false), [=] {
        setState(0, AVAILABLE, code);
        EXPECT_FALSE(simManager().IsSimAvailable(openList(3), 0));
        EXPECT_THAT(platform().liveHandles(), ElementsAre("list of 3"));
    });
}

// True is failure: meant.
void addStateRead(StateCalls& calls, const std::string& name, int state, int code)
{
    const std::string line = "SIM STATE[" + std::to_string(code) + "]";
    const Texts trace = {stateCall(0), SIM_MANAGER.debug("GetSimState", line)};
    calls.add(name, lockedThroughout(trace), [=] {
        setState(0, state, code);
        telephony_sim_state_e slot = TELEPHONY_SIM_STATE_UNKNOWN;
        EXPECT_EQ(simManager().GetSimState(openList(1).handle, &slot), code != 0);
        int read = 99;
        std::memcpy(&read, &slot, sizeof read);
        EXPECT_EQ(read, state);
    });
}

Texts existenceSlotAsked(int slot, int code, const std::string& stateName)
{
    const std::string index = "[" + std::to_string(slot) + "] : ";
    std::ostringstream result; // the result twice: meant
    result << "RESULT sim_get_state" << index << code << " | " << std::hex << unsigned(code);
    Texts trace = {stateCall(slot), SIM_MANAGER.debug("IsSimExist", result.str())};
    if (code == 0)
        trace.push_back(SIM_MANAGER.debug("IsSimExist", "SIM STATE" + index + stateName));
    return trace;
}

struct SlotAnswer {
    int code;
    int state;
    std::string name;
};

void addExistence(StateCalls& calls, const std::string& name, bool exists,
                  const std::vector<SlotAnswer>& slots, int codeOfRelease = 0)
{
    Texts trace = {"telephony_init()"};
    int asked = 0;
    for (const SlotAnswer& answer : slots)
        trace = trace + existenceSlotAsked(asked++, answer.code, answer.name);
    const auto count = static_cast<unsigned int>(slots.size());
    calls.add(name, lockedThroughout(trace + Texts{deinitCall(count)}), [=] {
        setSlotCount(count);
        for (std::size_t slot = 0; slot < count; ++slot)
            setState(static_cast<int>(slot), slots[slot].state, slots[slot].code);
        platform().answer(deinitCall(count), codeOfRelease);
        EXPECT_EQ(simManager().IsSimExist(), exists);
        EXPECT_THAT(platform().liveHandles(), IsEmpty());
    });
}

void addExistenceCalls(StateCalls& calls)
{
    const SlotAnswer available = {0, 2, "TELEPHONY_SIM_STATE_AVAILABLE"};
    const SlotAnswer locked = {0, 1, "TELEPHONY_SIM_STATE_LOCKED"};
    const SlotAnswer failed = {-13, 2, ""};
    addExistence(calls, "ExistsInNoSlot", false, {});
    addExistence(calls, "ExistsInFirstSlotAndAllAreAsked", true, {available, locked, failed});
    addExistence(calls, "ExistsInLastSlot", true, {failed, locked, available});
    addExistence(calls, "ExistsInEverySlot", true, {available, available});
    addExistence(calls, "ExistsNotWhereTheReadFailed", false, {failed, failed});
    addExistence(calls, "ExistsNotWhereTheReadFailedAboveZero", false, {{1, 2, ""}});
    addExistence(calls, "ExistsWhateverTheReleaseAnswers", true, {available}, -22);
    // Released all the same, also what a failed call left: meant.
    const Texts released = {"telephony_init()", "telephony_deinit(no list)"};
    calls.add("ExistsWithoutTelephony", lockedThroughout(released), [] {
        setNoTelephony();
        EXPECT_FALSE(simManager().IsSimExist());
    });
    calls.add("ExistsWithListOfFailedCall", lockedThroughout({"telephony_init()", deinitCall(2)}),
              [] {
                  setSlotCount(2);
                  platform().answer("telephony_init()", 1, 2u);
                  EXPECT_FALSE(simManager().IsSimExist());
                  EXPECT_THAT(platform().liveHandles(), IsEmpty());
              });
}

StateCalls simStateCalls()
{
    StateCalls calls;
    addListCalls(calls);
    addExistenceCalls(calls);
    addFailedAvailability(calls, "AvailableButReadFailed", -13);
    addFailedAvailability(calls, "AvailableButReadFailedAboveZero", 1);
    addStateRead(calls, "StateReadFailed", AVAILABLE, -13);
    addStateRead(calls, "StateReadFailedAboveZero", 0, 1);
    int row = 0;
    for (const auto& [state, name] : STATES) {
        const std::string suffix = "ByState" + std::to_string(row++);
        addStateRead(calls, "StateRead" + suffix, state, 0);
        addExistence(calls, "Exists" + suffix, state == AVAILABLE, {{0, state, name}});
    }
    return calls;
}

LOGGED_CALLS(SimState, simStateCalls());

class SimStateTest : public PlatformTest {};

TEST_F(SimStateTest, StateThatWasNotToldIsNotAvailable)
{
    setSlotCount(1);
    platform().answer(stateCall(0), 0); // success, and nothing written
    EXPECT_FALSE(sim.IsSimAvailable(openList(1), 0));
    EXPECT_FALSE(sim.IsSimExist());
}

TEST_F(SimStateTest, StateIsOfTheHandleThatIsPointedTo)
{
    setState(1, AVAILABLE);
    telephony_sim_state_e state = TELEPHONY_SIM_STATE_LOCKED;
    EXPECT_FALSE(sim.GetSimState(openList(2).handle + 1, &state));
    EXPECT_EQ(state, TELEPHONY_SIM_STATE_AVAILABLE);
}

} // namespace
