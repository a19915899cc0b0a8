// SPDX-License-Identifier: Apache-2.0
#include "CoreLogger.h"

#include <cstdio>
#include <cstring>

#include <gmock/gmock.h>

#include "CoreUtil.h"
#include "support/Program.h"
#include "support/Together.h"

using testing::HasSubstr;

namespace {

CoreLogger& logger()
{
    return *CoreLogger::GetInstance();
}

class CoreLoggerTest : public testing::Test {
protected:
    ~CoreLoggerTest() override
    {
        logger().SetDebugMode(0);
        logger().SetLogTag(nullptr);
    }
};

std::string probe(const std::string& environment)
{
    return outputOf("env -u CORESYSTEM_LOG_DEBUG -u CORESYSTEM_LOG_TAG " + environment +
                    " " QUOTED_ENVIRONMENT_PROBE);
}

TEST_F(CoreLoggerTest, ThereIsOneLoggerInTheDebugModeThatWasSet)
{
    EXPECT_NE(nullptr, CoreLogger::GetInstance());
    for (const int mode : {1, 0, 2, -1}) {
        logger().SetDebugMode(mode);
        EXPECT_EQ(mode, logger().GetDebugMode());
    }
}

TEST_F(CoreLoggerTest, TagIsCopiedAndTakenBack)
{
    char tag[] = "Weather";
    logger().SetLogTag(tag);
    std::strcpy(tag, "gone");
    EXPECT_TRUE(logger().HasLogTag());
    const char* const first = logger().GetLogTag();
    logger().SetLogTag("second");
    EXPECT_STREQ("Weather", first) << "also when another one took its place";
    for (const char* const none : {"", static_cast<const char*>(nullptr)}) {
        logger().SetLogTag("Weather");
        logger().SetLogTag(none);
        EXPECT_FALSE(logger().HasLogTag());
        EXPECT_STREQ("", logger().GetLogTag());
    }
}

TEST_F(CoreLoggerTest, EnvironmentSetsTheStartValues)
{
    EXPECT_THAT(probe(""), HasSubstr("debug=0\ntag=0:\n"));
    EXPECT_THAT(probe("CORESYSTEM_LOG_DEBUG=1 CORESYSTEM_LOG_TAG=Weather"),
                HasSubstr("debug=1\ntag=1:Weather\n"));
    EXPECT_THAT(probe("CORESYSTEM_LOG_DEBUG=yes CORESYSTEM_LOG_TAG="),
                HasSubstr("debug=0\ntag=0:\n"));
}

TEST_F(CoreLoggerTest, RingHandsOutItsBuffersInTurn)
{
    std::set<const char*> buffers;
    for (int i = 0; i < CoreLogger::BUFFER_COUNT; ++i)
        buffers.insert(logger().GetBuffer(logger().GetBufferIndex()));
    EXPECT_EQ(static_cast<std::size_t>(CoreLogger::BUFFER_COUNT), buffers.size());
    EXPECT_EQ(1U, buffers.count(logger().GetBuffer(logger().GetBufferIndex())));
}

TEST_F(CoreLoggerTest, EveryIndexHasAWritableBuffer)
{
    for (const int index : {0, 3, 4, 1000000, -1, -2147483647 - 1}) {
        char* const buffer = logger().GetBuffer(index);
        ASSERT_NE(nullptr, buffer);
        std::memset(buffer, 'x', CoreLogger::BUFFER_SIZE);
    }
}

TEST_F(CoreLoggerTest, ThreadsNeverShareABuffer)
{
    together(8, [](int number) {
        for (int round = 0; round < 2000; ++round) {
            char* const buffer = logger().GetBuffer(logger().GetBufferIndex());
            const std::string text(static_cast<std::size_t>(500 + number),
                                   static_cast<char>('a' + number));
            std::snprintf(buffer, CoreLogger::BUFFER_SIZE, "%s", text.c_str());
            ASSERT_EQ(text, buffer);
        }
    });
}

TEST_F(CoreLoggerTest, ThreadsMaySetTagsWhileOthersRead)
{
    together(8, [](int number) {
        for (int round = 0; round < 500; ++round) {
            logger().SetLogTag(number % 2 == 0 ? "even" : "odd");
            const std::string tag = logger().GetLogTag();
            ASSERT_TRUE(tag == "even" || tag == "odd") << tag;
        }
    });
}

TEST(CoreUtilTest, NumbersAreDecimal)
{
    EXPECT_EQ("0", CoreUtil::GetInstance()->intToStr(0));
    EXPECT_EQ("2147483647", CoreUtil::GetInstance()->intToStr(2147483647));
    EXPECT_EQ("-2147483648", CoreUtil::GetInstance()->intToStr(-2147483647 - 1));
}

} // namespace
