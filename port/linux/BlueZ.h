// SPDX-License-Identifier: Apache-2.0
// The Bluetooth adapters that BlueZ knows.
#ifndef PORT_LINUX_BLUEZ_H
#define PORT_LINUX_BLUEZ_H

#include <vector>

#include "Bus.h"

namespace port::linux_backend {

constexpr BusObject BLUEZ = {"org.bluez", "/", "org.bluez.Adapter1", Start::Never};

/// Whether each adapter is switched on, from the reply to objectsBelow(BLUEZ).
Result<std::vector<bool>> adaptersIn(const Result<Reply>& reply);

} // namespace port::linux_backend

#endif
