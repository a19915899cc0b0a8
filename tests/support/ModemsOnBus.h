// SPDX-License-Identifier: Apache-2.0
// The packaged ModemManager on a system bus of the test's own, with simulated modems.
#ifndef TESTS_SUPPORT_MODEMS_ON_BUS_H
#define TESTS_SUPPORT_MODEMS_ON_BUS_H

#include <functional>
#include <map>
#include <memory>
#include <string>

#include "support/AtModem.h"
#include "support/PrivateBus.h"

/// The daemon is ready after construction; all that was started is ended at the end, by process id.
/// The thread that makes it must outlive it.
class ModemsOnBus {
public:
    ModemsOnBus();

    /// Why it cannot be had on this machine; empty when it can.
    static std::string obstacle();

    /// Plugs a modem in under the device path "/virtual/ID"; returns when the daemon knows its
    /// card, or that it has none.
    AtModem& add(const std::string& id, const AtModem::State& state = {});
    /// The same, without waiting.
    AtModem& plugIn(const std::string& id, const AtModem::State& state = {});
    /// Unplugs it, without waiting.
    void unplug(const std::string& id);
    /// Switches a modem's radio on; returns when it has looked for a network.
    void enable(const std::string& id) const;
    /// As the daemon tells it now: an MMModemState.
    int stateOf(const std::string& id) const;

    /// Kills the daemon without a farewell, starts it, stops it from running and lets it go on.
    void kill()
    {
        process_.kill();
    }
    void start();
    void freeze() const
    {
        process_.freeze();
    }
    void thaw() const
    {
        process_.thaw();
    }

    bool waitUntil(const std::function<bool()>& condition) const
    {
        return client_->waitUntil(condition);
    }

    const PrivateBus& bus() const
    {
        return bus_;
    }

private:
    std::string pathOf(const std::string& id) const;
    void setProfile(const std::string& id, const std::string& port) const;

    PrivateBus bus_;
    const TemporaryTree tree_;
    std::unique_ptr<BusClient> client_;
    std::map<std::string, std::unique_ptr<AtModem>> modems_;
    Process process_;
};

#endif
