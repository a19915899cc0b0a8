// SPDX-License-Identifier: Apache-2.0
// Radios, switches, storage, packages, configuration and clock of a device file.
#include <ctime>

#include "simulator/Clock.h"
#include "support/DeviceFileTest.h"

using port::CellularState;
using port::Connectivity;
using port::FontSize;
using port::LinkState;
using port::WifiConnection;
using Kind = port::Error::Kind;

namespace {

class SimulatorNetworkTest : public DeviceFileTest {
protected:
    port::Network& network = backend->network();
};

TEST_F(SimulatorNetworkTest, RadiosAnswerWithTheirLines)
{
    describe("[network]\ncellular = 'roaming_off'\nwifi = 'connected'\n"
             "wifi_connection = 'association'\nbluetooth = 'disconnected'\n");
    expectAnswer(CellularState::RoamingOff, line(3), network.cellular());
    expectAnswer(LinkState::Connected, line(4), network.wifi());
    expectAnswer(WifiConnection::Association, line(5), network.wifiConnection());
    expectAnswer(LinkState::Disconnected, line(6), network.bluetooth());
}

TEST_F(SimulatorNetworkTest, SwitchesAnswerWithTheirLines)
{
    describe("[settings]\nflight_mode = false\npacket_data = true\nmobile_data = false\n"
             "data_roaming = true\nfont_size = 'huge'\n");
    expectAnswer(false, line(3), backend->get<port::Question::FlightMode>());
    expectAnswer(true, line(4), backend->get<port::Question::PacketData>());
    expectAnswer(false, line(5), backend->get<port::Question::MobileData>());
    expectAnswer(true, line(6), backend->get<port::Question::DataRoaming>());
    expectAnswer(FontSize::Huge, line(7), backend->get<port::Question::FontSize>());
}

TEST_F(SimulatorNetworkTest, AbsentKeysAreNotAvailable)
{
    describe("[network]\n");
    expectError(Kind::NotAvailable, line(2) + ": [network] has no cellular", network.cellular());
    expectError(Kind::NotAvailable, line(2) + ": [network] has no wifi", network.wifi());
    expectError(Kind::NotAvailable, line(2) + ": [network] has no wifi", network.wifiConnection());
    expectError(Kind::NotAvailable, line(2) + ": [network] has no bluetooth", network.bluetooth());
    expectError(Kind::NotAvailable, path + ": [settings] has no flight_mode",
                backend->get<port::Question::FlightMode>());
    expectError(Kind::NotAvailable, path + ": [settings] has no packet_data",
                backend->get<port::Question::PacketData>());
    expectError(Kind::NotAvailable, path + ": [settings] has no font_size",
                backend->get<port::Question::FontSize>());
    expectError(Kind::NotAvailable, path + ": [device] has no serial",
                backend->get<port::Question::DeviceSerial>());
}

TEST_F(SimulatorNetworkTest, RadioMayBeMissingFromTheDevice)
{
    describe("[network]\ncellular = 'not_supported'\nwifi = 'not_supported'\n"
             "bluetooth = 'not_supported'\n[settings]\nflight_mode = true\n");
    EXPECT_EQ(Kind::NotSupported, network.cellular().error().kind);
    EXPECT_EQ(Kind::NotSupported, network.wifi().error().kind);
    EXPECT_EQ(Kind::NotSupported, network.wifiConnection().error().kind);
    EXPECT_EQ(Kind::NotSupported, network.bluetooth().error().kind);
}

TEST_F(SimulatorNetworkTest, FlightModeSwitchesOffTheRadiosOfWhichNothingIsSaid)
{
    describe("[settings]\nflight_mode = true\n");
    expectAnswer(CellularState::FlightMode, line(3), network.cellular());
    expectAnswer(LinkState::Deactivated, line(3), network.wifi());
    expectAnswer(LinkState::Deactivated, line(3), network.bluetooth());
}

TEST_F(SimulatorNetworkTest, WhatIsSaidHoldsInFlightModeToo)
{
    describe("[settings]\nflight_mode = true\n[network]\ncellular = 'connected'\n"
             "wifi = 'connected'\nbluetooth = 'connected'\n");
    expectAnswer(CellularState::Connected, line(5), network.cellular());
    expectAnswer(LinkState::Connected, line(6), network.wifi());
    expectAnswer(LinkState::Connected, line(7), network.bluetooth());
}

TEST_F(SimulatorNetworkTest, WifiConnectionFollowsTheRadioWhenNothingIsSaid)
{
    const struct {
        const char* wifi;
        WifiConnection connection;
    } rows[] = {
        {"deactivated", WifiConnection::Disconnected},
        {"disconnected", WifiConnection::Disconnected},
        {"connected", WifiConnection::Connected},
    };
    for (const auto& row : rows) {
        describe("[network]\nwifi = '" + std::string(row.wifi) + "'\n");
        expectAnswer(row.connection, line(3), network.wifiConnection());
    }
    describe("[settings]\nflight_mode = true\n");
    expectAnswer(WifiConnection::Disconnected, line(3), network.wifiConnection());
}

TEST_F(SimulatorNetworkTest, EthernetIsThereWhenItIsSaid)
{
    describe("[network]\nethernet = 'disconnected'\n");
    expectAnswer(LinkState::Disconnected, line(3), network.ethernet());
    describe("[network]\nwifi = 'connected'\n");
    expectError(Kind::NotSupported, line(2) + ": [network] has no ethernet", network.ethernet());
}

TEST_F(SimulatorNetworkTest, ConnectivityFollowsTheLinksWhenNothingIsSaid)
{
    const struct {
        const char* keys;
        Connectivity connectivity;
    } rows[] = {
        {"wifi = 'disconnected'", Connectivity::None},
        {"cellular = 'connected'", Connectivity::Full},
        {"wifi = 'connected'", Connectivity::Full},
        {"bluetooth = 'connected'", Connectivity::Full},
        {"ethernet = 'connected'", Connectivity::Full},
        {"connectivity = 'portal'\nwifi = 'connected'", Connectivity::Portal},
    };
    for (const auto& row : rows) {
        describe(std::string("[network]\n") + row.keys + "\n");
        expectAnswer(row.connectivity, line(3), network.connectivity());
    }
    describe("[network]\nconnectivity = 'unknown'\nwifi = 'connected'\n");
    expectError(Kind::NotAvailable, line(3) + ": the connectivity is unknown",
                network.connectivity());
    describe("[network]\n");
    expectError(Kind::NotAvailable, line(2) + ": [network] tells of no link",
                network.connectivity());
}

TEST_F(SimulatorNetworkTest, SsidIsThatOfAWifiThatIsConnected)
{
    describe("[network]\nssid = 'Home'\nwifi = 'connected'\n");
    expectAnswer("Home", line(3), network.ssid());
    describe("[network]\nssid = 'Home'\nwifi = 'disconnected'\n");
    expectError(Kind::NotAvailable, line(4) + ": Wi-Fi is not connected", network.ssid());
    describe("[network]\nwifi = 'connected'\n");
    expectError(Kind::NotAvailable, line(2) + ": [network] has no ssid", network.ssid());
    describe("[network]\nssid = 'Home'\nwifi = 'not_supported'\n");
    expectError(Kind::NotSupported, line(4) + ": this device has no wifi", network.ssid());
}

TEST_F(SimulatorNetworkTest, ProblemOfTheFileIsTheReason)
{
    describe("[network]\nwifi = 'on'\n");
    const std::string problem = backend->deviceFileProblem();
    expectError(Kind::NotAvailable, problem, network.cellular());
    expectError(Kind::NotAvailable, problem, network.wifi());
    expectError(Kind::NotAvailable, problem, network.wifiConnection());
    expectError(Kind::NotAvailable, problem, backend->get<port::Question::FlightMode>());
    expectError(Kind::NotAvailable, problem, backend->internalStorage());
    expectError(Kind::NotAvailable, problem, backend->packageVersion("a"));
    expectError(Kind::NotAvailable, problem, backend->now());
}

TEST_F(SimulatorNetworkTest, SerialNumberIsAnswered)
{
    describe("[device]\nserial = 'R38N50'\n");
    expectAnswer("R38N50", line(3), backend->get<port::Question::DeviceSerial>());
}

class SimulatorStorageTest : public DeviceFileTest {};

TEST_F(SimulatorStorageTest, VolumeIsAnsweredWhole)
{
    describe("[storage]\nblock_size = 4096\nfragment_size = 512\nblocks = 6442450944\n"
             "available_blocks = 7\n");
    const auto answer = backend->internalStorage();
    ASSERT_TRUE(answer) << answer.error().reason;
    EXPECT_EQ(4096U, answer.value().value.blockSize);
    EXPECT_EQ(512U, answer.value().value.fragmentSize);
    EXPECT_EQ(6442450944U, answer.value().value.blocks); // 3 TiB
    EXPECT_EQ(7U, answer.value().value.availableBlocks);
    EXPECT_EQ(line(2), answer.value().source);
}

TEST_F(SimulatorStorageTest, VolumeOfWhichAKeyIsMissingIsNotAvailable)
{
    const std::string keys[] = {"block_size", "fragment_size", "blocks", "available_blocks"};
    for (const std::string& missing : keys) {
        std::string text = "[storage]\n";
        for (const std::string& key : keys)
            text += key == missing ? "" : key + " = 1\n";
        describe(text);
        expectError(Kind::NotAvailable, line(2) + ": [storage] has no " + missing,
                    backend->internalStorage());
    }
}

class SimulatorPackagesTest : public DeviceFileTest {};

TEST_F(SimulatorPackagesTest, VersionsAreAnsweredByExactName)
{
    describe("[packages]\n'org.example.clock' = '1.2.3'\n' odd\\name' = ''\n");
    expectAnswer(std::string("1.2.3"), line(3), backend->packageVersion("org.example.clock"));
    expectAnswer(std::string(), line(4), backend->packageVersion(" odd\\name"));
}

TEST_F(SimulatorPackagesTest, OtherNamesAreNotInstalled)
{
    describe("[packages]\n'org.example.clock' = '1.2.3'\n");
    for (const char* const name : {"", "org.example", "ORG.EXAMPLE.CLOCK", "org.example.clock "})
        expectAnswer(std::nullopt, line(2), backend->packageVersion(name));
}

TEST_F(SimulatorPackagesTest, FileThatNamesNoPackagesTellsOfNone)
{
    describe("");
    expectError(Kind::NotAvailable, path + ": no section [packages]", backend->packageVersion("a"));
}

class SimulatorConfigurationTest : public DeviceFileTest {};

TEST_F(SimulatorConfigurationTest, SalesCodeIsTheOneKey)
{
    describe("[settings]\nsales_code = 'KOO'\n");
    expectAnswer("KOO", line(3), backend->configuration("db/csc/salescode"));
    expectError(Kind::NotAvailable, path + ": no configuration key db/csc/other",
                backend->configuration("db/csc/other"));
}

class SimulatorClockTest : public DeviceFileTest {};

TEST_F(SimulatorClockTest, MomentIsBrokenDownAtTheOffset)
{
    const std::tm time = port::simulator::timeAt(1000000000, 19800); // 2001-09-09 01:46:40 UTC
    EXPECT_EQ(101, time.tm_year);
    EXPECT_EQ(8, time.tm_mon);
    EXPECT_EQ(9, time.tm_mday);
    EXPECT_EQ(7, time.tm_hour);
    EXPECT_EQ(16, time.tm_min);
    EXPECT_EQ(40, time.tm_sec);
    EXPECT_EQ(0, time.tm_wday);
    EXPECT_EQ(251, time.tm_yday);
    EXPECT_EQ(0, time.tm_isdst);
    EXPECT_EQ(19800, time.tm_gmtoff);
    EXPECT_STREQ("+0530", time.tm_zone);
}

TEST_F(SimulatorClockTest, OffsetMayCrossTheDay)
{
    EXPECT_EQ(8, port::simulator::timeAt(1000000000, -7200).tm_mday);
    EXPECT_STREQ("-0200", port::simulator::timeAt(1000000000, -7200).tm_zone);
    EXPECT_EQ(10, port::simulator::timeAt(1000000000, 86399).tm_mday);
    EXPECT_STREQ("+2359", port::simulator::timeAt(1000000000, 86399).tm_zone);
    EXPECT_STREQ("+0000", port::simulator::timeAt(1000000000, 0).tm_zone);
}

TEST_F(SimulatorClockTest, ClockIsTheMachines)
{
    describe("[settings]\nutc_offset = -12600\n");
    const std::time_t before = std::time(nullptr);
    const auto answer = backend->now();
    const std::time_t after = std::time(nullptr);
    ASSERT_TRUE(answer) << answer.error().reason;
    std::tm local = answer.value().value;
    const std::time_t moment = timegm(&local) + 12600;
    EXPECT_LE(before, moment);
    EXPECT_GE(after, moment);
    EXPECT_EQ(-12600, answer.value().value.tm_gmtoff);
    EXPECT_EQ("system clock, " + line(3), answer.value().source);
}

TEST_F(SimulatorClockTest, TimeWithoutAnOffsetIsNotAvailable)
{
    describe("");
    expectError(Kind::NotAvailable, path + ": [settings] has no utc_offset", backend->now());
}

} // namespace
