// SPDX-License-Identifier: Apache-2.0
#include "Packages.h"

namespace port::simulator {

using devicefile::Device;
using devicefile::Section;

Result<Sourced<std::optional<std::string>>> packageVersion(devicefile::DeviceFile& file,
                                                           const std::string& name)
{
    using Version = std::optional<std::string>;
    return file.ask<Version>([&](const Device& device) -> Result<Sourced<Version>> {
        const Section& packages = device.section("packages");
        if (packages.source() == file.path()) // and no line of it
            return notAvailable(packages.source() + ": no section [packages]");
        if (packages.find(name) == nullptr)
            return Sourced<Version>{std::nullopt, packages.source()};
        const Fact version = packages.get<std::string>(name).value();
        return Sourced<Version>{version.value, version.source};
    });
}

} // namespace port::simulator
