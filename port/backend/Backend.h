// SPDX-License-Identifier: Apache-2.0
// One way to answer the platform's questions.
#ifndef PORT_BACKEND_BACKEND_H
#define PORT_BACKEND_BACKEND_H

#include <ctime>
#include <memory>
#include <optional>
#include <string>
#include <vector>

#include <coresystem_port.h>

#include "FactAnswer.h"
#include "Faults.h"
#include "Network.h"
#include "Telephony.h"
#include "VolumeSize.h"

namespace port {

/// The key of the configuration store that holds the sales code.
constexpr char SALES_CODE[] = "db/csc/salescode";

/// Any thread.
class Backend {
public:
    virtual ~Backend() = default;

    virtual std::string name() const = 0;

    /// A plain fact of facts.def.
    virtual FactAnswer read(Question fact) = 0;
    /// The same, as the type that its row has.
    template <Question question>
    Result<Sourced<typename PlainFact<question>::Value>> get()
    {
        return answerOf<typename PlainFact<question>::Value>(read(question));
    }

    // Cards and radios.
    virtual Telephony& telephony() = 0;
    virtual Network& network() = 0;

    /// The size of the internal storage.
    virtual Result<Sourced<VolumeSize>> internalStorage() = 0;
    /// The version of a package by its exact name; nothing when it is not installed.
    virtual Result<Sourced<std::optional<std::string>>> packageVersion(const std::string& name) = 0;
    /// The text of a key of the configuration store, "db/csc/salescode".
    virtual Result<Fact> configuration(const std::string& key) = 0;
    /// The local time, broken down; the zone's name stays for as long as the process runs.
    virtual Result<Sourced<std::tm>> now() = 0;

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

/// Has backend() give another one, for tests, which it must outlive; null: the chosen one again.
/// The one before.
Backend* substituteBackend(Backend* other);

/// The two backends there are; defined in linux/ and simulator/. A device file is named as
/// CORESYSTEM_DEVICE names it.
std::unique_ptr<Backend> makeLinuxBackend();
std::unique_ptr<Backend> makeSimulatorBackend(const std::string& deviceFile);

} // namespace port

#endif
