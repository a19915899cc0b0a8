// SPDX-License-Identifier: Apache-2.0
#include "BlueZ.h"

#include "Properties.h"

namespace port::linux_backend {

Result<std::vector<bool>> adaptersIn(const Result<Reply>& reply)
{
    if (!reply)
        return reply.error();
    const auto objects = objectsIn(reply.value().body);
    if (!objects)
        return notAvailable("bluez: " + objects.error().reason);
    std::vector<bool> adapters;
    for (const Object& object : objects.value()) {
        const auto adapter = object.properties(BLUEZ.interface);
        if (!adapter)
            continue;
        const auto powered = adapter.value().flag("Powered");
        if (!powered)
            return notAvailable("bluez: " + powered.error().reason);
        adapters.push_back(powered.value());
    }
    return adapters;
}

} // namespace port::linux_backend
