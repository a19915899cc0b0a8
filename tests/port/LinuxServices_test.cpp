// SPDX-License-Identifier: Apache-2.0
// The linux backend's report on the services that it asks.
#include <algorithm>
#include <cstdlib>

#include <gmock/gmock.h>

#include "backend/Backend.h"

using testing::HasSubstr;

namespace {

// "platform_name" as people read it.
std::string wordsOf(std::string key)
{
    std::replace(key.begin(), key.end(), '_', ' ');
    return key;
}

TEST(LinuxServicesTest, EveryPlainFactIsServedByOne)
{
    setenv("DBUS_SYSTEM_BUS_ADDRESS", "unix:path=/nonexistent", 1);
    std::string served;
    for (const auto& service : port::makeLinuxBackend()->findServices())
        served += service.serves + ", ";
#define FACT(number, question, section, key, ...)                               \
    EXPECT_THAT(served, HasSubstr(wordsOf(key) + ", ")) << "findServices() of " \
                                                           "port/linux/Linux.cpp";
#include "port/facts/facts.def"
}

} // namespace
