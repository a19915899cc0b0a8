// SPDX-License-Identifier: Apache-2.0
// The packaged NetworkManager, shut into a network of its own.
#ifndef TESTS_SUPPORT_NETWORK_MANAGER_ON_BUS_H
#define TESTS_SUPPORT_NETWORK_MANAGER_ON_BUS_H

#include "support/PrivateBus.h"

/// NetworkManager on the system bus that DBUS_SYSTEM_BUS_ADDRESS names, in network and mount
/// namespaces of its own: it sees none of this machine's interfaces and writes nothing that stays.
/// It is ready after construction and ended at the end, by process id. The thread that makes it
/// must outlive it.
class NetworkManagerOnBus {
public:
    /// `address` is that of the bus.
    explicit NetworkManagerOnBus(const std::string& address);

    /// Why it cannot be had on this machine; empty when it can.
    static std::string obstacle();

    /// Sets one of the manager's switches, "WirelessEnabled" or "WwanEnabled".
    void setSwitch(const char* name, bool on) const;
    /// Adds a cellular connection for the network's own subscribers, or for roaming ones too.
    void addCellularConnection(bool homeOnly) const;

private:
    const TemporaryTree tree_;
    const BusClient client_;
    Process process_;
};

#endif
