// SPDX-License-Identifier: Apache-2.0
// bench_services   asks the machine's real services on a private system bus: a line a case, its
//                  name, the median of elapsed microseconds and the messages sent for one answer,
//                  with tabs between.
//
// The question, the same through the service's own client library, and through its own command.
#include <algorithm>
#include <atomic>
#include <chrono>
#include <cstdint>
#include <cstdlib>
#include <functional>
#include <initializer_list>
#include <iostream>
#include <string>
#include <vector>

#include <NetworkManager.h>
#include <dlfcn.h>
#include <libmm-glib.h>
#include <systemd/sd-bus.h>

#include <CoreSystem.h>
#include <coresystem_port.h>

#include "support/ModemsOnBus.h"
#include "support/NetworkManagerOnBus.h"

namespace {

std::atomic<long> messagesSent{0};

} // namespace

// Stands before systemd's own, so that every message of the port is counted.
extern "C" __attribute__((visibility("default"))) int
sd_bus_send(sd_bus* bus, sd_bus_message* message, std::uint64_t* cookie)
{
    static const auto original =
        reinterpret_cast<decltype(&sd_bus_send)>(dlsym(RTLD_NEXT, "sd_bus_send"));
    ++messagesSent;
    return original(bus, message, cookie);
}

namespace {

using Clock = std::chrono::steady_clock;

struct Case {
    std::string name;
    std::function<bool()> ask; // false when the answer was not the right one
    int rounds;
};

double microsecondsOf(const Case& each)
{
    const Clock::time_point begin = Clock::now();
    if (!each.ask()) {
        std::cerr << each.name << ": a wrong answer\n";
        std::exit(EXIT_FAILURE);
    }
    return std::chrono::duration<double, std::micro>(Clock::now() - begin).count();
}

void measure(const Case& each)
{
    microsecondsOf(each); // warms up
    const long messagesBefore = messagesSent;
    std::vector<double> times;
    for (int i = 0; i < each.rounds; ++i)
        times.push_back(microsecondsOf(each));
    std::nth_element(times.begin(), times.begin() + each.rounds / 2, times.end());
    std::cout << each.name << '\t' << times[static_cast<std::size_t>(each.rounds) / 2] << '\t'
              << static_cast<double>(messagesSent - messagesBefore) / each.rounds << '\n';
}

CoreSystem& library()
{
    return *CoreSystem::GetInstance();
}

bool answers(int (CoreSystem::*method)(char**), const std::string& wanted)
{
    char* answer = nullptr;
    const bool good = (library().*method)(&answer) == 0 && answer != nullptr && wanted == answer;
    std::free(answer);
    return good;
}

bool asksRoaming()
{
    bool roaming = true;
    return library().GetRoamingStatus(0, &roaming) && !roaming;
}

bool asksSimInfo()
{
    std::string mcc, mnc, msin;
    char** const names = library().GetCpNameList();
    return names != nullptr && library().GetSimInfo(names[0], &mcc, &mnc, &msin) && mcc == "001";
}

// The MCC and MNC of the first modem's card, as the service's client library has them.
bool asksClientLibrary(MMManager* manager)
{
    GList* const objects = g_dbus_object_manager_get_objects(G_DBUS_OBJECT_MANAGER(manager));
    bool good = false;
    if (MMModem* const modem =
            objects != nullptr ? mm_object_get_modem(MM_OBJECT(objects->data)) : nullptr) {
        if (MMSim* const sim = mm_modem_get_sim_sync(modem, nullptr, nullptr)) {
            good = std::string(mm_sim_get_operator_identifier(sim)) == "00101";
            g_object_unref(sim);
        }
        g_object_unref(modem);
    }
    g_list_free_full(objects, g_object_unref);
    return good;
}

MMManager* newManager(GDBusConnection* connection)
{
    return mm_manager_new_sync(connection, G_DBUS_OBJECT_MANAGER_CLIENT_FLAGS_DO_NOT_AUTO_START,
                               nullptr, nullptr);
}

bool asksNewClient(GDBusConnection* connection)
{
    MMManager* const manager = newManager(connection);
    const bool good = asksClientLibrary(manager);
    g_object_unref(manager);
    return good;
}

constexpr char NETWORKS[] = "org.freedesktop.NetworkManager";
constexpr char NETWORKS_PATH[] = "/org/freedesktop/NetworkManager";

// A client that knows what to ask for, and does nothing else.
class RawClient {
public:
    RawClient()
    {
        if (sd_bus_open_system(&bus_) < 0)
            std::exit(EXIT_FAILURE);
        sd_bus_match_signal(bus_, nullptr, NETWORKS, NETWORKS_PATH,
                            "org.freedesktop.DBus.Properties", "PropertiesChanged",
                            &RawClient::onSignal, this);
    }
    ~RawClient()
    {
        sd_bus_unref(bus_);
    }
    RawClient(const RawClient&) = delete;
    RawClient& operator=(const RawClient&) = delete;

    bool asksProperty()
    {
        return calls(NETWORKS_PATH, "org.freedesktop.DBus.Properties", "Get", NETWORKS,
                     "WwanEnabled");
    }
    bool asksAllOfTheRoot()
    {
        return calls(NETWORKS_PATH, "org.freedesktop.DBus.Properties", "GetAll", NETWORKS, nullptr);
    }
    bool asksTheTree()
    {
        return calls("/org/freedesktop", "org.freedesktop.DBus.ObjectManager", "GetManagedObjects",
                     nullptr, nullptr);
    }
    bool waitsForASignal()
    {
        for (hasHeard_ = false; !hasHeard_;)
            if (sd_bus_process(bus_, nullptr) == 0)
                sd_bus_wait(bus_, UINT64_MAX);
        return true;
    }
    void forgetSignals()
    {
        while (sd_bus_process(bus_, nullptr) > 0)
            continue;
    }

private:
    bool calls(const char* path, const char* interface, const char* method, const char* first,
               const char* second)
    {
        sd_bus_message* question = nullptr;
        sd_bus_message* reply = nullptr;
        sd_bus_message_new_method_call(bus_, &question, NETWORKS, path, interface, method);
        for (const char* const each : {first, second})
            if (each != nullptr)
                sd_bus_message_append(question, "s", each);
        const bool good = sd_bus_call(bus_, question, 0, nullptr, &reply) >= 0;
        sd_bus_message_unref(reply);
        sd_bus_message_unref(question);
        return good;
    }
    static int onSignal(sd_bus_message*, void* self, sd_bus_error*)
    {
        static_cast<RawClient*>(self)->hasHeard_ = true;
        return 0;
    }

    sd_bus* bus_ = nullptr;
    bool hasHeard_ = false;
};

bool runs(const char* command)
{
    return std::system(command) == 0; // NOLINT(cert-env33-c): a fixed text
}

void measureAll(std::initializer_list<Case> cases)
{
    for (const Case& each : cases)
        measure(each);
}

void measureSimQuestions(GDBusConnection* connection)
{
    measureAll({
        {"IsSimAvailable", [] { return library().IsSimAvailable(); }, 1000},
        {"GetMCCFromSim", [] { return answers(&CoreSystem::GetMCCFromSim, "001"); }, 1000},
        {"GetMNCFromSim", [] { return answers(&CoreSystem::GetMNCFromSim, "01"); }, 1000},
        {"GetPhoneNumberFromSim",
         [] { return answers(&CoreSystem::GetPhoneNumberFromSim, "+15551230001"); }, 1000},
        {"GetIMEI", [] { return answers(&CoreSystem::GetIMEI, "490154203237518"); }, 1000},
        {"GetRoamingStatus", asksRoaming, 1000},
        {"GetCpNameList and GetSimInfo", asksSimInfo, 1000},
        {"libmm-glib, a new client", [=] { return asksNewClient(connection); }, 300},
        {"mmcli", [] { return runs("mmcli -m any -K >/dev/null"); }, 50},
    });
}

bool asksNewNetworkClient()
{
    NMClient* const client = nm_client_new(nullptr, nullptr);
    const bool good = client != nullptr && nm_client_wwan_get_enabled(client);
    g_object_unref(client);
    return good;
}

bool knowsPackage()
{
    char* version = nullptr;
    const bool known = library().GetPackageVersion("libc6", &version) == 0;
    std::free(version);
    return known;
}

void measureOtherQuestions()
{
    RawClient raw;
    measureAll({
        {"IsNetworkConnected", [] { return !library().IsNetworkConnected(false, false); }, 1000},
        {"IsNetworkConnected with Wi-Fi and Bluetooth",
         [] { return !library().IsNetworkConnected(true, true); }, 1000},
        {"IsFlightMode", [] { return !library().IsFlightMode(); }, 1000},
        {"IsMobileData", [] { return !library().IsMobileData(); }, 1000},
        {"libnm, a new client", asksNewNetworkClient, 300},
        {"nmcli", [] { return runs("nmcli -g WWAN radio >/dev/null"); }, 50},
        {"busctl",
         [] {
             return runs("busctl --system get-property org.freedesktop.NetworkManager "
                         "/org/freedesktop/NetworkManager org.freedesktop.NetworkManager "
                         "WwanEnabled >/dev/null");
         },
         50},
        {"a raw client: one property", [&] { return raw.asksProperty(); }, 1000},
        {"a raw client: all of the root object", [&] { return raw.asksAllOfTheRoot(); }, 1000},
        {"a raw client: the whole tree", [&] { return raw.asksTheTree(); }, 300},
        {"GetPackageVersion", knowsPackage, 300},
        {"dpkg-query", [] { return runs("dpkg-query -W -f '${Version}' libc6 >/dev/null"); }, 50},
    });
}

// Notes the last flight mode that it was told.
class FlightModeListener : public IConnectionStateListener {
public:
    void OnWifiDeviceStateChanged(int, void*) override {}
    void OnWifiConnectionStateChanged(int, wifi_ap_h, void*) override {}
    void OnFlightModeChanged(bool enabled, void*) override
    {
        isOn = enabled;
    }
    void OnPacketDataChanged(bool, void*) override {}
    void OnWifiStatusChanged(bool, void*) override {}

    bool isOn = false;
};

// From the call of the switch to the listener.
void measureEvents(const NetworkManagerOnBus& networks)
{
    networks.setSwitch("WirelessEnabled", false);
    FlightModeListener listener;
    library().SetConnectionEventListener(&listener, nullptr);
    measure({"switch to OnFlightModeChanged",
             [&] {
                 const bool wanted = !listener.isOn;
                 networks.setSwitch("WwanEnabled", !wanted);
                 while (listener.isOn != wanted)
                     g_main_context_iteration(nullptr, TRUE);
                 return true;
             },
             50});
    library().SetConnectionEventListener(nullptr, nullptr);
    RawClient raw;
    bool isOn = true;
    measure({"switch to the signal, as a raw client has it",
             [&] {
                 raw.forgetSignals();
                 isOn = !isOn;
                 networks.setSwitch("WwanEnabled", isOn);
                 return raw.waitsForASignal();
             },
             50});
}

GDBusConnection* systemBus()
{
    GDBusConnection* const connection = g_bus_get_sync(G_BUS_TYPE_SYSTEM, nullptr, nullptr);
    g_dbus_connection_set_exit_on_close(connection, FALSE);
    return connection;
}

void measureEverything()
{
    ModemsOnBus modems;
    modems.add("home");
    modems.enable("home");
    GDBusConnection* const connection = systemBus();
    measureSimQuestions(connection);
    const NetworkManagerOnBus networks(modems.bus().address());
    measureOtherQuestions();
    measureEvents(networks);
    g_object_unref(connection);
}

} // namespace

int main()
{
    for (const std::string& obstacle : {ModemsOnBus::obstacle(), NetworkManagerOnBus::obstacle()})
        if (!obstacle.empty()) {
            std::cerr << obstacle << '\n';
            return EXIT_FAILURE;
        }
    coresystem_port::setLogSink(coresystem_port::LogSink::None);
    measureEverything();
    return EXIT_SUCCESS;
}
