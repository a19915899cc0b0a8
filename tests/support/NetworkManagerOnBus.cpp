// SPDX-License-Identifier: Apache-2.0
#include "support/NetworkManagerOnBus.h"

#include <cerrno>
#include <csignal>
#include <stdexcept>

#include <fcntl.h>
#include <sched.h>
#include <sys/mount.h>
#include <sys/prctl.h>
#include <sys/stat.h>
#include <sys/wait.h>
#include <unistd.h>

#include "support/Child.h"
#include "support/PrivateBus.h"
#include "support/Wait.h"

namespace {

const char DAEMON[] = "/usr/sbin/NetworkManager";
const char NAME[] = "org.freedesktop.NetworkManager";
const char PATH[] = "/org/freedesktop/NetworkManager";

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

NetworkManagerOnBus::NetworkManagerOnBus(const std::string& address)
    : connection_(connectToBus(address))
{
    writeConfiguration();
    process_ = fork();
    if (process_ == 0)
        run();
    waitUntilReady();
}

NetworkManagerOnBus::~NetworkManagerOnBus()
{
    kill(process_, SIGKILL); // it has nothing to put in order
    waitpid(process_, nullptr, 0);
    g_dbus_connection_close_sync(connection_, nullptr, nullptr);
    g_object_unref(connection_);
}

void NetworkManagerOnBus::writeConfiguration() const
{
    std::string text = CONFIGURATION;
    text.replace(text.find("@ROOT@"), 6, tree_.root());
    tree_.write("/NetworkManager.conf", text);
    tree_.write("/connections/none", "");
    tree_.write("/empty/none", "");
}

void NetworkManagerOnBus::run() const
{
    prctl(PR_SET_PDEATHSIG, SIGKILL);
    const int log = open(tree_.path("/log").c_str(), O_WRONLY | O_CREAT | O_APPEND, 0600);
    // Without a network of its own it must not start.
    if (log < 0 || !enterEmptyNetwork() || dup2(log, STDOUT_FILENO) < 0 ||
        dup2(log, STDERR_FILENO) < 0)
        _exit(127);
    const auto option = [this](const char* name, const char* file) {
        return std::string("--") + name + "=" + tree_.path(file);
    };
    execl(DAEMON, DAEMON, "--no-daemon", option("config", "/NetworkManager.conf").c_str(),
          option("config-dir", "/empty").c_str(), option("system-config-dir", "/empty").c_str(),
          option("intern-config", "/intern.conf").c_str(), option("state-file", "/state").c_str(),
          option("pid-file", "/pid").c_str(), static_cast<char*>(nullptr));
    _exit(127);
}

// It has its name before its objects.
bool NetworkManagerOnBus::isReady() const
{
    GVariant* const version =
        g_dbus_connection_call_sync(connection_, NAME, PATH, "org.freedesktop.DBus.Properties",
                                    "Get", g_variant_new("(ss)", NAME, "Version"), nullptr,
                                    G_DBUS_CALL_FLAGS_NO_AUTO_START, PATIENCE_MS, nullptr, nullptr);
    if (version != nullptr)
        g_variant_unref(version);
    return version != nullptr;
}

void NetworkManagerOnBus::waitUntilReady() const
{
    // Whatever happens on the bus, it is looked again.
    const guint subscription = g_dbus_connection_signal_subscribe(
        connection_, nullptr, nullptr, nullptr, nullptr, nullptr, G_DBUS_SIGNAL_FLAGS_NONE,
        [](GDBusConnection*, const char*, const char*, const char*, const char*, GVariant*,
           gpointer) {},
        nullptr, nullptr);
    const bool ready = runUntil([this] { return isReady(); });
    g_dbus_connection_signal_unsubscribe(connection_, subscription);
    if (!ready)
        throw std::runtime_error("NetworkManager does not start");
}

void NetworkManagerOnBus::call(const char* path, const char* interface, const char* method,
                               GVariant* arguments) const
{
    GError* error = nullptr;
    GVariant* const reply =
        g_dbus_connection_call_sync(connection_, NAME, path, interface, method, arguments, nullptr,
                                    G_DBUS_CALL_FLAGS_NONE, PATIENCE_MS, nullptr, &error);
    if (reply == nullptr)
        throw std::runtime_error(std::string(method) + ": " + error->message);
    g_variant_unref(reply);
}

void NetworkManagerOnBus::setSwitch(const char* name, bool on) const
{
    call(PATH, "org.freedesktop.DBus.Properties", "Set",
         g_variant_new("(ssv)", NAME, name, g_variant_new_boolean(on)));
}

void NetworkManagerOnBus::addCellularConnection(bool homeOnly) const
{
    const std::string settings = std::string("({'connection': {'id': <'cellular'>, 'type': "
                                             "<'gsm'>, 'autoconnect': <false>},"
                                             " 'gsm': {'apn': <'internet'>, 'home-only': <") +
                                 (homeOnly ? "true" : "false") + ">}},)";
    call("/org/freedesktop/NetworkManager/Settings", "org.freedesktop.NetworkManager.Settings",
         "AddConnectionUnsaved",
         g_variant_parse(G_VARIANT_TYPE("(a{sa{sv}})"), settings.c_str(), nullptr, nullptr,
                         nullptr));
}
