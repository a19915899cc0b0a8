// SPDX-License-Identifier: Apache-2.0
// Radios, switches, storage, packages, configuration and clock of a device file.
#include <ctime>

#include "simulator/Clock.h"
#include "support/DeviceFileTest.h"

using port::CellularState;
using port::Connectivity;
using port::FontSize;
using port::LinkState;
using port::Question;
using port::WifiConnection;
using Kind = port::Error::Kind;

namespace {

class SimulatorNetworkTest : public DeviceFileTest {
protected:
    template <typename T>
    void expectMissing(const std::string& reason, const port::Result<port::Sourced<T>>& answer)
    {
        expectError(Kind::NotAvailable, reason, answer);
    }

    port::Network& network = backend->network();
};

TEST_F(SimulatorNetworkTest, WifiConnectionAndFontSizeAnswerWithTheirLines)
{
    describe("[network]\nwifi_connection = 'association'\n[settings]\nfont_size = 'huge'\n");
    expectAnswer(WifiConnection::Association, line(3), network.wifiConnection());
    expectAnswer(FontSize::Huge, line(5), backend->get<Question::FontSize>());
    describe("[settings]\nfont_size = 7\n"); // beyond those that have names
    expectAnswer(static_cast<FontSize>(7), line(3), backend->get<Question::FontSize>());
}

TEST_F(SimulatorNetworkTest, AbsentKeysAreNotAvailableAndNoProblemOfTheFile)
{
    describe("[network]\n");
    expectMissing(line(2) + ": [network] has no cellular", network.cellular());
    expectMissing(line(2) + ": [network] has no wifi", network.wifi());
    expectMissing(line(2) + ": [network] has no wifi", network.wifiConnection());
    expectMissing(line(2) + ": [network] has no bluetooth", network.bluetooth());
    expectMissing(path + ": [settings] has no flight_mode", backend->get<Question::FlightMode>());
    expectMissing(path + ": [device] has no serial", backend->get<Question::DeviceSerial>());
    expectMissing(path + ": [storage] has no block_size", backend->internalStorage());
    expectMissing(path + ": no section [packages]", backend->packageVersion("a"));
    expectMissing(path + ": [settings] has no utc_offset", backend->now());
    EXPECT_EQ("", backend->deviceFileProblem());
}

TEST_F(SimulatorNetworkTest, RadioMayBeMissingFromTheDevice)
{
    describe("[network]\ncellular = 'not_supported'\nwifi = 'not_supported'\n"
             "bluetooth = 'not_supported'\n[settings]\nflight_mode = true\n");
    const std::string none = ": this device has no ";
    expectError(Kind::NotSupported, line(3) + none + "cellular", network.cellular());
    expectError(Kind::NotSupported, line(4) + none + "wifi", network.wifi());
    expectError(Kind::NotSupported, line(4) + none + "wifi", network.wifiConnection());
    expectError(Kind::NotSupported, line(5) + none + "bluetooth", network.bluetooth());
}

TEST_F(SimulatorNetworkTest, FlightModeSwitchesOffTheRadiosOfWhichNothingIsSaid)
{
    describe("[settings]\nflight_mode = true\n");
    expectAnswer(CellularState::FlightMode, line(3), network.cellular());
    expectAnswer(LinkState::Deactivated, line(3), network.wifi());
    expectAnswer(WifiConnection::Disconnected, line(3), network.wifiConnection());
    expectAnswer(LinkState::Deactivated, line(3), network.bluetooth());
    describe("[settings]\nflight_mode = true\n[network]\ncellular = 'connected'\n"
             "wifi = 'connected'\nbluetooth = 'connected'\n");
    expectAnswer(CellularState::Connected, line(5), network.cellular());
    expectAnswer(LinkState::Connected, line(6), network.wifi());
    expectAnswer(LinkState::Connected, line(7), network.bluetooth());
}

TEST_F(SimulatorNetworkTest, WifiConnectionFollowsTheRadioWhenNothingIsSaid)
{
    for (const auto& [wifi, connection] : {std::pair("deactivated", WifiConnection::Disconnected),
                                           {"disconnected", WifiConnection::Disconnected},
                                           {"connected", WifiConnection::Connected}}) {
        describe("[network]\nwifi = '" + std::string(wifi) + "'\n");
        expectAnswer(connection, line(3), network.wifiConnection());
    }
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
    for (const auto& [keys, connectivity] :
         {std::pair("wifi = 'disconnected'", Connectivity::None),
          {"cellular = 'connected'", Connectivity::Full},
          {"wifi = 'connected'", Connectivity::Full},
          {"bluetooth = 'connected'", Connectivity::Full},
          {"ethernet = 'connected'", Connectivity::Full},
          {"connectivity = 'portal'\nwifi = 'connected'", Connectivity::Portal}}) {
        describe(std::string("[network]\n") + keys + "\n");
        expectAnswer(connectivity, line(3), network.connectivity());
    }
    describe("[network]\nconnectivity = 'unknown'\nwifi = 'connected'\n");
    expectMissing(line(3) + ": the connectivity is unknown", network.connectivity());
    describe("[network]\n");
    expectMissing(line(2) + ": [network] tells of no link", network.connectivity());
}

TEST_F(SimulatorNetworkTest, SsidIsThatOfAWifiThatIsConnected)
{
    describe("[network]\nssid = 'Home'\nwifi = 'connected'\n");
    expectAnswer("Home", line(3), network.ssid());
    describe("[network]\nssid = 'Home'\nwifi = 'disconnected'\n");
    expectMissing(line(4) + ": Wi-Fi is not connected", network.ssid());
    describe("[network]\nwifi = 'connected'\n");
    expectMissing(line(2) + ": [network] has no ssid", network.ssid());
    describe("[network]\nssid = 'Home'\nwifi = 'not_supported'\n");
    expectError(Kind::NotSupported, line(4) + ": this device has no wifi", network.ssid());
}

TEST_F(SimulatorNetworkTest, ProblemOfTheFileIsTheReason)
{
    describe("[network]\nwifi = 'on'\n");
    const std::string problem = backend->deviceFileProblem();
    expectMissing(problem, network.wifiConnection());
    expectMissing(problem, backend->now());
}

TEST_F(SimulatorNetworkTest, VolumeIsWholeOrNotAvailable)
{
    const std::string keys[] = {"block_size", "fragment_size", "blocks", "available_blocks"};
    for (const std::string& missing : keys) {
        std::string text = "[storage]\n";
        for (const std::string& key : keys)
            text += key == missing ? "" : key + " = 1\n";
        describe(text);
        expectMissing(line(2) + ": [storage] has no " + missing, backend->internalStorage());
    }
}

TEST_F(SimulatorNetworkTest, PackagesAreKnownByTheirExactNames)
{
    describe("[packages]\n'org.example.clock' = '1.2.3'\n' odd\\name' = ''\n");
    expectAnswer(std::string("1.2.3"), line(3), backend->packageVersion("org.example.clock"));
    expectAnswer(std::string(), line(4), backend->packageVersion(" odd\\name"));
    for (const char* const name : {"", "org.example", "ORG.EXAMPLE.CLOCK", "org.example.clock "})
        expectAnswer(std::nullopt, line(2), backend->packageVersion(name));
}

TEST_F(SimulatorNetworkTest, SalesCodeIsTheOneKeyOfTheConfiguration)
{
    describe("[settings]\nsales_code = 'KOO'\n");
    expectAnswer("KOO", line(3), backend->configuration("db/csc/salescode"));
    expectMissing(path + ": no configuration key db/csc/other",
                  backend->configuration("db/csc/other"));
}

TEST(SimulatorClockTest, MomentIsBrokenDownAtTheOffset)
{
    const std::tm time = port::simulator::timeAt(1000000000, 19800); // 2001-09-09 01:46:40 UTC
    char text[100] = "";
    std::strftime(text, sizeof text, "%F %T, %w %j", &time);
    EXPECT_STREQ("2001-09-09 07:16:40, 0 252", text);
    EXPECT_EQ(0, time.tm_isdst);
    EXPECT_EQ(19800, time.tm_gmtoff);
    EXPECT_STREQ("+0530", time.tm_zone);
    for (const auto& [offset, day, zone] :
         {std::tuple(-7200, 8, "-0200"), {86399, 10, "+2359"}, {0, 9, "+0000"}}) {
        EXPECT_EQ(day, port::simulator::timeAt(1000000000, offset).tm_mday);
        EXPECT_STREQ(zone, port::simulator::timeAt(1000000000, offset).tm_zone);
    }
}

TEST_F(SimulatorNetworkTest, ClockIsTheMachines)
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

} // namespace
