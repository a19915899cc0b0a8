// SPDX-License-Identifier: Apache-2.0
// The linux backend's report on the services that it asks.
#include <algorithm>
#include <cstdlib>

#include <gmock/gmock.h>

#include "backend/Backend.h"
#include "support/Child.h"

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
    // GLib remembers the surroundings that it finds first, and other tests have their own.
    const std::string served = inChild([] {
        setenv("DBUS_SYSTEM_BUS_ADDRESS", "unix:path=/nonexistent", 1);
        std::string all;
        for (const auto& service : port::makeLinuxBackend()->findServices())
            all += service.serves + ", ";
        return all;
    });
#define FACT(number, question, section, key, ...)                               \
    EXPECT_THAT(served, HasSubstr(wordsOf(key) + ", ")) << "findServices() of " \
                                                           "port/linux/Linux.cpp";
#include "port/facts/facts.def"
}

} // namespace
