// SPDX-License-Identifier: Apache-2.0
// Shared by the tests over the fake platform.
#ifndef CORESYSTEM_TESTS_SUPPORT_PLATFORM_TEST_H
#define CORESYSTEM_TESTS_SUPPORT_PLATFORM_TEST_H

#include <cstdlib>
#include <functional>
#include <ostream>
#include <string>

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "CoreSystemInternals.h"
#include "FakePlatform.h"

namespace fake {

// The texts of the events of one source file, as FakePlatform::trace() has them.
struct SourceFile {
    std::string className;
    std::string defaultTag = "CoreSystem";

    std::string debug(const std::string& function, const std::string& text) const
    {
        return "debug " + className + ".cpp " + function + ": " + text;
    }
    std::string error(const std::string& function, const std::string& text) const
    {
        return "error " + className + ".cpp " + function + ": " + text;
    }
    std::string notice(const std::string& function, const std::string& text) const
    {
        return "notice " + className + ".cpp " + function + ": " + text;
    }
    std::string lock() const
    {
        return "lock " + className + ".cpp::GetInstance";
    }
    // A GetInstance() that finds the instance.
    Texts access() const
    {
        return {debug("GetInstance", className + " GetInstance"), lock(), "un" + lock()};
    }
};

const SourceFile CORE_SYSTEM{"CoreSystem"};
const SourceFile SIM_MANAGER{"SimManager"};
const SourceFile CONNECTION_MANAGER{"ConnectionManager"};
const SourceFile D_BUS_MANAGER{"DBusManager", "Logger"};

const std::string ODD_TEXTS[] = {"", "%s%n", "\xff\xc3\xa9 \n", std::string(10 << 20, 'n')};

inline Texts operator+(Texts texts, const Texts& more)
{
    texts.insert(texts.end(), more.begin(), more.end());
    return texts;
}

// All instances exist and nothing is recorded when a test begins.
class PlatformTest : public testing::Test {
protected:
    PlatformTest()
        : system(*CoreSystem::GetInstance()), sim(*SimManager::GetInstance()),
          connections(*ConnectionManager::GetInstance()), dbus(*DBusManager::GetInstance())
    {
        platform().reset();
    }
    ~PlatformTest() override
    {
        platform().reset();
    }

    CoreSystem& system;
    SimManager& sim;
    ConnectionManager& connections;
    DBusManager& dbus;
};

// One call of the library and everything it does in debug mode, in order. The tests of all such
// rows are in LoggedCall_test.cpp.
struct LoggedCall {
    std::string name;
    std::function<void()> run;
    Texts trace;
};

inline std::ostream& operator<<(std::ostream& out, const LoggedCall& call)
{
    return out << call.name;
}

// Names the tests of a parameter after its row.
template <class Row>
std::string rowName(const testing::TestParamInfo<Row>& info)
{
    return info.param.name;
}

class LoggedCallTest : public PlatformTest, public testing::WithParamInterface<LoggedCall> {};

#define LOGGED_CALLS(name, calls) \
    INSTANTIATE_TEST_SUITE_P(name, LoggedCallTest, testing::ValuesIn(calls), rowName<LoggedCall>)

} // namespace fake

#endif
