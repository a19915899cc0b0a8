// SPDX-License-Identifier: Apache-2.0
// A system bus of the test's own.
#ifndef TESTS_SUPPORT_PRIVATE_BUS_H
#define TESTS_SUPPORT_PRIVATE_BUS_H

#include <string>
#include <vector>

#include "common/GLibTypes.h"
#include "support/Child.h"
#include "support/TemporaryTree.h"
#include "support/Wait.h"

/// A connection of the test's own to a bus, closed with the object.
class BusClient {
public:
    /// Throws when there is no bus.
    explicit BusClient(const std::string& address);
    ~BusClient();
    BusClient(const BusClient&) = delete;
    BusClient& operator=(const BusClient&) = delete;

    GDBusConnection* connection() const
    {
        return connection_.get();
    }
    /// The reply; null, and the error where there is a slot for it, when there is none.
    port::Owned<GVariant> call(const std::string& name, const std::string& path,
                               const std::string& interface, const char* method,
                               GVariant* arguments = nullptr, GError** error = nullptr,
                               int timeoutMs = PATIENCE_MS) const;
    /// Throws where there is none.
    port::Owned<GVariant> mustCall(const std::string& name, const std::string& path,
                                   const std::string& interface, const char* method,
                                   GVariant* arguments = nullptr) const;
    /// Asks the bus itself.
    port::Owned<GVariant> askBus(const char* method, GVariant* arguments) const;
    /// Without starting it.
    bool isThere(const char* name) const;
    /// Looks again whenever something changed on the bus; false after many seconds in vain.
    bool waitUntil(const std::function<bool()>& condition) const;

private:
    const port::Owned<GDBusConnection> connection_;
};

/// A dbus-daemon of type system on a private socket. It is ready when start() returns. While it
/// lives, DBUS_SYSTEM_BUS_ADDRESS of this process names it. At the end it is stopped, and so is
/// every daemon that it started, by process id. The thread that calls start() must outlive it.
class PrivateBus {
public:
    PrivateBus();
    ~PrivateBus();
    PrivateBus(const PrivateBus&) = delete;
    PrivateBus& operator=(const PrivateBus&) = delete;

    /// Before start(): lets the bus start a program when somebody asks for a name.
    void addActivatable(const std::string& name, const std::string& program) const;
    /// Before start(): by itself nobody may own a name or call anybody, as on a machine's own bus;
    /// this file of a bus configuration says who may.
    void usePolicy(const std::string& file) const;
    /// Before start(): the bus and what it starts see this folder as /etc, and a /run with nothing
    /// but systemd's folder, in namespaces of their own: nothing they change reaches the machine.
    void useEtc(const std::string& folder);

    void start();
    /// Kills it without a farewell; start() brings it back under the same address.
    void kill()
    {
        process_.kill();
    }
    /// Stops it from running, and lets it go on.
    void freeze() const
    {
        process_.freeze();
    }
    void thaw() const
    {
        process_.thaw();
    }

    /// Without the bus's identity, so that it stays right after a restart.
    std::string address() const;

private:
    std::vector<int> daemons() const;

    TemporaryTree tree_;
    std::string etc_;
    Process process_;
};

#endif
