// SPDX-License-Identifier: Apache-2.0
// Local time.
#include <cstdlib>
#include <limits>

#include <gmock/gmock.h>

#include "linux/Clock.h"

using port::linux_backend::localTime;

namespace {

constexpr std::time_t SUMMER_2024 = 1720008000; // 2024-07-03 12:00:00 UTC

class LinuxClockTest : public testing::Test {
protected:
    ~LinuxClockTest() override
    {
        unsetenv("TZ");
    }
    static std::string shown(std::time_t moment)
    {
        const std::tm local = localTime(moment).value().value;
        char text[100] = "";
        std::strftime(text, sizeof text, "%F %T %a day %j", &local);
        return std::string(text) + " " + local.tm_zone + " " + std::to_string(local.tm_gmtoff) +
               (local.tm_isdst > 0 ? " summer" : "");
    }
};

TEST_F(LinuxClockTest, TimeIsThatOfTheZone)
{
    setenv("TZ", "UTC0", 1);
    EXPECT_EQ("2024-07-03 12:00:00 Wed day 185 UTC 0", shown(SUMMER_2024));
    setenv("TZ", "CET-1CEST,M3.5.0,M10.5.0/3", 1);
    EXPECT_EQ("2024-07-03 14:00:00 Wed day 185 CEST 7200 summer", shown(SUMMER_2024));
    setenv("TZ", "<+0545>-5:45", 1);
    EXPECT_EQ("2024-07-03 17:45:00 Wed day 185 +0545 20700", shown(SUMMER_2024));
}

TEST_F(LinuxClockTest, YearBeyondTheCalendarIsTold)
{
    if (sizeof(std::time_t) < 8)
        GTEST_SKIP() << "the machine counts seconds with 32 bits";
    const auto answer = localTime(std::numeric_limits<std::time_t>::max());
    ASSERT_FALSE(answer);
    EXPECT_EQ("the clock is set to a year that no calendar holds", answer.error().reason);
}

} // namespace
