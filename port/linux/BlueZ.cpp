// SPDX-License-Identifier: Apache-2.0
#include "BlueZ.h"

namespace port::linux_backend {

Look adapters()
{
    return {ADAPTERS, [](const Tree& objects) {
                std::vector<Deciding> deciding;
                for (const auto& [path, interfaces] : objects)
                    if (interfaces.count(BLUEZ.interface) != 0)
                        deciding.push_back({path, BLUEZ.interface, "Powered"});
                return deciding;
            }};
}

Result<std::vector<bool>> adaptersIn(const Result<Objects>& objects)
{
    if (!objects)
        return objects.error();
    std::vector<bool> adapters;
    for (const auto& [path, interfaces] : *objects.value()) {
        const auto adapter = Object(path, interfaces).properties(BLUEZ.interface);
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
