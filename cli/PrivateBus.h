// SPDX-License-Identifier: Apache-2.0
// A system bus for one command alone, with the device daemon on it.
#ifndef CLI_PRIVATE_BUS_H
#define CLI_PRIVATE_BUS_H

#include <string>
#include <vector>

#include <sys/types.h>

namespace cli {

/// A folder that only this user may enter, with a bus in it. From start() on both are kept by a
/// process of their own, the keeper, which ends the bus and removes the folder when this object or
/// this process ends, however it ends. When both are killed the next run removes the folder.
class PrivateBus {
public:
    /// Makes the folder. Throws std::runtime_error, as start() does.
    PrivateBus();
    ~PrivateBus();
    PrivateBus(const PrivateBus&) = delete;
    PrivateBus& operator=(const PrivateBus&) = delete;

    const std::string& folder() const
    {
        return folder_;
    }
    /// As DBUS_SYSTEM_BUS_ADDRESS takes it.
    std::string address() const;

    /// Returns when the bus listens. It starts the device daemon when that is first asked, with the
    /// environment as it is now. Without the bus nobody listens at the address. The process must
    /// have one thread only.
    /// The services named are played on it before it returns, for the device of CORESYSTEM_DEVICE.
    void start(bool withBus, const std::vector<std::string>& services);

private:
    std::string path(const char* name) const;
    void writeConfiguration() const;
    [[noreturn]] void keep(bool withBus, const std::vector<std::string>& services, int readiness,
                           int lifeline) const;
    pid_t startBus() const;
    pid_t startServices(const std::vector<std::string>& services) const;

    std::string folder_;
    int lock_ = -1; // shared with the keeper, which holds it until both have ended
    pid_t keeper_ = 0;
    int lifeline_ = -1; // the keeper sees it close
};

} // namespace cli

#endif
