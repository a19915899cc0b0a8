// SPDX-License-Identifier: Apache-2.0
// Radios and connections from the real NetworkManager and the real ModemManager, with simulated
// modems.
#include <condition_variable>
#include <memory>
#include <mutex>
#include <stdexcept>

#include <gmock/gmock.h>
#include <sched.h>
#include <sys/mount.h>
#include <sys/stat.h>
#include <unistd.h>

#include "linux/Network.h"
#include "linux/NetworkManager.h"
#include "support/Answer.h"
#include "support/ModemsOnBus.h"

using port::CellularState;
using port::Error;
using port::linux_backend::LinuxNetwork;
using port::linux_backend::NETWORK_MANAGER;

namespace {

// Nothing of the machine is configured, nobody but root is asked for, no lease is taken.
const char NETWORK_MANAGER_CONFIGURATION[] = R"([main]
plugins=keyfile
dns=none
rc-manager=unmanaged
systemd-resolved=false
no-auto-default=*
dhcp=internal
auth-polkit=root-only
[keyfile]
path=@ROOT@/connections
)";

// A network without interfaces, no device manager (which /sys being read-only tells), and empty
// folders for what the daemon keeps.
bool enterEmptyNetwork()
{
    if (unshare(CLONE_NEWNET) != 0 || !enterPrivateMounts() ||
        mount("sysfs", "/sys", "sysfs", MS_RDONLY, nullptr) != 0)
        return false;
    for (const char* const folder : {"/run", "/var/lib"})
        if (mount("tmpfs", folder, "tmpfs", 0, nullptr) != 0)
            return false;
    return mkdir("/run/NetworkManager", 0755) == 0 && mkdir("/var/lib/NetworkManager", 0755) == 0;
}

// Shut into network and mount namespaces of its own: it sees none of this machine's interfaces and
// writes nothing that stays. It is ready after construction.
class NetworkManagerOnBus {
public:
    explicit NetworkManagerOnBus(const std::string& address) : client_(address)
    {
        std::string text = NETWORK_MANAGER_CONFIGURATION;
        text.replace(text.find("@ROOT@"), 6, tree_.root());
        tree_.write("/NetworkManager.conf", text);
        tree_.write("/connections/none", "");
        tree_.write("/empty/none", "");
        const auto option = [this](const char* name, const char* file) {
            return std::string("--") + name + "=" + tree_.path(file);
        };
        const std::string log = tree_.path("/log");
        const std::string options[] = {
            option("config", "/NetworkManager.conf"), option("config-dir", "/empty"),
            option("system-config-dir", "/empty"),    option("intern-config", "/intern.conf"),
            option("state-file", "/state"),           option("pid-file", "/pid")};
        process_.start([&] {
            // Without a network of its own it must not start.
            if (enterEmptyNetwork() && writeInto(log.c_str()))
                execl(DAEMON, DAEMON, "--no-daemon", options[0].c_str(), options[1].c_str(),
                      options[2].c_str(), options[3].c_str(), options[4].c_str(),
                      options[5].c_str(), static_cast<char*>(nullptr));
        });
        const auto isReady = [this] { // it has its name before its objects
            return client_.call(NETWORK_MANAGER.name, NETWORK_MANAGER.path, PROPERTIES, "Get",
                                g_variant_new("(ss)", NETWORK_MANAGER.name, "Version")) != nullptr;
        };
        if (!client_.waitUntil(isReady))
            throw std::runtime_error("NetworkManager does not start");
    }

    // Why it cannot be had on this machine; empty when it can.
    static std::string obstacle()
    {
        if (access(DAEMON, X_OK) != 0)
            return "needs NetworkManager (package network-manager)";
        return inChild([] { return std::string(enterEmptyNetwork() ? "" : "no"); }).empty()
                   ? ""
                   : "needs network and mount namespaces, so that it never sees the machine's "
                     "network";
    }

    // "WirelessEnabled" or "WwanEnabled".
    void setSwitch(const char* name, bool on) const
    {
        client_.mustCall(
            NETWORK_MANAGER.name, NETWORK_MANAGER.path, PROPERTIES, "Set",
            g_variant_new("(ssv)", NETWORK_MANAGER.name, name, g_variant_new_boolean(on)));
    }
    // For the network's own subscribers, or for roaming ones too.
    void addCellularConnection(bool homeOnly) const
    {
        const std::string settings =
            std::string("({'connection': {'id': <'cellular'>, 'type': <'gsm'>, 'autoconnect': "
                        "<false>}, 'gsm': {'apn': <'internet'>, 'home-only': <") +
            (homeOnly ? "true" : "false") + ">}},)";
        client_.mustCall(NETWORK_MANAGER.name, "/org/freedesktop/NetworkManager/Settings",
                         "org.freedesktop.NetworkManager.Settings", "AddConnectionUnsaved",
                         g_variant_parse(G_VARIANT_TYPE("(a{sa{sv}})"), settings.c_str(), nullptr,
                                         nullptr, nullptr));
    }

private:
    static constexpr char DAEMON[] = "/usr/sbin/NetworkManager";
    static constexpr char PROPERTIES[] = "org.freedesktop.DBus.Properties";

    const TemporaryTree tree_;
    const BusClient client_;
    Process process_;
};

class NetworkManagerTest : public ModemsOnBusTest {
protected:
    void SetUp() override
    {
        if (!NetworkManagerOnBus::obstacle().empty())
            GTEST_SKIP() << NetworkManagerOnBus::obstacle();
        ModemsOnBusTest::SetUp();
        if (modems != nullptr)
            networks = std::make_unique<NetworkManagerOnBus>(modems->bus().address());
    }

    // A modem that is on the air, and known to NetworkManager.
    AtModem& addModem(const AtModem::State& state)
    {
        AtModem& modem = modems->add("home", state);
        EXPECT_TRUE(modems->waitUntil([this] { return bool(network.packetData()); }));
        modems->enable("home");
        return modem;
    }
    bool becomes(CellularState state)
    {
        return modems->waitUntil([&] {
            const auto now = network.cellular();
            return now && now.value().value == state;
        });
    }

    std::unique_ptr<NetworkManagerOnBus> networks;
    const TemporaryTree root;
    LinuxNetwork network{bus, root.root()};
};

TEST_F(NetworkManagerTest, MachineWithoutRadiosHasNone)
{
    EXPECT_EQ(Error::Kind::NotSupported, network.wifi().error().kind);
    EXPECT_EQ(Error::Kind::NotSupported, network.cellular().error().kind);
    EXPECT_EQ(Error::Kind::NotSupported, network.packetData().error().kind);
    EXPECT_EQ("NetworkManager knows no Wi-Fi device", network.wifi().error().reason);
    EXPECT_EQ("org.freedesktop.NetworkManager", network.flightMode().value().source);
}

TEST_F(NetworkManagerTest, FlightModeFollowsTheSwitches)
{
    EXPECT_FALSE(valueOf(network.flightMode()));
    networks->setSwitch("WirelessEnabled", false);
    EXPECT_FALSE(valueOf(network.flightMode()));
    networks->setSwitch("WwanEnabled", false);
    EXPECT_TRUE(valueOf(network.flightMode()));
    networks->setSwitch("WirelessEnabled", true);
    EXPECT_FALSE(valueOf(network.flightMode()));
}

TEST_F(NetworkManagerTest, SwitchIsToldToAWatch)
{
    std::mutex mutex;
    std::condition_variable changed;
    bool flightMode = false;
    const auto watch = network.watch([&] {
        const bool now = valueOf(network.flightMode());
        const std::lock_guard<std::mutex> lock(mutex);
        flightMode = now;
        changed.notify_all();
    });
    networks->setSwitch("WirelessEnabled", false);
    networks->setSwitch("WwanEnabled", false);
    std::unique_lock<std::mutex> lock(mutex);
    EXPECT_TRUE(changed.wait_for(lock, std::chrono::seconds(10), [&] { return flightMode; }));
}

TEST_F(NetworkManagerTest, ModemAtHomeIsAvailable)
{
    addModem({});
    EXPECT_TRUE(becomes(CellularState::Available));
}

TEST_F(NetworkManagerTest, ModemAbroadObeysItsConnection)
{
    AtModem::State abroad;
    abroad.registration = 5;
    AtModem& modem = addModem(abroad);
    EXPECT_EQ("NetworkManager has no cellular connection", network.dataRoaming().error().reason);
    EXPECT_TRUE(becomes(CellularState::Available));
    networks->addCellularConnection(true);
    EXPECT_FALSE(valueOf(network.dataRoaming()));
    EXPECT_FALSE(valueOf(network.packetData())); // it does not connect by itself
    EXPECT_TRUE(becomes(CellularState::RoamingOff));
    modem.change([](AtModem::State& state) { state.registration = 1; });
    EXPECT_TRUE(becomes(CellularState::Available));
}

TEST_F(NetworkManagerTest, ConnectionThatMayRoamAllowsData)
{
    addModem({});
    networks->addCellularConnection(false);
    EXPECT_TRUE(valueOf(network.dataRoaming()));
}

TEST_F(NetworkManagerTest, CellularSwitchTakesTheModemOffTheNetwork)
{
    addModem({});
    EXPECT_TRUE(becomes(CellularState::Available));
    networks->setSwitch("WwanEnabled", false);
    EXPECT_TRUE(becomes(CellularState::FlightMode)); // its only radio
    EXPECT_FALSE(valueOf(network.packetData()));
    // One that is still being switched off cannot be switched on.
    EXPECT_TRUE(
        modems->waitUntil([this] { return modems->stateOf("home") == MM_MODEM_STATE_DISABLED; }));
    networks->setSwitch("WwanEnabled", true);
    EXPECT_TRUE(becomes(CellularState::Available));
}

} // namespace
