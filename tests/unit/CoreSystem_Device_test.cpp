// SPDX-License-Identifier: Apache-2.0
// Device name, identifier, platform name, software version and model.
#include "support/PlatformTest.h"

using namespace fake;
using testing::IsEmpty;
using testing::StrEq;

namespace {

struct DeviceQuestion {
    std::string name;
    int (CoreSystem::*ask)(char** slot);
    std::string call;
    std::string entry;
    std::string result;   // what precedes the value in the result line
    bool showsResultCode; // ", ret : CODE" follows it
    bool copies;          // hands out a copy, and keeps the slot on failure
};

std::ostream& operator<<(std::ostream& out, const DeviceQuestion& question)
{
    return out << question.name;
}

const DeviceQuestion QUESTIONS[] = {
    {"GetDeviceName", &CoreSystem::GetDeviceName, "system_settings_get_value_string(21)",
     "CoreSystem::GetDeviceName", "deviceName : ", true, false},
    {"GetTizenIdN", &CoreSystem::GetTizenIdN,
     "system_info_get_platform_string(tizen.org/system/tizenid)", "CoreSystem::GetTizenID",
     "TizenID : ", false, true},
    {"GetPlatformName", &CoreSystem::GetPlatformName,
     "system_info_get_platform_string(tizen.org/system/platform.name)",
     "CoreSystem::GetPlatformName", "platformName : ", false, false},
    {"GetSWVersion", &CoreSystem::GetSWVersion,
     "system_info_get_platform_string(tizen.org/feature/platform.version)",
     "CoreSystem::GetSWVersion", "SW version : ", false, false},
    {"GetModelName", &CoreSystem::GetModelName,
     "system_info_get_platform_string(tizen.org/system/model_name)", "CoreSystem::GetModelName",
     "Model Name : ", false, false},
};

// Every code that the platform documents, and some that it does not.
const int DEVICE_FAILURES[] = {-22, -12, -5, -13,       -1073741822, -38141953,
                               -1,  1,   4,  INT32_MAX, INT32_MIN};

std::string resultLine(const DeviceQuestion& question, const std::string& value, int code)
{
    return CORE_SYSTEM.debug(
        question.name, question.result + value +
                           (question.showsResultCode ? ", ret : " + std::to_string(code) : ""));
}

// Asks with a slot that holds `preset`; what the slot holds then.
char* ask(const DeviceQuestion& question, int expectedCode, char* preset = nullptr)
{
    char* slot = preset;
    EXPECT_EQ((coreSystem().*question.ask)(&slot), expectedCode);
    return slot;
}

Texts answeredTrace(const DeviceQuestion& question, const std::string& value)
{
    return {CORE_SYSTEM.debug(question.name, question.entry), question.call,
            resultLine(question, value, 0)};
}

Texts failedTrace(const DeviceQuestion& question, int code)
{
    const Texts begin = {CORE_SYSTEM.debug(question.name, question.entry), question.call};
    if (!question.copies)
        return begin + Texts{resultLine(question, "(null)", code)};
    return begin +
           Texts{CORE_SYSTEM.error(
               question.name, "system_info_get_platform_string failed [" + std::to_string(code) +
                                  "] <- system_info_get_platform_string failed [%d]")};
}

std::vector<LoggedCall> loggedCalls()
{
    std::vector<LoggedCall> calls;
    for (const DeviceQuestion& question : QUESTIONS) {
        calls.push_back({question.name + "Answered",
                         [question] {
                             platform().answer(question.call, 0, std::string("a value"));
                             std::free(ask(question, 0));
                         },
                         answeredTrace(question, "a value")});
        calls.push_back({question.name + "Failed",
                         [question] {
                             platform().answer(question.call, -5);
                             ask(question, -5);
                         },
                         failedTrace(question, -5)});
        calls.push_back({question.name + "AnsweredNull",
                         [question] {
                             platform().answer(question.call, 0);
                             EXPECT_EQ(ask(question, 0), nullptr);
                         },
                         answeredTrace(question, "(null)")});
    }
    return calls;
}

INSTANTIATE_TEST_SUITE_P(Device, LoggedCallTest, testing::ValuesIn(loggedCalls()),
                         rowName<LoggedCall>);

class DeviceQuestionTest : public PlatformTest, public testing::WithParamInterface<DeviceQuestion> {
protected:
    const DeviceQuestion& question = GetParam();
    char preset = 'p';
};

INSTANTIATE_TEST_SUITE_P(Every, DeviceQuestionTest, testing::ValuesIn(QUESTIONS),
                         rowName<DeviceQuestion>);

TEST_P(DeviceQuestionTest, AnswerBelongsToTheCaller)
{
    platform().answer(question.call, 0, std::string("my device"));
    char* const value = ask(question, 0, &preset);
    ASSERT_THAT(value, StrEq("my device"));
    // One string is alive: the platform's own, or the copy of it.
    const std::string origin = question.copies ? "copy: my device" : "platform: my device";
    EXPECT_EQ(ledger().live(), Texts{origin});
    EXPECT_EQ(ledger().origin(value), origin);
    std::free(value);
    EXPECT_THAT(ledger().live(), IsEmpty());
}

TEST_P(DeviceQuestionTest, OddValuesPassThroughUnchanged)
{
    for (const std::string& odd : {std::string(), std::string("%s%n"),
                                   std::string("\xff\xc3\xa9\n"), std::string(10 << 20, 'n')})
        for (const int mode : {0, 1}) {
            platform().debugMode = mode;
            platform().answer(question.call, 0, odd);
            char* const value = ask(question, 0);
            EXPECT_TRUE(value == odd);
            std::free(value);
        }
}

TEST_P(DeviceQuestionTest, EveryFailureCodeIsReturnedUnchanged)
{
    for (const int code : DEVICE_FAILURES) {
        platform().forgetEvents();
        platform().debugMode = 1;
        platform().answer(question.call, code);
        char* const value = ask(question, code, &preset);
        EXPECT_EQ(value, question.copies ? &preset : nullptr);
        EXPECT_EQ(platform().trace(), failedTrace(question, code));
        EXPECT_THAT(ledger().live(), IsEmpty());
    }
}

TEST_P(DeviceQuestionTest, SlotAfterFailureIsWhatThePlatformLeftThere)
{
    char remains[] = "remains";
    platform().answer(question.call, -5, static_cast<char*>(remains));
    EXPECT_EQ(ask(question, -5, &preset), question.copies ? &preset : remains);
    EXPECT_STREQ(remains, "remains");
}

TEST_P(DeviceQuestionTest, NullStringAfterSuccessGivesNull)
{
    platform().answer(question.call, 0);
    EXPECT_EQ(ask(question, 0, &preset), nullptr);
}

TEST_P(DeviceQuestionTest, NothingIsCached)
{
    for (const std::string text : {"first", "second"}) {
        platform().answer(question.call, 0, text);
        char* const value = ask(question, 0);
        EXPECT_EQ(value, text);
        std::free(value);
    }
}

class TizenIdTest : public PlatformTest {};

TEST_F(TizenIdTest, FailedCopyGivesNullAndFreesThePlatformsString)
{
    const DeviceQuestion& question = QUESTIONS[1];
    platform().answer(question.call, 0, std::string("an identifier"));
    platform().debugMode = 1;
    const FailingAllocation failure(Allocation::STRDUP);
    char preset = 'p';
    EXPECT_EQ(ask(question, 0, &preset), nullptr);
    EXPECT_TRUE(failure.happened());
    EXPECT_THAT(ledger().live(), IsEmpty());
    EXPECT_EQ(platform().trace(), answeredTrace(question, "(null)"));
}

TEST_F(TizenIdTest, TagAndModeMayChangeDuringTheCall)
{
    platform().answer(QUESTIONS[1].call, -5);
    platform().onEvent = [](const Event& event) {
        if (event.kind == Event::Kind::CALL)
            platform().tag = "Late";
    };
    platform().debugMode = 1;
    ask(QUESTIONS[1], -5);
    const auto lines = platform().lines();
    ASSERT_EQ(lines.size(), 2u);
    EXPECT_EQ(lines[0].tag, "CoreSystem");
    EXPECT_EQ(lines[1].tag, "Late");
}

} // namespace
