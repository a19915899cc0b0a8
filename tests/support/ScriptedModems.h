// SPDX-License-Identifier: Apache-2.0
// ModemManager's and NetworkManager's objects of modems, as GVariant texts, for ScriptedService.
#ifndef TESTS_SUPPORT_SCRIPTED_MODEMS_H
#define TESTS_SUPPORT_SCRIPTED_MODEMS_H

#include <map>
#include <string>
#include <vector>

// GVariant texts by name; an empty one is left out.
using Entries = std::map<std::string, std::string>;

inline std::string dictionary(const Entries& entries, const std::string& type)
{
    std::string text;
    for (const auto& [name, value] : entries)
        if (!value.empty())
            text += (text.empty() ? "" : ", ") + ("'" + name + "': ") + value;
    return "@" + type + " {" + text + "}";
}

inline std::string propertiesText(const Entries& entries)
{
    return dictionary(entries, "a{sv}");
}

// A modem that is registered at home, with a SIM card that is ready.
struct FakeModem {
    std::string path = "/org/freedesktop/ModemManager1/Modem/0";
    Entries modem = {
        {"Device", "<'/virtual/home'>"},
        {"State", "<int32 8>"}, // registered
        {"StateFailedReason", "<uint32 0>"},
        {"UnlockRequired", "<uint32 1>"}, // nothing
        {"UnlockRetries", "<{uint32 2: uint32 3, 4: 10}>"},
        {"PowerState", "<uint32 3>"}, // on
        {"Sim", "<objectpath '/org/freedesktop/ModemManager1/SIM/0'>"},
        {"SimSlots", "<@ao []>"},
        {"PrimarySimSlot", "<uint32 0>"},
        {"EquipmentIdentifier", "<'490154203237518'>"},
        {"OwnNumbers", "<['+15551230001']>"},
    };
    Entries network = {{"RegistrationState", "<uint32 1>"}}; // home
    Entries interfaces = {};                                 // others

    // With other values of some properties.
    static FakeModem with(const Entries& properties,
                          const std::string& path = "/org/freedesktop/ModemManager1/Modem/0")
    {
        FakeModem modem;
        modem.path = path;
        for (const auto& [name, value] : properties)
            modem.modem[name] = value;
        return modem;
    }
    std::string text() const
    {
        Entries all = {{"org.freedesktop.ModemManager1.Modem", propertiesText(modem)},
                       {"org.freedesktop.ModemManager1.Modem.Modem3gpp", propertiesText(network)},
                       {"org.freedesktop.ModemManager1.Modem.Messaging", propertiesText({})}};
        for (const auto& [name, properties] : interfaces)
            all[name] = properties;
        return "objectpath '" + path + "': " + dictionary(all, "a{sa{sv}}");
    }
};

// The reply to GetManagedObjects.
inline std::string treeOf(const std::vector<std::string>& objects)
{
    std::string text;
    for (const std::string& object : objects)
        text += (text.empty() ? "" : ", ") + object;
    return "(@a{oa{sa{sv}}} {" + text + "},)";
}

// The reply to GetAll of a SIM.
inline std::string simOf(const std::string& imsi, const std::string& network)
{
    return "(" + propertiesText({{"Imsi", imsi}, {"OperatorIdentifier", network}}) + ",)";
}

// NetworkManager's objects when the traffic goes over a connection of that type on that modem.
inline std::string networkTree(const std::string& type, const std::string& modem)
{
    const std::string name = "org.freedesktop.NetworkManager";
    return treeOf({"objectpath '/org/freedesktop/NetworkManager': {'" + name + "': " +
                       propertiesText({{"PrimaryConnection", "<objectpath '/Active/1'>"},
                                       {"PrimaryConnectionType", "<'" + type + "'>"}}) +
                       "}",
                   "objectpath '/Active/1': {'" + name + ".Connection.Active': " +
                       propertiesText({{"Devices", "<[objectpath '/Devices/1']>"}}) + "}",
                   "objectpath '/Devices/1': {'" + name +
                       ".Device': " + propertiesText({{"Udi", "<'" + modem + "'>"}}) + "}"});
}

#endif
