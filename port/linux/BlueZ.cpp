// SPDX-License-Identifier: Apache-2.0
#include "BlueZ.h"

#include <algorithm>

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

Result<std::vector<Adapter>> adaptersIn(const Result<Objects>& objects)
{
    if (!objects)
        return objects.error();
    std::vector<Adapter> adapters;
    for (const auto& [path, interfaces] : *objects.value()) {
        const auto adapter = Object(path, interfaces).properties(BLUEZ.interface);
        if (!adapter)
            continue;
        const auto powered = adapter.value().flag("Powered");
        if (!powered)
            return notAvailable("bluez: " + powered.error().reason);
        adapters.push_back({path.substr(path.rfind('/') + 1), powered.value()});
    }
    std::stable_partition(adapters.begin(), adapters.end(),
                          [](const Adapter& each) { return each.isPowered; });
    return adapters;
}

} // namespace port::linux_backend
