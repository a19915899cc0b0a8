// SPDX-License-Identifier: Apache-2.0
// A device described in a TOML file.
#include <dlog.h>

#include "../../devicefile/DeviceFile.h"
#include "../../devicefile/DeviceSearch.h"
#include "../backend/Backend.h"
#include "../backend/Log.h"
#include "Clock.h"
#include "Faults.h"
#include "Network.h"
#include "Packages.h"
#include "Storage.h"
#include "Telephony.h"

namespace port::simulator {
namespace {

using coresystem_port::Service;
using devicefile::DeviceFile;
using devicefile::FoundDevice;

// The log is where an application learns of a mistake in the file.
void logProblem(const std::string& problem)
{
    processLog().write(DLOG_ERROR, "coresystem-port", problem);
}

class SimulatorBackend : public Backend {
public:
    explicit SimulatorBackend(const FoundDevice& device)
        : file_(device.path, logProblem, device.elsewhere)
    {
    }

    std::string name() const override
    {
        return "simulator";
    }

    FactAnswer read(Question fact) override
    {
        const FactRow& row = *rowOf(fact);
        return file_.ask<FactValue>([&](const devicefile::Device& device) {
            return device.section(std::string(row.section)).fact(std::string(row.key));
        });
    }

    Telephony& telephony() override
    {
        return telephony_;
    }
    Network& network() override
    {
        return network_;
    }
    Result<Sourced<VolumeSize>> internalStorage() override
    {
        return simulator::internalStorage(file_);
    }
    Result<Sourced<std::optional<std::string>>> packageVersion(const std::string& name) override
    {
        return simulator::packageVersion(file_, name);
    }
    // The sales code is all that the store of a device file holds.
    Result<Fact> configuration(const std::string& key) override
    {
        if (key != SALES_CODE)
            return notAvailable(file_.path() + ": no configuration key " + key);
        return get<Question::SalesCode>();
    }
    Result<Sourced<std::tm>> now() override
    {
        return simulator::now(file_);
    }
    Faults& faults() override
    {
        return faults_;
    }
    std::string deviceFile() const override
    {
        return file_.path();
    }

    std::string deviceFileProblem() override
    {
        const auto device = file_.device();
        return device ? std::string() : device.error().reason;
    }

    std::vector<Service> findServices() override
    {
        const std::string problem = deviceFileProblem();
        return {{file_.path(), problem.empty(), problem.empty() ? "readable" : problem,
                 "every fact", "nothing is available"}};
    }

private:
    DeviceFile file_;
    SimulatedTelephony telephony_{file_};
    SimulatedNetwork network_{file_};
    SimulatedFaults faults_{file_};
};

} // namespace
} // namespace port::simulator

std::unique_ptr<port::Backend> port::makeSimulatorBackend(const std::string& deviceFile)
{
    return std::make_unique<simulator::SimulatorBackend>(devicefile::findDevice(deviceFile));
}
