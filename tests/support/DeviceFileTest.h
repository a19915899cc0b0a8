// SPDX-License-Identifier: Apache-2.0
// Shared by the tests of the simulator: a device file and the backend that reads it.
#ifndef TESTS_SUPPORT_DEVICE_FILE_TEST_H
#define TESTS_SUPPORT_DEVICE_FILE_TEST_H

#include <memory>
#include <string>

#include <gmock/gmock.h>

#include "TemporaryTree.h"
#include "backend/Backend.h"
#include "coresystem_port.h"

class DeviceFileTest : public testing::Test {
protected:
    DeviceFileTest()
    {
        coresystem_port::setLogSink(coresystem_port::LogSink::None);
    }

    // Writes the file; its first line is the schema's.
    void describe(const std::string& facts) const
    {
        tree.write("/d.toml", "schema = 1\n" + facts);
    }

    // The mistakes in such a file, without its path; empty when it is good.
    std::string problemOf(const std::string& facts)
    {
        describe(facts);
        const std::string problem = backend->deviceFileProblem();
        return problem.empty() ? "" : problem.substr(path.size());
    }

    // Where a line of the file is.
    std::string line(int number) const
    {
        return path + ":" + std::to_string(number);
    }

    const TemporaryTree tree;
    const std::string path = tree.path("/d.toml");
    const std::unique_ptr<port::Backend> backend = port::makeSimulatorBackend(path);
};

// Expects a value, and the line that it stands in.
template <typename T, typename Value>
void expectAnswer(const Value& expected, const std::string& source,
                  const port::Result<port::Sourced<T>>& answer)
{
    ASSERT_TRUE(answer) << answer.error().reason;
    EXPECT_EQ(expected, answer.value().value);
    EXPECT_EQ(source, answer.value().source);
}

// Expects an error of a kind with its reason.
template <typename T>
void expectError(port::Error::Kind kind, const std::string& reason,
                 const port::Result<port::Sourced<T>>& answer)
{
    ASSERT_FALSE(answer);
    EXPECT_EQ(kind, answer.error().kind);
    EXPECT_EQ(reason, answer.error().reason);
}

#endif
