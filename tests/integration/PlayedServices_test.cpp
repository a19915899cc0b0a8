// SPDX-License-Identifier: Apache-2.0
// Clients of the played services: what they see, hear and may do.
#include <fstream>
#include <tuple>

#include <gmock/gmock.h>

#include "devicefile/DeviceText.h"
#include "support/PlayedDevice.h"

namespace {

using testing::ElementsAre;
using testing::HasSubstr;
using testing::IsEmpty;

constexpr char PHONE[] = R"(schema = 1
[settings]
device_name = "Phone"
flight_mode = false
packet_data = true
[[slot]]
sim = "available"
mcc = "001"
mnc = "01"
msin = "1"
imei = "001017000000011"
service = "in_service"
sms = true
pin = "1234"
puk = "12345678"
[network]
cellular = "available"
wifi = "connected"
bluetooth = "disconnected"
)";
constexpr char NM[] = "org.freedesktop.NetworkManager";
constexpr char NM_PATH[] = "/org/freedesktop/NetworkManager";
constexpr char MM[] = "org.freedesktop.ModemManager1";
constexpr char MM_MODEM[] = "org.freedesktop.ModemManager1.Modem";
constexpr char MODEM[] = "/org/freedesktop/ModemManager1/Modem/0";
constexpr char SIM[] = "/org/freedesktop/ModemManager1/SIM/0";
constexpr char HOSTNAME[] = "org.freedesktop.hostname1";
constexpr char LOCALE[] = "org.freedesktop.locale1";
constexpr char ADAPTER[] = "/org/bluez/hci0";
constexpr char PROPERTIES[] = "org.freedesktop.DBus.Properties";

std::string with(const std::string& text, const std::vector<port::devicefile::Edit>& changes)
{
    const auto changed = port::devicefile::changeText(text, "device", changes);
    return changed ? changed.value() : changed.error().reason;
}

class PlayedServices : public testing::Test {
protected:
    // The reply as text, or the name of the error.
    std::string call(const char* service, const std::string& path, const std::string& interface,
                     const char* member, const char* arguments = "()", int timeoutMs = 5000)
    {
        port::Owned<GError> error;
        const auto reply = bus_.call(service, path, interface, member,
                                     g_variant_new_parsed(arguments), port::Out(error), timeoutMs);
        if (reply)
            return port::Owned<char>(g_variant_print(reply.get(), FALSE)).get();
        if (g_dbus_error_is_remote_error(error.get()) == FALSE)
            return error->message;
        return port::Owned<char>(g_dbus_error_get_remote_error(error.get())).get();
    }
    std::string get(const char* service, const std::string& path, const std::string& interface,
                    const std::string& name)
    {
        return call(service, path, PROPERTIES, "Get",
                    ("('" + interface + "', '" + name + "')").c_str());
    }
    std::string set(const char* service, const std::string& path, const std::string& interface,
                    const std::string& name, const std::string& value)
    {
        return call(service, path, PROPERTIES, "Set",
                    ("('" + interface + "', '" + name + "', <" + value + ">)").c_str());
    }

    // The signals of a service while the device becomes another, in order.
    std::vector<std::string> heard(const char* service, const std::string& text)
    {
        std::vector<std::string> told;
        const guint id = g_dbus_connection_signal_subscribe(
            bus_.connection(), service, nullptr, nullptr, nullptr, nullptr,
            G_DBUS_SIGNAL_FLAGS_NONE, &PlayedServices::onSignal, &told, nullptr);
        call(service, "/", "org.freedesktop.DBus.Peer", "Ping");
        played_.become(text);
        call(service, "/", "org.freedesktop.DBus.Peer", "Ping"); // behind every signal
        while (g_main_context_iteration(nullptr, FALSE) != FALSE) {}
        g_dbus_connection_signal_unsubscribe(bus_.connection(), id);
        return told;
    }
    static void onSignal(GDBusConnection*, const char*, const char* path, const char*,
                         const char* signal, GVariant* arguments, gpointer told)
    {
        std::string subject = path;
        if (std::string(signal).rfind("Interfaces", 0) == 0) {
            const port::Owned<GVariant> object(g_variant_get_child_value(arguments, 0));
            subject = g_variant_get_string(object.get(), nullptr);
        }
        subject.erase(0, subject.rfind('/', subject.rfind('/') - 1) + 1);
        static_cast<std::vector<std::string>*>(told)->push_back(subject + " " + signal);
    }

    std::string value(const std::string& path)
    {
        std::ifstream file(played_.file());
        const std::string text{std::istreambuf_iterator<char>(file), {}};
        const auto found = port::devicefile::getValue(text, "device", path);
        return found ? found.value() : "none";
    }

    PlayedDevice played_{PHONE};
    const BusClient bus_{played_.address()};
};

TEST_F(PlayedServices, HaveEveryPropertyOfEveryInterfaceInItsType)
{
    const auto device = port::devicefile::parseDevice(
        with(PHONE, {{"network.cellular", "connected"}, {"network.bluetooth", "connected"}}), "");
    const auto facts = port::played::factsOf(device.value());
    port::played::ModemNumbers modems;
    modems.follow(facts.slots);
    const port::played::Scene scene{facts, modems};
    std::size_t count = 0;
    for (const auto* const role : port::played::allServices())
        for (const auto& object : role->worldOf(scene))
            for (const auto& face : object.faces) {
                const auto* const info = port::played::interfaceOf(face.interface).info;
                for (auto** each = info->properties; each != nullptr && *each != nullptr; ++each) {
                    EXPECT_STREQ(g_variant_get_type_string(face.value((*each)->name)),
                                 (*each)->signature)
                        << face.interface << " " << (*each)->name;
                    ++count;
                }
                EXPECT_EQ(face.all().size(), face.defaults.size()) << face.interface;
            }
    EXPECT_GT(count, 300U);
    for (const auto* const role : port::played::allServices())
        for (const auto* const table : {&role->methods, &role->setters})
            for (const auto& act : *table) {
                auto* const info = port::played::interfaceOf(act.interface).info;
                EXPECT_TRUE(g_dbus_interface_info_lookup_method(info, act.member) != nullptr ||
                            g_dbus_interface_info_lookup_property(info, act.member) != nullptr)
                    << act.interface << " " << act.member;
            }
}

TEST_F(PlayedServices, TellInTheOrderOfTheRealOnes)
{
    std::string text = with(PHONE, {{"network.wifi", "disconnected"}});
    EXPECT_THAT(heard(NM, text),
                ElementsAre("Devices/1 PropertiesChanged", "Devices/1 StateChanged",
                            "Devices/1 PropertiesChanged", "Devices/1 AccessPointRemoved",
                            "freedesktop/NetworkManager PropertiesChanged",
                            "freedesktop/NetworkManager StateChanged",
                            "AccessPoint/1 InterfacesRemoved",
                            "ActiveConnection/1 InterfacesRemoved"));
    text = with(text, {{"network.wifi", "connected"}});
    EXPECT_THAT(heard(NM, text),
                ElementsAre("AccessPoint/1 InterfacesAdded", "ActiveConnection/1 InterfacesAdded",
                            "Devices/1 PropertiesChanged", "Devices/1 StateChanged",
                            "Devices/1 PropertiesChanged", "Devices/1 AccessPointAdded",
                            "freedesktop/NetworkManager PropertiesChanged",
                            "freedesktop/NetworkManager StateChanged"));
    // From home to abroad only the network changes.
    text = with(text, {{"slot[0].roaming", "true"}});
    EXPECT_THAT(heard(MM, text), ElementsAre("Modem/0 PropertiesChanged"));
    text = with(text, {{"slot[0].service", "out_of_service"}});
    EXPECT_THAT(heard(MM, text),
                ElementsAre("Modem/0 PropertiesChanged", "Modem/0 StateChanged",
                            "Modem/0 PropertiesChanged", "Modem/0 PropertiesChanged"));
    // A modem without its card is another object, and the old one goes first.
    text = with(text, {{"slot[0].sim", "absent"}});
    EXPECT_THAT(heard(MM, text),
                ElementsAre("Modem/0 InterfacesRemoved", "Modem/1 InterfacesAdded"));
    EXPECT_THAT(heard(MM, text), IsEmpty());
    text = with(text, {{"network.bluetooth", "deactivated"}});
    EXPECT_THAT(heard("org.bluez", text), ElementsAre("bluez/hci0 PropertiesChanged"));
}

TEST_F(PlayedServices, EndAConnectionOverBluetoothWhenTheyAreAsked)
{
    const std::string peer = std::string(ADAPTER) + "/dev_00_00_5E_00_53_03";
    played_.become(with(PHONE, {{"network.bluetooth", "connected"}}));
    EXPECT_EQ(call("org.bluez", peer, "org.bluez.Device1", "Disconnect"), "()");
    EXPECT_EQ(value("network.bluetooth"), "disconnected");
}

TEST_F(PlayedServices, WriteWhatAClientChangesIntoTheFile)
{
    EXPECT_EQ(set(NM, NM_PATH, NM, "WirelessEnabled", "false"), "()");
    EXPECT_EQ(value("network.wifi"), "deactivated");
    EXPECT_EQ(value("settings.flight_mode"), "false");
    EXPECT_EQ(set(NM, NM_PATH, NM, "WwanEnabled", "false"), "()");
    EXPECT_EQ(value("network.cellular"), "flight_mode");
    EXPECT_EQ(value("settings.flight_mode"), "false");
    for (const auto& [powered, state, flightMode] :
         {std::tuple("false", "deactivated", "true"), // with the last radio
          {"true", "disconnected", "false"},
          {"false", "deactivated", "true"}}) {
        EXPECT_EQ(set("org.bluez", ADAPTER, "org.bluez.Adapter1", "Powered", powered), "()");
        EXPECT_EQ(value("network.bluetooth"), state);
        EXPECT_EQ(value("settings.flight_mode"), flightMode);
    }
    EXPECT_EQ(get(NM, NM_PATH, NM, "WwanEnabled"), "(<false>,)");
    EXPECT_EQ(set(NM, NM_PATH, NM, "WwanEnabled", "true"), "()");
    EXPECT_EQ(value("settings.flight_mode"), "false");
    EXPECT_EQ(value("network.wifi"), "deactivated");
    EXPECT_EQ(value("slot[0].service"), "in_service");
    EXPECT_EQ(call(NM, NM_PATH, NM, "ActivateConnection",
                   "(objectpath '/org/freedesktop/NetworkManager/Settings/2', objectpath '/', "
                   "objectpath '/')"),
              "('/org/freedesktop/NetworkManager/ActiveConnection/2',)");
    EXPECT_EQ(value("network.cellular"), "connected");
    EXPECT_EQ(get(MM, MODEM, MM_MODEM, "State"), "(<11>,)");

    EXPECT_EQ(call(MM, MODEM, MM_MODEM, "Enable", "(false,)"), "()");
    EXPECT_EQ(value("slot[0].enabled"), "false");
    EXPECT_EQ(get(MM, MODEM, MM_MODEM, "State"), "(<3>,)");
    EXPECT_EQ(call(MM, MODEM, MM_MODEM, "Enable", "(true,)"), "()");
    EXPECT_EQ(value("slot[0].enabled"), "none");
    EXPECT_EQ(get(MM, MODEM, MM_MODEM, "State"), "(<8>,)");

    const std::string host = "/org/freedesktop/hostname1";
    EXPECT_EQ(call(HOSTNAME, host, HOSTNAME, "SetStaticHostname", "('my-phone', false)"), "()");
    EXPECT_EQ(value("settings.host_name"), "my-phone");
    EXPECT_EQ(call(HOSTNAME, host, HOSTNAME, "SetPrettyHostname", "('My \"Phone\"', false)"), "()");
    EXPECT_EQ(value("settings.device_name"), "My \"Phone\"");
    EXPECT_EQ(call(LOCALE, "/org/freedesktop/locale1", LOCALE, "SetLocale",
                   "(['LANG=de_DE.UTF-8'], false)"),
              "()");
    EXPECT_EQ(value("settings.language"), "de_DE.UTF-8");
}

TEST_F(PlayedServices, CountDownWrongPins)
{
    const char* const card = "org.freedesktop.ModemManager1.Sim";
    const char* const wrong =
        "org.freedesktop.ModemManager1.Error.MobileEquipment.IncorrectPassword";
    played_.become(with(PHONE, {{"slot[0].sim", "pin"}}));
    for (const char* const left : {"2", "1"}) {
        EXPECT_EQ(call(MM, SIM, card, "SendPin", "('0000',)"), wrong);
        EXPECT_EQ(value("slot[0].pin_retries"), left);
    }
    EXPECT_EQ(call(MM, SIM, card, "SendPin", "('0000',)"), wrong);
    EXPECT_EQ(value("slot[0].sim"), "puk");
    EXPECT_EQ(call(MM, SIM, card, "SendPin", "('1234',)"),
              "org.freedesktop.ModemManager1.Error.Core.WrongState");
    EXPECT_EQ(call(MM, SIM, card, "SendPuk", "('87654321', '1111')"), wrong);
    EXPECT_EQ(value("slot[0].puk_retries"), "9");
    EXPECT_EQ(call(MM, SIM, card, "SendPuk", "('12345678', '1111')"), "()");
    EXPECT_EQ(value("slot[0].sim"), "available");
    EXPECT_EQ(value("slot[0].pin"), "1111");
    EXPECT_EQ(get(MM, SIM, card, "Imsi"), "(<'001011'>,)");
}

TEST_F(PlayedServices, RefuseTheRest)
{
    const std::string dbus = "org.freedesktop.DBus.Error.";
    const std::string core = "org.freedesktop.ModemManager1.Error.Core.";
    const std::string nm = "org.freedesktop.NetworkManager.";
    const char* const host = "/org/freedesktop/hostname1";
    const char* const locale = "/org/freedesktop/locale1";
    EXPECT_EQ(call(MM, MODEM, MM_MODEM, "Enable", "('x',)"), dbus + "InvalidArgs");
    EXPECT_EQ(call(MM, MODEM, MM_MODEM, "Nonsense"), dbus + "UnknownMethod");
    EXPECT_EQ(call(MM, "/nowhere", MM_MODEM, "Enable", "(true,)"), dbus + "UnknownMethod");
    EXPECT_EQ(set(MM, MODEM, MM_MODEM, "State", "3"), dbus + "InvalidArgs");
    EXPECT_EQ(set(NM, NM_PATH, NM, "WirelessEnabled", "'x'"), dbus + "InvalidArgs");
    EXPECT_EQ(get(NM, NM_PATH, NM, "Nonsense"), dbus + "InvalidArgs");
    EXPECT_THAT(call(NM, NM_PATH, NM, "GetPermissions"),
                HasSubstr("'org.freedesktop.NetworkManager.network-control': 'yes'"));
    EXPECT_EQ(call(MM, "/org/freedesktop/ModemManager1", MM, "SetLogging", "('DEBUG',)"), "()");
    EXPECT_EQ(call(MM, MODEM, MM_MODEM, "Command", "('AT', uint32 1)"), core + "Unsupported");
    EXPECT_EQ(call(NM, NM_PATH, NM, "GetDeviceByIpIface", "('eth9',)"), nm + "UnknownDevice");
    EXPECT_EQ(call(NM, NM_PATH, NM, "DeactivateConnection", "(objectpath '/x',)"),
              nm + "ConnectionNotActive");
    EXPECT_EQ(call("org.bluez", ADAPTER, "org.bluez.Adapter1", "StartDiscovery"),
              "org.bluez.Error.NotSupported");
    EXPECT_EQ(call(HOSTNAME, host, HOSTNAME, "SetStaticHostname", "('bad name!', false)"),
              dbus + "InvalidArgs");
    EXPECT_EQ(call(LOCALE, locale, LOCALE, "SetLocale", "(['FOO=x'], false)"),
              dbus + "InvalidArgs");
    EXPECT_EQ(call(HOSTNAME, host, HOSTNAME, "GetProductUUID", "(false,)"),
              "org.freedesktop.hostname1.NoProductUUID");
}

TEST_F(PlayedServices, AreConnectedWhileAnotherConnectionComesUp)
{
    const auto state = [&](const char* cellular, const char* wifi) {
        played_.become(with(PHONE, {{"network.cellular", cellular},
                                    {"network.wifi", "disconnected"},
                                    {"network.wifi_connection", wifi}}));
        return get(NM, NM_PATH, NM, "State");
    };
    EXPECT_EQ(state("available", "disconnected"), "(<uint32 20>,)");
    EXPECT_EQ(state("available", "configuration"), "(<uint32 40>,)");
    EXPECT_EQ(state("connected", "configuration"), "(<uint32 70>,)");
}

TEST_F(PlayedServices, KeepTheLastGoodStateOfAFileThatBreaks)
{
    played_.become("schema = 1\nnonsense = 1\n");
    EXPECT_EQ(get(NM, NM_PATH, NM, "WirelessEnabled"), "(<true>,)");
    EXPECT_THAT(played_.problems(), ElementsAre(HasSubstr("unknown key \"nonsense\"")));
    // A change that cannot be written is refused.
    EXPECT_EQ(set(NM, NM_PATH, NM, "WirelessEnabled", "false"), "()");
    played_.become(PHONE);
    EXPECT_EQ(get(NM, NM_PATH, NM, "WirelessEnabled"), "(<true>,)");
}

TEST_F(PlayedServices, MisbehaveAsTheFileSays)
{
    const auto askModem = [this](int timeoutMs) {
        return call(MM, MODEM, PROPERTIES, "Get",
                    "('org.freedesktop.ModemManager1.Modem', 'State')", timeoutMs);
    };
    const auto behave = [this](const char* how) {
        played_.become(with(PHONE, {{"service.ModemManager", how}}));
    };
    const char* const gone = "org.freedesktop.DBus.Error.ServiceUnknown";
    const char* const died = "org.freedesktop.DBus.Error.NoReply"; // with the call
    const auto askWhileIt = [&](const char* other) {
        std::string answer = other;
        while (answer == other)
            answer = askModem(5000);
        return answer;
    };
    behave("absent");
    EXPECT_EQ(askWhileIt(died), gone); // the bus may pass a call on before it knows
    behave("silent");
    EXPECT_EQ(askModem(50), "Timeout was reached");
    EXPECT_EQ(get(NM, NM_PATH, NM, "WirelessEnabled"), "(<true>,)"); // the others go on
    behave("{ error = \"slow\", delay_ms = 300 }");
    EXPECT_EQ(askModem(50), "Timeout was reached");
    EXPECT_EQ(askModem(5000), "(<8>,)");
    behave("{ error = \"crashing\", call = 2, delay_ms = 1 }");
    EXPECT_EQ(askModem(5000), "(<8>,)");
    EXPECT_EQ(askModem(5000), died);
    EXPECT_EQ(askWhileIt(gone), "(<8>,)"); // it came back
    behave("crashing");
    EXPECT_EQ(askWhileIt(died), gone);
    played_.become(PHONE);
    EXPECT_EQ(askModem(5000), "(<8>,)");
}

} // namespace
