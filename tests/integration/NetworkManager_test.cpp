// SPDX-License-Identifier: Apache-2.0
// Radios and connections from the real NetworkManager and the real ModemManager, with simulated
// modems.
#include <atomic>

#include <gmock/gmock.h>

#include "linux/Network.h"
#include "support/Answer.h"
#include "support/ModemsOnBusTest.h"
#include "support/NetworkManagerOnBus.h"

using port::CellularState;
using port::Error;
using port::linux_backend::LinuxNetwork;

namespace {

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
    EXPECT_EQ("not supported: NetworkManager knows no Wi-Fi device", show(network.wifi()));
    EXPECT_EQ(Error::Kind::NotSupported, network.cellular().error().kind);
    EXPECT_EQ(Error::Kind::NotSupported, network.packetData().error().kind);
}

TEST_F(NetworkManagerTest, FlightModeFollowsTheSwitches)
{
    std::atomic<bool> isTold{false};
    const auto watch = network.watch([&] { isTold = isTold || valueOf(network.flightMode()); });
    EXPECT_EQ("0 <org.freedesktop.NetworkManager>", show(network.flightMode()));
    networks->setSwitch("WirelessEnabled", false);
    EXPECT_FALSE(valueOf(network.flightMode()));
    networks->setSwitch("WwanEnabled", false);
    EXPECT_TRUE(valueOf(network.flightMode()));
    EXPECT_TRUE(modems->waitUntil([&] { return isTold.load(); }));
    networks->setSwitch("WirelessEnabled", true);
    EXPECT_FALSE(valueOf(network.flightMode()));
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

TEST_F(NetworkManagerTest, CellularSwitchTakesTheModemOffTheNetwork)
{
    addModem({});
    EXPECT_TRUE(becomes(CellularState::Available));
    networks->addCellularConnection(false);
    EXPECT_TRUE(valueOf(network.dataRoaming()));
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
