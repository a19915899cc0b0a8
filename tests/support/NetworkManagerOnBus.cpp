// SPDX-License-Identifier: Apache-2.0
#include "support/NetworkManagerOnBus.h"

#include <stdexcept>

#include <sched.h>
#include <sys/mount.h>
#include <sys/stat.h>
#include <unistd.h>

namespace {

const char DAEMON[] = "/usr/sbin/NetworkManager";
const char NAME[] = "org.freedesktop.NetworkManager";
const char PATH[] = "/org/freedesktop/NetworkManager";
const char PROPERTIES[] = "org.freedesktop.DBus.Properties";

// Nothing of the machine is configured, nobody but root is asked for, no lease is taken.
const char CONFIGURATION[] = R"([main]
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

} // namespace

std::string NetworkManagerOnBus::obstacle()
{
    if (access(DAEMON, X_OK) != 0)
        return "needs NetworkManager (package network-manager)";
    return inChild([] { return std::string(enterEmptyNetwork() ? "" : "no"); }).empty()
               ? ""
               : "needs network and mount namespaces, so that it never sees the machine's network";
}

NetworkManagerOnBus::NetworkManagerOnBus(const std::string& address) : client_(address)
{
    std::string text = CONFIGURATION;
    text.replace(text.find("@ROOT@"), 6, tree_.root());
    tree_.write("/NetworkManager.conf", text);
    tree_.write("/connections/none", "");
    tree_.write("/empty/none", "");
    const std::string log = tree_.path("/log");
    const std::string options[] = {"--config=" + tree_.path("/NetworkManager.conf"),
                                   "--config-dir=" + tree_.path("/empty"),
                                   "--system-config-dir=" + tree_.path("/empty"),
                                   "--intern-config=" + tree_.path("/intern.conf"),
                                   "--state-file=" + tree_.path("/state"),
                                   "--pid-file=" + tree_.path("/pid")};
    process_.start([&] {
        // Without a network of its own it must not start.
        if (writeInto(log.c_str()) && enterEmptyNetwork())
            execl(DAEMON, DAEMON, "--no-daemon", options[0].c_str(), options[1].c_str(),
                  options[2].c_str(), options[3].c_str(), options[4].c_str(), options[5].c_str(),
                  static_cast<char*>(nullptr));
    });
    const auto isReady = [this] { // it has its name before its objects
        return client_.call(NAME, PATH, PROPERTIES, "Get",
                            g_variant_new("(ss)", NAME, "Version")) != nullptr;
    };
    if (!client_.waitUntil(isReady))
        throw std::runtime_error("NetworkManager does not start");
}

void NetworkManagerOnBus::setSwitch(const char* name, bool on) const
{
    client_.mustCall(NAME, PATH, PROPERTIES, "Set",
                     g_variant_new("(ssv)", NAME, name, g_variant_new_boolean(on)));
}

void NetworkManagerOnBus::addCellularConnection(bool homeOnly) const
{
    const std::string settings =
        std::string("({'connection': {'id': <'cellular'>, 'type': <'gsm'>, 'autoconnect': <false>},"
                    " 'gsm': {'apn': <'internet'>, 'home-only': <") +
        (homeOnly ? "true" : "false") + ">}},)";
    client_.mustCall(NAME, "/org/freedesktop/NetworkManager/Settings",
                     "org.freedesktop.NetworkManager.Settings", "AddConnectionUnsaved",
                     g_variant_parse(G_VARIANT_TYPE("(a{sa{sv}})"), settings.c_str(), nullptr,
                                     nullptr, nullptr));
}
