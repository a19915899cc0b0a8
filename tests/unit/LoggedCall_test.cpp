// SPDX-License-Identifier: Apache-2.0
// Checks every call of the library, over the rows that the other files supply.
#include "support/PlatformTest.h"

using namespace fake;
using testing::Each;
using testing::Field;

namespace {

bool isDebugText(const std::string& text)
{
    return text.compare(0, 6, "debug ") == 0;
}

Texts withoutDebugLines(Texts texts)
{
    texts.erase(std::remove_if(texts.begin(), texts.end(), isDebugText), texts.end());
    return texts;
}

bool isPlainText(const std::string& text)
{
    return text.compare(0, 6, "error ") == 0 || text.compare(0, 7, "notice ") == 0;
}

void expectDefaultTags(const std::vector<LogLine>& lines)
{
    for (const LogLine& line : lines)
        EXPECT_EQ(line.tag, line.file == "DBusManager.cpp" ? "Logger" : "CoreSystem") << line.plain;
}

// A debug line asks for the mode and no more; a plain line asks for the tag.
Texts quietLoggerCalls(const Texts& trace)
{
    Texts calls;
    for (const std::string& text : trace) {
        if (isDebugText(text))
            calls = calls + Texts{"GetInstance", "GetDebugMode"};
        else if (isPlainText(text))
            calls = calls + Texts{"GetInstance", "HasLogTag"};
    }
    return calls;
}

TEST_P(LoggedCallTest, DebugModeShowsEveryStepInOrder)
{
    platform().debugMode = 1;
    GetParam().run();
    EXPECT_EQ(platform().trace(), GetParam().trace);
    expectDefaultTags(platform().lines());
}

TEST_P(LoggedCallTest, OtherModesWritePlainLinesOnlyAndFormatNothing)
{
    for (const int mode : {0, 2, -1, 257}) {
        platform().reset();
        platform().debugMode = mode;
        GetParam().run();
        EXPECT_EQ(platform().trace(), withoutDebugLines(GetParam().trace)) << "mode " << mode;
        EXPECT_EQ(platform().texts(Event::Kind::LOGGER), quietLoggerCalls(GetParam().trace));
        EXPECT_EQ(platform().texts(Event::Kind::CIPHER), Texts());
    }
}

TEST_P(LoggedCallTest, EveryLineCarriesTheApplicationsTag)
{
    platform().debugMode = 1;
    platform().tag = "MyApplication";
    GetParam().run();
    EXPECT_EQ(platform().trace(), GetParam().trace);
    EXPECT_THAT(platform().lines(), Each(Field(&LogLine::tag, "MyApplication")));
}

TEST_P(LoggedCallTest, FailingLogChangesNothing)
{
    platform().logResult = -22;
    platform().cipherThrows = true;
    platform().debugMode = 1;
    GetParam().run();
    EXPECT_EQ(platform().trace(), withoutDebugLines(GetParam().trace));
}

// Each file has its rows under a name of its own; a build may leave some of them out.
GTEST_ALLOW_UNINSTANTIATED_PARAMETERIZED_TEST(LoggedCallTest);

} // namespace
