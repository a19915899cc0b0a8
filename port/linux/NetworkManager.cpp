// SPDX-License-Identifier: Apache-2.0
#include "NetworkManager.h"

#include <vector>

namespace port::linux_backend {
namespace {

using Objects = std::vector<Object>;

// The object manager stands above the service's main object.
constexpr BusObject MANAGER_OF_OBJECTS = {NETWORK_MANAGER.name, "/org/freedesktop",
                                          "org.freedesktop.DBus.ObjectManager",
                                          NETWORK_MANAGER.start};
constexpr char ACTIVE_CONNECTION[] = "org.freedesktop.NetworkManager.Connection.Active";
constexpr char DEVICE[] = "org.freedesktop.NetworkManager.Device";
constexpr char CELLULAR[] = "gsm"; // a connection's type

Result<Properties> propertiesAt(const Objects& objects, const std::string& path,
                                const char* interface)
{
    for (const Object& object : objects)
        if (object.path() == path)
            return object.properties(interface);
    return notAvailable(path + " is not there");
}

// What a connection's devices call themselves below NetworkManager: a modem's device is named by
// its ModemManager object.
std::optional<std::string> deviceBelow(const Objects& objects, const Properties& connection)
{
    const auto devices = connection.paths("Devices");
    if (!devices || devices.value().empty())
        return std::nullopt;
    const auto device = propertiesAt(objects, devices.value().front(), DEVICE);
    const auto name = device ? device.value().text("Udi") : Result<std::string>(device.error());
    return name ? std::optional<std::string>(name.value()) : std::nullopt;
}

std::optional<std::string> primaryModem(const Objects& objects)
{
    const auto network = propertiesAt(objects, NETWORK_MANAGER.path, NETWORK_MANAGER.interface);
    if (!network)
        return std::nullopt;
    const auto primary = network.value().path("PrimaryConnection");
    const auto type = network.value().text("PrimaryConnectionType");
    if (!primary || !type || type.value() != CELLULAR)
        return std::nullopt;
    const auto connection = propertiesAt(objects, primary.value(), ACTIVE_CONNECTION);
    return connection ? deviceBelow(objects, connection.value()) : std::nullopt;
}

} // namespace

Question networkObjects()
{
    return objectsBelow(MANAGER_OF_OBJECTS);
}

std::optional<std::string> primaryModemIn(const Reply& reply)
{
    const Result<Objects> objects = objectsIn(reply.body);
    return objects ? primaryModem(objects.value()) : std::nullopt;
}

} // namespace port::linux_backend
