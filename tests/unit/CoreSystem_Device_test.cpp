// SPDX-License-Identifier: Apache-2.0
// Device name, identifier, platform name, software version and model.
#include "support/PlatformTest.h"

using namespace fake;
using testing::IsEmpty;

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

std::string resultLine(const DeviceQuestion& question, const std::string& value, int code)
{
    return CORE_SYSTEM.debug(
        question.name, question.result + value +
                           (question.showsResultCode ? ", ret : " + std::to_string(code) : ""));
}

// Asks with a slot that holds `preset`; what the slot holds then.
char* ask(const DeviceQuestion& question, int expectedCode, char* preset)
{
    char* slot = preset;
    EXPECT_EQ((coreSystem().*question.ask)(&slot), expectedCode);
    return slot;
}

// One string is alive: the platform's own, or the copy of it.
void expectValue(const DeviceQuestion& question, const std::string& expected)
{
    char preset = 'p';
    platform().answer(question.call, 0, expected);
    char* const value = ask(question, 0, &preset);
    EXPECT_TRUE(value == expected);
    const std::string origin = (question.copies ? "copy: " : "platform: ") + expected;
    EXPECT_EQ(ledger().origin(value), origin);
    EXPECT_EQ(ledger().freeAll(), Texts{origin});
}

Texts answeredTrace(const DeviceQuestion& question, const std::string& value, int code = 0)
{
    return {CORE_SYSTEM.debug(question.name, question.entry), question.call,
            resultLine(question, value, code)};
}

Texts failedTrace(const DeviceQuestion& question, int code)
{
    Texts trace = answeredTrace(question, "(null)", code);
    const std::string text = "system_info_get_platform_string failed ";
    if (question.copies)
        trace.back() = CORE_SYSTEM.error(question.name, text + "[" + std::to_string(code) +
                                                            "] <- " + text + "[%d]");
    return trace;
}

std::vector<LoggedCall> loggedCalls()
{
    std::vector<LoggedCall> calls;
    for (const DeviceQuestion& question : QUESTIONS) {
        calls.push_back({question.name + "Answered", [=] { expectValue(question, "a value"); },
                         answeredTrace(question, "a value")});
        const auto fails = [&](const std::string& name, int code, bool keepsSlot,
                               const Texts& trace) {
            calls.push_back({question.name + name,
                             [=] {
                                 char preset = 'p';
                                 platform().answer(question.call, code);
                                 char* const slot = ask(question, code, &preset);
                                 EXPECT_EQ(slot, keepsSlot ? &preset : nullptr);
                                 EXPECT_THAT(ledger().live(), IsEmpty());
                             },
                             trace});
        };
        fails("AnsweredNull", 0, false, answeredTrace(question, "(null)"));
        for (const int code : {-22, -1, 1})
            fails("Failed" + std::to_string(static_cast<unsigned int>(code)), code, question.copies,
                  failedTrace(question, code));
    }
    return calls;
}

LOGGED_CALLS(Device, loggedCalls());

class DeviceTest : public PlatformTest {
protected:
    const DeviceQuestion& tizenId = QUESTIONS[1];
    char preset = 'p';
};

TEST_F(DeviceTest, OddValuesPassThroughUnchanged)
{
    for (const DeviceQuestion& question : QUESTIONS)
        for (const std::string& odd : ODD_TEXTS)
            for (const int mode : {0, 1}) {
                platform().debugMode = mode;
                expectValue(question, odd);
            }
}

TEST_F(DeviceTest, SlotAfterFailureIsWhatThePlatformLeftThere)
{
    char remains[] = "remains";
    for (const DeviceQuestion& question : QUESTIONS) {
        platform().answer(question.call, -5, static_cast<char*>(remains));
        EXPECT_EQ(ask(question, -5, &preset), question.copies ? &preset : remains) << question.name;
        EXPECT_STREQ(remains, "remains");
    }
}

TEST_F(DeviceTest, FailedCopyOfTheIdentifierGivesNullAndFreesThePlatformsString)
{
    platform().answer(tizenId.call, 0, std::string("an identifier"));
    platform().debugMode = 1;
    const FailingAllocation failure(Allocation::STRDUP);
    EXPECT_EQ(ask(tizenId, 0, &preset), nullptr);
    EXPECT_TRUE(failure.happened());
    EXPECT_THAT(ledger().live(), IsEmpty());
    EXPECT_EQ(platform().trace(), answeredTrace(tizenId, "(null)"));
}

} // namespace
