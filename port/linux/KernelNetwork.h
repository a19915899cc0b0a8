// SPDX-License-Identifier: Apache-2.0
// Radios and network interfaces as the kernel shows them, in /sys/class.
#ifndef PORT_LINUX_KERNEL_NETWORK_H
#define PORT_LINUX_KERNEL_NETWORK_H

#include <string>
#include <utility>

#include "../backend/Network.h"

namespace port::linux_backend {

class KernelNetwork {
public:
    /// Where the switches stand.
    static constexpr char SWITCHES[] = "/sys/class/rfkill";

    /// `root` stands before every path that is read; "" for this machine.
    explicit KernelNetwork(std::string root) : root_(std::move(root)) {}

    /// NotSupported: there is no interface of that kind.
    Result<Sourced<LinkState>> wifi() const;
    Result<Sourced<WifiConnection>> wifiConnection() const;
    /// A socket for a cable, also that of a container.
    Result<Sourced<LinkState>> ethernet() const;
    /// Whether a connection over Bluetooth is up.
    bool isConnectedOverBluetooth() const;
    bool hasBluetoothAdapter() const;
    /// Whether a switch of Bluetooth is on; false where there is none.
    bool isBluetoothSwitchedOn() const;
    bool hasModem() const;
    /// Whether every switch of a Wi-Fi or cellular radio is off.
    Result<Sourced<bool>> areRadiosSwitchedOff() const;

private:
    const std::string root_;
};

} // namespace port::linux_backend

#endif
