// SPDX-License-Identifier: Apache-2.0
// A system bus of the test's own.
#ifndef TESTS_SUPPORT_PRIVATE_BUS_H
#define TESTS_SUPPORT_PRIVATE_BUS_H

#include <string>
#include <vector>

#include <gio/gio.h>
#include <sys/types.h>

#include "support/TemporaryTree.h"

/// A connection of the test's own to a bus; throws when there is none.
GDBusConnection* connectToBus(const std::string& address);

/// A dbus-daemon of type system on a private socket. It is ready when start() returns. While it
/// lives, DBUS_SYSTEM_BUS_ADDRESS of this process names it. At the end it is stopped, and so is
/// every daemon that it started, by process id. The thread that calls start() must outlive it.
class PrivateBus {
public:
    PrivateBus();
    ~PrivateBus();
    PrivateBus(const PrivateBus&) = delete;
    PrivateBus& operator=(const PrivateBus&) = delete;

    /// Before start(): lets the bus start a program when somebody asks for a name.
    void addActivatable(const std::string& name, const std::string& program) const;
    /// Before start(): by itself nobody may own a name or call anybody, as on a machine's own bus;
    /// this file of a bus configuration says who may.
    void usePolicy(const std::string& file) const;
    /// Before start(): the bus and what it starts see this folder as /etc, and a /run with nothing
    /// but systemd's folder, in namespaces of their own: nothing they change reaches the machine.
    void useEtc(const std::string& folder);

    void start();
    /// Kills it without a farewell; start() brings it back under the same address.
    void kill();
    /// Stops it from running, and lets it go on.
    void freeze() const;
    void thaw() const;

    /// Without the bus's identity, so that it stays right after a restart.
    std::string address() const;

private:
    [[noreturn]] void run(const char* configuration, int addressPipe) const;
    std::vector<int> daemons() const;
    void stop();

    TemporaryTree tree_;
    std::string etc_;
    pid_t process_ = 0;
};

#endif
