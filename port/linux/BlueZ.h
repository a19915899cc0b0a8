// SPDX-License-Identifier: Apache-2.0
// The Bluetooth adapters that BlueZ knows.
#ifndef PORT_LINUX_BLUEZ_H
#define PORT_LINUX_BLUEZ_H

#include <string>
#include <vector>

#include "Bus.h"

namespace port::linux_backend {

constexpr BusObject BLUEZ = {"org.bluez", "/", "org.bluez.Adapter1", Start::Never};
constexpr Names BLUEZ_INTERFACES = {BLUEZ.interface};
constexpr ObjectService ADAPTERS = {BLUEZ,   "/",     nullptr, BLUEZ_INTERFACES,
                                    nullptr, nullptr, nullptr};

/// Asks for the adapters.
Look adapters();

struct Adapter {
    std::string name; // "hci0"
    bool isPowered;
};

/// The adapters, those first that are switched on, from the objects of ADAPTERS.
Result<std::vector<Adapter>> adaptersIn(const Result<Objects>& objects);

} // namespace port::linux_backend

#endif
