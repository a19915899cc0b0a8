// SPDX-License-Identifier: Apache-2.0
// The connections that NetworkManager knows.
#ifndef PORT_LINUX_NETWORK_MANAGER_H
#define PORT_LINUX_NETWORK_MANAGER_H

#include <optional>
#include <string>

#include "Bus.h"

namespace port::linux_backend {

constexpr BusObject NETWORK_MANAGER = {"org.freedesktop.NetworkManager",
                                       "/org/freedesktop/NetworkManager",
                                       "org.freedesktop.NetworkManager", Start::Never};

/// Asks for all objects of NetworkManager.
Question networkObjects();

/// The ModemManager object of the modem over which this machine's traffic goes, from the reply to
/// networkObjects(); nothing when it goes elsewhere.
std::optional<std::string> primaryModemIn(const Reply& reply);

} // namespace port::linux_backend

#endif
