// SPDX-License-Identifier: Apache-2.0
// Calls that fail, from the section [fault] of a device file.
#ifndef PORT_SIMULATOR_FAULTS_H
#define PORT_SIMULATOR_FAULTS_H

#include <map>
#include <string>

#include "../../devicefile/DeviceFile.h"
#include "../../devicefile/ForkMutex.h"
#include "../backend/Faults.h"

namespace port::simulator {

class SimulatedFaults : public Faults {
public:
    explicit SimulatedFaults(devicefile::DeviceFile& file) : file_(file) {}

    std::optional<CallFault> meet(const char* call) override;

private:
    // The calls of a function since its fault was first met as it is now.
    struct Count {
        devicefile::Fault rule;
        std::int64_t calls = 0;
    };

    bool isTheCall(const std::string& call, const devicefile::Fault& rule);
    void forget(const std::string& call);

    devicefile::DeviceFile& file_;
    devicefile::ForkMutex mutex_;
    std::map<std::string, Count> counts_;
};

} // namespace port::simulator

#endif
