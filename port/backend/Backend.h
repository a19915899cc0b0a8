// SPDX-License-Identifier: Apache-2.0
// One way to answer the platform's questions.
#ifndef PORT_BACKEND_BACKEND_H
#define PORT_BACKEND_BACKEND_H

#include <memory>
#include <string>
#include <vector>

#include <coresystem_port.h>

#include "Clock.h"
#include "Configuration.h"
#include "DeviceInfo.h"
#include "Faults.h"
#include "Network.h"
#include "Packages.h"
#include "Settings.h"
#include "Storage.h"
#include "Telephony.h"

namespace port {

class Backend {
public:
    virtual ~Backend() = default;

    virtual std::string name() const = 0;
    virtual DeviceInfo& deviceInfo() = 0;
    virtual Settings& settings() = 0;
    virtual Telephony& telephony() = 0;
    virtual Network& network() = 0;
    virtual Storage& storage() = 0;
    virtual Packages& packages() = 0;
    virtual Configuration& configuration() = 0;
    virtual Clock& clock() = 0;

    /// None, unless the backend says otherwise.
    virtual Faults& faults()
    {
        static Faults& none = *new Faults; // a thread may still ask while the process ends
        return none;
    }

    virtual std::string deviceFile() const
    {
        return {};
    }
    virtual std::string deviceFileProblem()
    {
        return {};
    }
    virtual std::vector<coresystem_port::Service> findServices() = 0;
};

/// The backend of this process, chosen by the first call: the simulator when CORESYSTEM_DEVICE
/// names a device file (not in a set-user-ID process), else this machine's services.
Backend& backend();

/// The two backends there are; defined in linux/ and simulator/. A device file is named as
/// CORESYSTEM_DEVICE names it.
std::unique_ptr<Backend> makeLinuxBackend();
std::unique_ptr<Backend> makeSimulatorBackend(const std::string& deviceFile);

} // namespace port

#endif
