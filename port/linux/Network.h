// SPDX-License-Identifier: Apache-2.0
// Radios and connections from NetworkManager, ModemManager, BlueZ and the kernel.
#ifndef PORT_LINUX_NETWORK_H
#define PORT_LINUX_NETWORK_H

#include "../backend/Network.h"
#include "Bus.h"
#include "KernelNetwork.h"
#include "ModemManager.h"
#include "NetworkManager.h"

namespace port::linux_backend {

class LinuxNetwork : public Network {
public:
    /// `root` stands before every path that is read; "" for this machine.
    LinuxNetwork(Bus& bus, const std::string& root) : bus_(bus), kernel_(root) {}

    Result<Sourced<CellularState>> cellular() override;
    Result<Sourced<LinkState>> wifi() override;
    Result<Sourced<WifiConnection>> wifiConnection() override;
    Result<Sourced<LinkState>> bluetooth() override;
    Result<Sourced<LinkState>> ethernet() override;
    Result<Sourced<Connectivity>> connectivity() override;
    Result<Fact> ssid() override;
    Result<Sourced<bool>> flightMode();
    Result<Sourced<bool>> packetData();
    Result<Sourced<bool>> mobileData();
    Result<Sourced<bool>> dataRoaming();
    std::unique_ptr<Watch> watch(std::function<void()> changed) override;

private:
    Result<NetworkView> view();
    Result<Sourced<bool>> flightModeIn(const Result<NetworkView>& view);
    std::string whoHasBluetoothOn();
    Result<Sourced<CellularState>> cellularIn(const std::vector<Modem>& modems,
                                              const Result<NetworkView>& view);

    Bus& bus_;
    const KernelNetwork kernel_;
};

} // namespace port::linux_backend

#endif
