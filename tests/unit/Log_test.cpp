// SPDX-License-Identifier: Apache-2.0
// The logging convention by itself, as a source file with a tag of its own uses it.
#define CORESYSTEM_DEFAULT_TAG "Logger"
#include "Log.h"

#include "support/PlatformTest.h"

using namespace fake;
using testing::ElementsAre;
using testing::Field;

class LogTest : public PlatformTest {};

namespace {

std::string loggedBody(const std::string& message)
{
    platform().debugMode = 1;
    platform().forgetEvents();
    DEBUG_LINE("%s", message.c_str());
    return platform().lines().at(0).plain;
}

// The first line that was written, in a test's body.
void expectWritten(int priority, int line, const std::string& format, const std::string& text)
{
    const LogLine written = platform().lines().at(0);
    EXPECT_EQ(written.id, 0);
    EXPECT_EQ(written.priority, priority);
    EXPECT_EQ(written.tag, "Logger");
    EXPECT_EQ(written.format, "%s: %s(%d) > " + format);
    EXPECT_EQ(written.file, "Log_test.cpp");
    EXPECT_EQ(written.function, "TestBody");
    EXPECT_EQ(written.line, line);
    EXPECT_EQ(written.text, text);
}

TEST_F(LogTest, ErrorLineIsPlainTextInOneFormat)
{
    const int line = __LINE__ + 1;
    ERROR_LINE("failed [%d] %s", -5, "here");
    expectWritten(6, line, "failed [%d] %s", "failed [-5] here");
}

TEST_F(LogTest, DebugLineIsEncipheredBetweenItsMarkers)
{
    platform().debugMode = 1;
    const int line = __LINE__ + 1;
    DEBUG_LINE("name : %s", "my phone");
    expectWritten(4, line, "{#!@%s#!@}", "{#!@" + encipher("name : my phone") + "#!@}");
}

TEST_F(LogTest, DebugLineTakesOneBufferAndEnciphersOnce)
{
    platform().debugMode = 1;
    platform().tag = "App";
    DEBUG_LINE("text");

    Texts steps;
    for (const Event& event : platform().events())
        if (event.text != "GetInstance")
            steps.push_back(event.text);
    EXPECT_THAT(steps, ElementsAre("GetDebugMode", "GetBufferIndex", "GetBuffer", "Encrypt(text)",
                                   "HasLogTag", "GetLogTag", "debug Log_test.cpp TestBody: text"));
}

TEST_F(LogTest, QuietDebugLineCostsTwoLoggerCallsAndEvaluatesNothing)
{
    int evaluated = 0;
    DEBUG_LINE("%d", ++evaluated);
    EXPECT_EQ(evaluated, 0);
    EXPECT_THAT(platform().texts(Event::Kind::LOGGER), ElementsAre("GetInstance", "GetDebugMode"));
    EXPECT_EQ(platform().events().size(), 2u);
}

TEST_F(LogTest, TagIsChosenAnewForEachLine)
{
    ERROR_LINE("no tag yet");
    platform().tag = "First";
    ERROR_LINE("with a tag");
    platform().tag = "Second";
    ERROR_LINE("with another");
    platform().tag.reset();
    ERROR_LINE("without again");

    EXPECT_THAT(platform().lines(),
                ElementsAre(Field(&LogLine::tag, "Logger"), Field(&LogLine::tag, "First"),
                            Field(&LogLine::tag, "Second"), Field(&LogLine::tag, "Logger")));
}

TEST_F(LogTest, MessageIsCutAfter598Characters)
{
    std::string message;
    for (int i = 0; message.size() < 700; ++i)
        message += std::to_string(i);
    message.resize(700);

    EXPECT_EQ(loggedBody(message), message.substr(0, 598));
    EXPECT_EQ(loggedBody(message.substr(0, 599)), message.substr(0, 598));
    EXPECT_EQ(loggedBody(message.substr(0, 598)), message.substr(0, 598));
    EXPECT_EQ(loggedBody(message.substr(0, 597)), message.substr(0, 597));
    EXPECT_EQ(loggedBody(std::string(10 << 20, 'x')), std::string(598, 'x'));
    EXPECT_EQ(loggedBody("the buffers are sound"), "the buffers are sound");
    EXPECT_EQ(loggedBody("%s %n %d"), "%s %n %d"); // no format
}

TEST_F(LogTest, EmptyMessageIsEncipheredToo)
{
    EXPECT_EQ(loggedBody(""), "");
    EXPECT_EQ(platform().lines().at(0).text, "{#!@#!@}");
    EXPECT_THAT(platform().texts(Event::Kind::CIPHER), ElementsAre("Encrypt()"));
}

TEST_F(LogTest, FileNameIsWhatFollowsTheLastSlash)
{
    const auto nameOf = [](const char* path) {
        return std::string(coresystem::logFileName({"AnyTag", path, "AnyFunction", 12}));
    };
    EXPECT_EQ(nameOf("src/CoreSystem.cpp"), "CoreSystem.cpp");
    EXPECT_EQ(nameOf("/a/b/c.cpp"), "c.cpp");
    EXPECT_EQ(nameOf("CoreSystem.cpp"), "CoreSystem.cpp");
    EXPECT_EQ(nameOf("a/"), "");
}

TEST_F(LogTest, FailedAllocationLosesTheLineOnly)
{
    platform().debugMode = 1;
    const std::string message(100, 'x');
    {
        const FailingAllocation failure(Allocation::THROWING);
        DEBUG_LINE("%s", message.c_str());
        EXPECT_TRUE(failure.happened());
    }
    EXPECT_EQ(platform().trace(), Texts());
}

} // namespace
