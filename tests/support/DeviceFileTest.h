// SPDX-License-Identifier: Apache-2.0
// Shared by the tests of the simulator: a device file and the backend that reads it.
#ifndef TESTS_SUPPORT_DEVICE_FILE_TEST_H
#define TESTS_SUPPORT_DEVICE_FILE_TEST_H

#include <memory>
#include <string>

#include <gmock/gmock.h>

#include "backend/Backend.h"
#include "coresystem_port.h"
#include "support/Answer.h"
#include "support/TemporaryTree.h"

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

#endif
