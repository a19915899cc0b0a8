// SPDX-License-Identifier: Apache-2.0
// The telephony functions over a backend that answers what a test says.
#include <cstdlib>
#include <new>

#include <gmock/gmock.h>
#include <tapi_common.h>
#include <telephony.h>

#include "coresystem_port.h"
#include "shim/Telephony.h"
#include "support/FakeBackend.h"
#include "support/Together.h"

using coresystem_port::lastOrigin;
using coresystem_port::Question;
using testing::Each;
using testing::ElementsAre;
using testing::IsEmpty;

namespace {

bool noMemory = false;

} // namespace

// The linker sends every strdup here.
extern "C" char* __real_strdup(const char* text);
extern "C" char* __wrap_strdup(const char* text)
{
    return noMemory ? nullptr : __real_strdup(text);
}

namespace {

using SlotHandles = port::Handles<telephony_h, port::SlotName>;

char* const UNTOUCHED = reinterpret_cast<char*>(1);

const std::pair<port::Error, int> ERRORS[] = {{port::notAvailable("no service"), -39845887},
                                              {port::notSupported("a tablet"), -1073741822},
                                              {port::denied("private"), -13}};

class TelephonyTest : public testing::Test {
protected:
    ~TelephonyTest() override
    {
        noMemory = false;
        if (slot != UNTOUCHED)
            free(slot);
    }

    telephony_h open()
    {
        EXPECT_EQ(0, telephony_init(&list));
        telephony.questions.clear();
        return list.count > 0 ? list.handle[0] : nullptr;
    }

    FakedBackend backend;
    FakeTelephony& telephony = backend.fakeTelephony;
    telephony_handle_list_s list = {};
    char* slot = UNTOUCHED;
    telephony_sim_state_e simState = static_cast<telephony_sim_state_e>(3);
};

// A list that is released with the test.
class TelephonyListTest : public TelephonyTest {
protected:
    TelephonyListTest() : handle(open()) {}
    ~TelephonyListTest() override
    {
        EXPECT_EQ(0, telephony_deinit(&list));
        EXPECT_EQ(0U, port::liveTelephonyLists());
        EXPECT_EQ(0U, SlotHandles::live());
    }

    const telephony_h handle;
};

TEST_F(TelephonyTest, ListHasOneHandlePerSlotInOrder)
{
    telephony.slotsAnswer = answered(FakeTelephony::Names{"a", "b", "c"});
    ASSERT_EQ(0, telephony_init(&list));
    ASSERT_EQ(3U, list.count);
    bool roaming = false;
    telephony.questions.clear();
    for (const unsigned number : {2U, 0U, 1U})
        EXPECT_EQ(0, telephony_network_get_roaming_status(list.handle[number], &roaming));
    EXPECT_THAT(telephony.questions, ElementsAre("roaming c", "roaming a", "roaming b"));
    EXPECT_EQ("test", lastOrigin(Question::SimSlots).source);
    EXPECT_EQ(0, telephony_deinit(&list));
}

TEST_F(TelephonyTest, EveryListIsCountedUntilItsReleaseEmptiesIt)
{
    telephony_handle_list_s second = {};
    ASSERT_EQ(0, telephony_init(&list));
    ASSERT_EQ(0, telephony_init(&second));
    EXPECT_EQ(2U, port::liveTelephonyLists());
    EXPECT_EQ(4U, SlotHandles::live());
    telephony_handle_list_s copy = list;
    EXPECT_EQ(0, telephony_deinit(&list));
    EXPECT_EQ(0U, list.count);
    EXPECT_EQ(nullptr, list.handle);
    EXPECT_EQ(-22, telephony_deinit(&copy));
    EXPECT_EQ(1U, port::liveTelephonyLists());
    EXPECT_EQ(2U, SlotHandles::live());
    EXPECT_EQ(0, telephony_deinit(&second));
    EXPECT_EQ(0U, port::liveTelephonyLists());
}

TEST_F(TelephonyTest, ListThatWasNeverFilledIsNoError)
{
    EXPECT_EQ(0, telephony_deinit(&list));
    list.count = 7; // whatever was on the stack
    EXPECT_EQ(0, telephony_deinit(&list));
    EXPECT_EQ(0U, list.count);
}

TEST_F(TelephonyTest, ForeignListIsInvalidAndLeftAloneAndSoIsNone)
{
    telephony_h foreign[1] = {nullptr};
    list = {1, foreign};
    EXPECT_EQ(-22, telephony_deinit(&list));
    EXPECT_EQ(foreign, list.handle);
    EXPECT_EQ(1U, list.count);
    EXPECT_EQ(-22, telephony_init(nullptr));
    EXPECT_EQ(-22, telephony_deinit(nullptr));
    EXPECT_THAT(telephony.questions, IsEmpty());
}

TEST_F(TelephonyTest, ServiceWithoutAModemIsAnEmptyList)
{
    telephony.slotsAnswer = answered(FakeTelephony::Names{});
    list = {7, nullptr};
    EXPECT_EQ(0, telephony_init(&list));
    EXPECT_EQ(0U, list.count);
    EXPECT_EQ(nullptr, list.handle);
    EXPECT_EQ(0U, port::liveTelephonyLists());
    EXPECT_TRUE(lastOrigin(Question::SimSlots).available);
}

TEST_F(TelephonyTest, ListThatCannotBeHadSaysWhyAndStaysUntouched)
{
    for (const auto& [error, code] : ERRORS) {
        telephony.slotsAnswer = error;
        list = {7, nullptr};
        EXPECT_EQ(code, telephony_init(&list));
        EXPECT_EQ(7U, list.count);
        EXPECT_EQ(error.reason, lastOrigin(Question::SimSlots).reason);
    }
}

TEST_F(TelephonyListTest, EachReadIsOneQuestion)
{
    EXPECT_EQ(0, telephony_sim_get_state(handle, &simState));
    EXPECT_THAT(telephony.questions, ElementsAre("card modem0"));
}

TEST_F(TelephonyListTest, RoamingIsToldWhateverTheServiceIs)
{
    const port::ServiceState services[] = {port::ServiceState::InService,
                                           port::ServiceState::OutOfService,
                                           port::ServiceState::EmergencyOnly};
    for (int number = 0; number < 3; ++number)
        for (const bool roams : {true, false}) {
            telephony.serviceAnswer = answered(services[number]);
            telephony.roamingAnswer = answered(roams);
            auto service = static_cast<telephony_network_service_state_e>(3);
            bool roaming = !roams;
            EXPECT_EQ(0, telephony_network_get_service_state(handle, &service));
            EXPECT_EQ(0, telephony_network_get_roaming_status(handle, &roaming));
            EXPECT_EQ(number, service);
            EXPECT_EQ(roams, roaming);
        }
}

TEST_F(TelephonyListTest, TextsAreCopiesOfTheCallersOwn)
{
    char* second = nullptr;
    ASSERT_EQ(0, telephony_modem_get_imei(handle, &slot));
    ASSERT_EQ(0, telephony_modem_get_imei(handle, &second));
    EXPECT_STREQ("490154203237518", slot);
    EXPECT_STREQ("490154203237518", second);
    EXPECT_NE(slot, second);
    free(second);
    free(std::exchange(slot, UNTOUCHED));
    ASSERT_EQ(0, telephony_sim_get_subscriber_number(handle, &slot));
    EXPECT_STREQ("+15550100", slot);
}

TEST_F(TelephonyListTest, CardWithoutANumberStoresNullAndIsAnErrorUnlessAFileAsksForSuccess)
{
    for (const auto& [number, code] : {std::pair(FakeTelephony::Number(), -39845887), {"", 0}}) {
        telephony.numberAnswer = answered(number);
        slot = UNTOUCHED;
        EXPECT_EQ(code, telephony_sim_get_subscriber_number(handle, &slot));
        EXPECT_EQ(nullptr, slot);
    }
}

// The result of every read by a handle, none of which may store anything.
std::vector<int> failAll(telephony_h handle)
{
    telephony_sim_state_e state = TELEPHONY_SIM_STATE_LOCKED;
    telephony_network_service_state_e service = TELEPHONY_NETWORK_SERVICE_STATE_EMERGENCY_ONLY;
    bool roaming = true;
    char* text = UNTOUCHED;
    std::vector<int> results = {telephony_sim_get_state(handle, &state),
                                telephony_sim_get_subscriber_number(handle, &text),
                                telephony_modem_get_imei(handle, &text),
                                telephony_network_get_service_state(handle, &service),
                                telephony_network_get_roaming_status(handle, &roaming)};
    EXPECT_EQ(UNTOUCHED, text);
    EXPECT_EQ(TELEPHONY_SIM_STATE_LOCKED, state);
    EXPECT_EQ(TELEPHONY_NETWORK_SERVICE_STATE_EMERGENCY_ONLY, service);
    EXPECT_TRUE(roaming);
    return results;
}

TEST_F(TelephonyListTest, EveryErrorHasItsCodeAndLeavesTheSlotUntouched)
{
    std::vector<std::pair<port::Error, int>> errors(std::begin(ERRORS), std::end(ERRORS));
    errors.emplace_back(port::noSim("no card"), -39841791);
    for (const auto& [error, code] : errors) {
        telephony.cardAnswer = error;
        telephony.numberAnswer = error;
        telephony.imeiAnswer = error;
        telephony.serviceAnswer = error;
        telephony.roamingAnswer = error;
        EXPECT_THAT(failAll(handle), Each(code));
        for (const Question question : {Question::SimCard, Question::PhoneNumber, Question::Imei,
                                        Question::NetworkService, Question::Roaming})
            EXPECT_EQ(error.reason, lastOrigin(question).reason);
    }
}

TEST_F(TelephonyTest, NullReleasedAndForeignHandlesAreInvalid)
{
    const telephony_h released = open();
    EXPECT_EQ(0, telephony_deinit(&list));
    TapiHandle* const modem = port::Handles<TapiHandle*, port::SlotName>::open("modem0");
    telephony_h otherKind = nullptr;
    std::memcpy(&otherKind, &modem, sizeof otherKind);
    int onTheStack = 0;
    for (const telephony_h handle :
         {telephony_h{}, released, otherKind, reinterpret_cast<telephony_h>(&onTheStack)})
        EXPECT_THAT(failAll(handle), Each(-22));
    EXPECT_THAT(telephony.questions, IsEmpty());
    EXPECT_TRUE((port::Handles<TapiHandle*, port::SlotName>::close(modem)));
}

TEST_F(TelephonyListTest, NullSlotsAreInvalid)
{
    EXPECT_EQ(-22, telephony_sim_get_state(handle, nullptr));
    EXPECT_EQ(-22, telephony_sim_get_subscriber_number(handle, nullptr));
    EXPECT_EQ(-22, telephony_modem_get_imei(handle, nullptr));
    EXPECT_EQ(-22, telephony_network_get_service_state(handle, nullptr));
    EXPECT_EQ(-22, telephony_network_get_roaming_status(handle, nullptr));
    EXPECT_THAT(telephony.questions, IsEmpty());
}

TEST_F(TelephonyListTest, MissingMemoryIsNamed)
{
    noMemory = true;
    EXPECT_EQ(-12, telephony_modem_get_imei(handle, &slot));
    EXPECT_EQ(-12, telephony_sim_get_subscriber_number(handle, &slot));
    EXPECT_EQ(UNTOUCHED, slot);
    telephony.before = [] { throw std::bad_alloc(); };
    EXPECT_EQ(-12, telephony_sim_get_state(handle, &simState));
}

TEST_F(TelephonyListTest, NoExceptionLeaves)
{
    telephony.before = [] { throw std::string("trouble"); };
    EXPECT_EQ(-39845887, telephony_sim_get_state(handle, &simState));
    telephony_handle_list_s other = {};
    EXPECT_EQ(-39845887, telephony_init(&other));
    EXPECT_EQ(nullptr, other.handle);
}

TEST_F(TelephonyTest, WhatABackendDoesNotAnswerIsNoTelephony)
{
    EXPECT_EQ("no telephony", telephony.iccid("modem0").error().reason);
    EXPECT_EQ("no telephony", telephony.reports().error().reason);
}

TEST_F(TelephonyTest, ThreadsMayOpenAskAndReleaseAtOnce)
{
    together(8, [](int) {
        for (int round = 0; round < 100; ++round) {
            telephony_handle_list_s mine = {};
            ASSERT_EQ(0, telephony_init(&mine));
            char* imei = nullptr;
            EXPECT_EQ(0, telephony_modem_get_imei(mine.handle[1], &imei));
            free(imei);
            EXPECT_EQ(0, telephony_deinit(&mine));
        }
    });
    EXPECT_EQ(0U, port::liveTelephonyLists());
    EXPECT_EQ(0U, SlotHandles::live());
}

} // namespace
