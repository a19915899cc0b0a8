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
    {7, "-"},
    {-1, "-"},
    {INT32_MIN, "-"},
};

// Takes a list into a structure that holds another one; what happened to it.
void expectTaken(unsigned int count)
{
    telephony_handle_list_s list = {7, nullptr};
    EXPECT_TRUE(simManager().SuccessToInitTelephonyHandle(&list));
    EXPECT_EQ(list.count, count);
    EXPECT_NE(list.handle, nullptr);
    EXPECT_EQ(callText("", list.handle[count - 1]), slotCall("", static_cast<int>(count) - 1));
    EXPECT_THAT(platform().liveHandles(), ElementsAre(listName(count)));
}

void expectNotTaken(const Texts& live)
{
    telephony_h preset = nullptr;
    telephony_handle_list_s list = {7, &preset};
    EXPECT_FALSE(simManager().SuccessToInitTelephonyHandle(&list));
    EXPECT_EQ(list.count, 7u);
    EXPECT_EQ(list.handle, &preset);
    EXPECT_EQ(platform().liveHandles(), live);
}

std::vector<LoggedCall> listCalls()
{
    return {
        {"ListTaken",
         [] {
             setSlotCount(2);
             expectTaken(2);
         },
         listTaken(2)},
        {"ListOfOneSlotTaken",
         [] {
             setSlotCount(1);
             expectTaken(1);
         },
         listTaken(1)},
        {"ListRefused",
         [] {
             setNoTelephony(-22);
             expectNotTaken({});
         },
         noListTaken()},
        {"ListRefusedButFilled",
         [] {
             platform().answer("telephony_init()", 1, 2u);
             expectNotTaken({"list of 2"});
         },
         noListTaken()},
        // Not released: meant.
        {"ListOfNoSlots",
         [] {
             setSlotCount(0);
             expectNotTaken({"list of 0"});
         },
         noListTaken()},
        {"ListReleased",
         [] {
             setSlotCount(2);
             const telephony_handle_list_s list = openList(2);
             simManager().DeleteTelephonyHandle(list);
             EXPECT_EQ(list.count, 2u);
             EXPECT_THAT(platform().liveHandles(), IsEmpty());
         },
         listReleased(2)},
        {"ListReleaseRefused",
         [] {
             platform().answer("telephony_deinit(list of 2)", -22);
             simManager().DeleteTelephonyHandle(openList(2));
         },
         listReleased(2)},
        {"NoListReleased",
         [] {
             setNoTelephony();
             simManager().DeleteTelephonyHandle({0, nullptr});
         },
         {SIM_MANAGER.debug("DeleteTelephonyHandle", "DeleteTelephonyHandle"),
          "telephony_deinit(no list)"}},
    };
}

LoggedCall availabilityCall(const std::string& name, int slot, int state, int code)
{
    const bool available = state == AVAILABLE && code == 0;
    return {name,
            [=] {
                setState(slot, state, code);
                EXPECT_EQ(simManager().IsSimAvailable(openList(3), slot), available);
                EXPECT_THAT(platform().liveHandles(), ElementsAre("list of 3"));
            },
            availabilityAsked(slot, 3, available)};
}

std::vector<LoggedCall> availabilityCalls()
{
    std::vector<LoggedCall> calls = {
        availabilityCall("AvailableInFirstSlot", 0, AVAILABLE, 0),
        availabilityCall("AvailableInSecondSlot", 1, AVAILABLE, 0),
        availabilityCall("AvailableInLastSlot", 2, AVAILABLE, 0),
        availabilityCall("AvailableButReadFailed", 0, AVAILABLE, -13),
        availabilityCall("AvailableButReadFailedAboveZero", 0, AVAILABLE, 1),
    };
    for (std::size_t row = 0; row < std::size(STATES); ++row)
        if (STATES[row].state != AVAILABLE)
            calls.push_back(availabilityCall("NotAvailableState" + std::to_string(row), 1,
                                             STATES[row].state, 0));
    return calls;
}

// True is failure: meant.
LoggedCall stateCallOf(const std::string& name, int state, int code)
{
    return {name,
            [=] {
                setState(0, state, code);
                telephony_handle_list_s list = openList(1);
                int read = 99;
                telephony_sim_state_e slot = TELEPHONY_SIM_STATE_UNKNOWN;
                EXPECT_EQ(simManager().GetSimState(list.handle, &slot), code != 0);
                std::memcpy(&read, &slot, sizeof read);
                EXPECT_EQ(read, state);
            },
            lockedThroughout(
                {stateCall(0),
                 SIM_MANAGER.debug("GetSimState", "SIM STATE[" + std::to_string(code) + "]")})};
}

std::vector<LoggedCall> stateCalls()
{
    std::vector<LoggedCall> calls = {stateCallOf("StateReadFailed", AVAILABLE, -13),
                                     stateCallOf("StateReadFailedAboveZero", 0, 1)};
    for (std::size_t row = 0; row < std::size(STATES); ++row)
        calls.push_back(stateCallOf("StateRead" + std::to_string(row), STATES[row].state, 0));
    return calls;
}

std::string hexadecimal(int number)
{
    std::ostringstream out;
    out << std::hex << static_cast<unsigned int>(number);
    return out.str();
}

Texts existenceSlotAsked(int slot, int code, const std::string& stateName)
{
    const std::string index = "[" + std::to_string(slot) + "] : ";
    Texts trace = {stateCall(slot), SIM_MANAGER.debug("IsSimExist", "RESULT sim_get_state" + index +
                                                                        std::to_string(code) +
                                                                        " | " + hexadecimal(code))};
    if (code == 0)
        trace.push_back(SIM_MANAGER.debug("IsSimExist", "SIM STATE" + index + stateName));
    return trace;
}

struct SlotAnswer {
    int code;
    int state;
    std::string name;
};

LoggedCall existenceCall(const std::string& name, const std::vector<SlotAnswer>& slots, bool exists)
{
    Texts trace = {"telephony_init()"};
    for (std::size_t slot = 0; slot < slots.size(); ++slot)
        trace =
            trace + existenceSlotAsked(static_cast<int>(slot), slots[slot].code, slots[slot].name);
    const auto count = static_cast<unsigned int>(slots.size());
    trace.push_back(deinitCall(count));
    return {name,
            [=] {
                setSlotCount(count);
                for (std::size_t slot = 0; slot < slots.size(); ++slot)
                    setState(static_cast<int>(slot), slots[slot].state, slots[slot].code);
                EXPECT_EQ(simManager().IsSimExist(), exists);
                EXPECT_THAT(platform().liveHandles(), IsEmpty());
            },
            lockedThroughout(trace)};
}

std::vector<LoggedCall> existenceCalls()
{
    const SlotAnswer available = {0, 2, "TELEPHONY_SIM_STATE_AVAILABLE"};
    const SlotAnswer locked = {0, 1, "TELEPHONY_SIM_STATE_LOCKED"};
    const SlotAnswer failed = {-13, 2, ""};
    std::vector<LoggedCall> calls = {
        existenceCall("ExistsInNoSlot", {}, false),
        existenceCall("ExistsInFirstSlotAndAllAreAsked", {available, locked, failed}, true),
        existenceCall("ExistsInLastSlot", {failed, locked, available}, true),
        existenceCall("ExistsInEverySlot", {available, available}, true),
        existenceCall("ExistsNotWhereTheReadFailed", {failed, failed}, false),
        existenceCall("ExistsNotWhereTheReadFailedAboveZero", {{1, 2, ""}}, false),
    };
    for (std::size_t row = 0; row < std::size(STATES); ++row)
        calls.push_back(existenceCall("ExistsByState" + std::to_string(row),
                                      {{0, STATES[row].state, STATES[row].name}},
                                      STATES[row].state == AVAILABLE));
    // Released all the same, also what a failed call left: meant.
    calls.push_back({"ExistsWithoutTelephony",
                     [] {
                         setNoTelephony();
                         EXPECT_FALSE(simManager().IsSimExist());
                     },
                     lockedThroughout({"telephony_init()", "telephony_deinit(no list)"})});
    calls.push_back({"ExistsWithListOfFailedCall",
                     [] {
                         setSlotCount(2);
                         platform().answer("telephony_init()", 1, 2u);
                         EXPECT_FALSE(simManager().IsSimExist());
                         EXPECT_THAT(platform().liveHandles(), IsEmpty());
                     },
                     lockedThroughout({"telephony_init()", deinitCall(2)})});
    calls.push_back({"ExistsWhateverTheReleaseAnswers",
                     [] {
                         setSlotCount(1);
                         setState(0, AVAILABLE);
                         platform().answer(deinitCall(1), -22);
                         EXPECT_TRUE(simManager().IsSimExist());
                     },
                     lockedThroughout(Texts{"telephony_init()"} +
                                      existenceSlotAsked(0, 0, "TELEPHONY_SIM_STATE_AVAILABLE") +
                                      Texts{deinitCall(1)})});
    return calls;
}

INSTANTIATE_TEST_SUITE_P(SimList, LoggedCallTest, testing::ValuesIn(listCalls()),
                         rowName<LoggedCall>);
INSTANTIATE_TEST_SUITE_P(SimAvailability, LoggedCallTest, testing::ValuesIn(availabilityCalls()),
                         rowName<LoggedCall>);
INSTANTIATE_TEST_SUITE_P(SimState, LoggedCallTest, testing::ValuesIn(stateCalls()),
                         rowName<LoggedCall>);
INSTANTIATE_TEST_SUITE_P(SimExistence, LoggedCallTest, testing::ValuesIn(existenceCalls()),
                         rowName<LoggedCall>);

class SimStateTest : public PlatformTest {
protected:
    telephony_handle_list_s list = {0, nullptr};
};

TEST_F(SimStateTest, EveryFailureCodeMeansNoList)
{
    for (const int code : PLATFORM_FAILURES) {
        setNoTelephony(code);
        EXPECT_FALSE(sim.SuccessToInitTelephonyHandle(&list)) << code;
    }
}

TEST_F(SimStateTest, EveryFailureCodeMeansNotAvailable)
{
    list = openList(1);
    for (const int code : PLATFORM_FAILURES) {
        setState(0, AVAILABLE, code);
        EXPECT_FALSE(sim.IsSimAvailable(list, 0)) << code;
    }
}

TEST_F(SimStateTest, StateThatWasNotToldIsNotAvailable)
{
    list = openList(1);
    setSlotCount(1);
    platform().answer(stateCall(0), 0); // success, and nothing written
    EXPECT_FALSE(sim.IsSimAvailable(list, 0));
    EXPECT_FALSE(sim.IsSimExist());
}

TEST_F(SimStateTest, TrueMeansThatTheStateWasNotRead)
{
    list = openList(1);
    for (const int code : PLATFORM_FAILURES) {
        platform().answer(stateCall(0), code);
        telephony_sim_state_e state = TELEPHONY_SIM_STATE_LOCKED;
        EXPECT_TRUE(sim.GetSimState(list.handle, &state)) << code;
        EXPECT_EQ(state, TELEPHONY_SIM_STATE_LOCKED);
    }
    for (const StateName& row : STATES) {
        setState(0, row.state);
        telephony_sim_state_e state = TELEPHONY_SIM_STATE_LOCKED;
        EXPECT_FALSE(sim.GetSimState(list.handle, &state)) << row.state;
    }
}

TEST_F(SimStateTest, StateIsOfTheHandleThatIsPointedTo)
{
    list = openList(2);
    setState(1, AVAILABLE);
    telephony_sim_state_e state = TELEPHONY_SIM_STATE_LOCKED;
    EXPECT_FALSE(sim.GetSimState(list.handle + 1, &state));
    EXPECT_EQ(state, TELEPHONY_SIM_STATE_AVAILABLE);
}

TEST_F(SimStateTest, LockIsFreeBetweenTwoSlots)
{
    list = openList(2);
    setState(0, AVAILABLE);
    setState(1, AVAILABLE);
    sim.IsSimAvailable(list, 0);
    sim.IsSimAvailable(list, 1);
    EXPECT_EQ(platform().trace(), lockedAround(stateCall(0)) + lockedAround(stateCall(1)));
}

TEST_F(SimStateTest, NothingIsCached)
{
    setSlotCount(1);
    for (const int state : {0, 2, 1, 2, 3}) {
        setState(0, state);
        EXPECT_EQ(sim.IsSimExist(), state == AVAILABLE);
        EXPECT_EQ(sim.IsSimAvailable(openList(1), 0), state == AVAILABLE);
    }
}

} // namespace
