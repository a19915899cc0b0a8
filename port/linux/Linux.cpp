// SPDX-License-Identifier: Apache-2.0
// This machine's real services.
#include "../backend/Backend.h"
#include "Bus.h"
#include "DeviceInfo.h"
#include "Files.h"
#include "Hostname1.h"
#include "Locale1.h"
#include "Settings.h"

namespace port::linux_backend {
namespace {

using coresystem_port::Service;

class LinuxBackend : public Backend {
public:
    std::string name() const override
    {
        return "linux";
    }
    DeviceInfo& deviceInfo() override
    {
        return deviceInfo_;
    }
    Settings& settings() override
    {
        return settings_;
    }

    std::vector<Service> findServices() override
    {
        return {
            onBus(
                HOSTNAME1, "device name, hardware model",
                "the device name is the kernel's host name, the model DMI's or the device tree's"),
            onBus(LOCALE1, "display language",
                  "the language is that of LC_ALL, LC_MESSAGES or LANG"),
            file({"/etc/os-release", "/usr/lib/os-release"}, "platform name and version",
                 "no platform name and version"),
            file({"/etc/machine-id", "/var/lib/dbus/machine-id"}, "platform identifier",
                 "no platform identifier"),
            file({"/sys/class/dmi/id/product_name", "/proc/device-tree/model"}, "hardware model",
                 "the model is hostname1's only"),
        };
    }

private:
    Service onBus(const BusObject& object, const char* serves, const char* consequence)
    {
        const Result<std::string> state = bus_.stateOf(object.name);
        return {object.name, static_cast<bool>(state), state ? state.value() : state.error().reason,
                serves, consequence};
    }

    // The first of several places that can be read.
    static Service file(const std::vector<const char*>& paths, const char* serves,
                        const char* consequence)
    {
        for (const char* const path : paths)
            if (readSmallFile(path))
                return {path, true, "readable", serves, consequence};
        return {paths.front(), false, "missing or not readable", serves, consequence};
    }

    Bus bus_;
    LinuxDeviceInfo deviceInfo_{bus_, ""};
    LinuxSettings settings_{bus_};
};

} // namespace
} // namespace port::linux_backend

std::unique_ptr<port::Backend> port::makeLinuxBackend()
{
    return std::make_unique<linux_backend::LinuxBackend>();
}
