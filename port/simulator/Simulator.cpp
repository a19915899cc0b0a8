// SPDX-License-Identifier: Apache-2.0
// A device described in a TOML file.
#include <dlog.h>

#include "../../devicefile/DeviceFile.h"
#include "../../devicefile/DeviceSearch.h"
#include "../backend/Backend.h"
#include "../backend/Log.h"
#include "Clock.h"
#include "Configuration.h"
#include "DeviceInfo.h"
#include "Faults.h"
#include "Network.h"
#include "Packages.h"
#include "Settings.h"
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
    DeviceInfo& deviceInfo() override
    {
        return deviceInfo_;
    }
    Settings& settings() override
    {
        return settings_;
    }
    Telephony& telephony() override
    {
        return telephony_;
    }
    Network& network() override
    {
        return network_;
    }
    Storage& storage() override
    {
        return storage_;
    }
    Packages& packages() override
    {
        return packages_;
    }
    Configuration& configuration() override
    {
        return configuration_;
    }
    Clock& clock() override
    {
        return clock_;
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
    SimulatedDeviceInfo deviceInfo_{file_};
    SimulatedSettings settings_{file_};
    SimulatedTelephony telephony_{file_};
    SimulatedNetwork network_{file_};
    SimulatedStorage storage_{file_};
    SimulatedPackages packages_{file_};
    SimulatedConfiguration configuration_{file_};
    SimulatedClock clock_{file_};
    SimulatedFaults faults_{file_};
};

} // namespace
} // namespace port::simulator

std::unique_ptr<port::Backend> port::makeSimulatorBackend(const std::string& deviceFile)
{
    return std::make_unique<simulator::SimulatorBackend>(devicefile::findDevice(deviceFile));
}
