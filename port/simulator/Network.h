// SPDX-License-Identifier: Apache-2.0
// Radios and connections from the sections [network] and [settings] of a device file.
#ifndef PORT_SIMULATOR_NETWORK_H
#define PORT_SIMULATOR_NETWORK_H

#include "../../devicefile/DeviceFile.h"
#include "../backend/Network.h"

namespace port::simulator {

// A key always wins, also in flight mode. A radio without a key is off in flight mode; a Wi-Fi
// connection without one is as its radio's state tells. Without its key there is no Ethernet,
// and the connectivity is as the links tell.
class SimulatedNetwork : public Network {
public:
    explicit SimulatedNetwork(devicefile::DeviceFile& file) : file_(file) {}

    Result<Sourced<CellularState>> cellular() override;
    Result<Sourced<LinkState>> wifi() override;
    Result<Sourced<WifiConnection>> wifiConnection() override;
    Result<Sourced<LinkState>> bluetooth() override;
    Result<Sourced<LinkState>> ethernet() override;
    Result<Sourced<Connectivity>> connectivity() override;
    Result<Fact> ssid() override;
    std::unique_ptr<Watch> watch(std::function<void()> changed) override;

private:
    devicefile::DeviceFile& file_;
};

} // namespace port::simulator

#endif
