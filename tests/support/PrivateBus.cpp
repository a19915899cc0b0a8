// SPDX-License-Identifier: Apache-2.0
#include "support/PrivateBus.h"

#include <cerrno>
#include <csignal>
#include <cstdlib>
#include <memory>
#include <set>
#include <stdexcept>

#include <gio/gio.h>
#include <poll.h>
#include <sched.h>
#include <sys/prctl.h>
#include <sys/wait.h>
#include <unistd.h>

#include "support/Child.h"
#include "support/Wait.h"

extern "C" { // which the header of glibc 2.36 forgets
#include <sys/pidfd.h>
}

namespace {

constexpr int ADDRESS_DESCRIPTOR = 9;

const char CONFIGURATION[] =
    R"(<!DOCTYPE busconfig PUBLIC "-//freedesktop//DTD D-BUS Bus Configuration 1.0//EN"
 "http://www.freedesktop.org/standards/dbus/1.0/busconfig.dtd">
<busconfig>
  <type>system</type>
  <listen>unix:path=@ROOT@/socket</listen>
  <auth>EXTERNAL</auth>
  <servicedir>@ROOT@/services</servicedir>
  @POLICY@
</busconfig>
)";

const char ALLOW_ALL[] = R"(<policy context="default">
    <allow user="*"/>
    <allow own="*"/>
    <allow send_destination="*" eavesdrop="true" send_requested_reply="false"/>
    <allow eavesdrop="true" receive_requested_reply="false"/>
  </policy>)";

// The beginning of a machine's own: whatever is not allowed is forbidden.
const char ALLOW_LITTLE[] = R"(<policy context="default">
    <allow user="*"/>
    <deny own="*"/>
    <deny send_type="method_call"/>
    <allow send_type="signal"/>
    <allow send_requested_reply="true" send_type="method_return"/>
    <allow send_requested_reply="true" send_type="error"/>
    <allow receive_type="method_call"/>
    <allow receive_type="method_return"/>
    <allow receive_type="error"/>
    <allow receive_type="signal"/>
    <allow send_destination="org.freedesktop.DBus"/>
  </policy>
  )";

void replaceAll(std::string& text, const std::string& mark, const std::string& replacement)
{
    for (std::size_t at = text.find(mark); at != std::string::npos;
         at = text.find(mark, at + replacement.size()))
        text.replace(at, mark.size(), replacement);
}

std::string configurationFor(const std::string& root, const std::string& policy)
{
    std::string text = CONFIGURATION;
    replaceAll(text, "@ROOT@", root);
    replaceAll(text, "@POLICY@", policy);
    return text;
}

struct Release {
    void operator()(GDBusConnection* connection) const
    {
        g_dbus_connection_close_sync(connection, nullptr, nullptr);
        g_object_unref(connection);
    }
    void operator()(GVariant* variant) const
    {
        g_variant_unref(variant);
    }
};
using Connection = std::unique_ptr<GDBusConnection, Release>;
using Variant = std::unique_ptr<GVariant, Release>;

Variant askBus(const Connection& bus, const char* method, GVariant* arguments)
{
    return Variant(g_dbus_connection_call_sync(
        bus.get(), "org.freedesktop.DBus", "/org/freedesktop/DBus", "org.freedesktop.DBus", method,
        arguments, nullptr, G_DBUS_CALL_FLAGS_NONE, PATIENCE_MS, nullptr, nullptr));
}

void endDaemon(int processDescriptor)
{
    pollfd ended = {processDescriptor, POLLIN, 0};
    pidfd_send_signal(processDescriptor, SIGTERM, nullptr, 0);
    if (poll(&ended, 1, PATIENCE_MS) == 0)
        pidfd_send_signal(processDescriptor, SIGKILL, nullptr, 0);
    close(processDescriptor);
}

} // namespace

GDBusConnection* connectToBus(const std::string& address)
{
    GDBusConnection* const connection = g_dbus_connection_new_for_address_sync(
        address.c_str(),
        static_cast<GDBusConnectionFlags>(G_DBUS_CONNECTION_FLAGS_AUTHENTICATION_CLIENT |
                                          G_DBUS_CONNECTION_FLAGS_MESSAGE_BUS_CONNECTION),
        nullptr, nullptr, nullptr);
    if (connection == nullptr)
        throw std::runtime_error("no bus at " + address);
    return connection;
}

PrivateBus::PrivateBus()
{
    tree_.write("/bus.conf", configurationFor(tree_.root(), ALLOW_ALL));
    tree_.write("/services/none", "");
}

PrivateBus::~PrivateBus()
{
    stop();
    unsetenv("DBUS_SYSTEM_BUS_ADDRESS");
}

std::string PrivateBus::address() const
{
    return "unix:path=" + tree_.path("/socket");
}

void PrivateBus::addActivatable(const std::string& name, const std::string& program) const
{
    tree_.write("/services/" + name + ".service",
                "[D-BUS Service]\nName=" + name + "\nExec=" + program + "\nUser=root\n");
}

void PrivateBus::usePolicy(const std::string& file) const
{
    tree_.write("/bus.conf",
                configurationFor(tree_.root(), ALLOW_LITTLE + ("<include>" + file) + "</include>"));
}

void PrivateBus::useEtc(const std::string& folder)
{
    etc_ = folder;
    tree_.write("/run/systemd/why", "Where its services put their sockets.\n");
}

// In a forked child, where another thread may hold the allocator's lock for good.
void PrivateBus::run(const char* configuration, int addressPipe) const
{
    // A test that ends before its time leaves no bus behind.
    prctl(PR_SET_PDEATHSIG, SIGKILL);
    const bool ready =
        etc_.empty() || (enterPrivateMounts() && unshare(CLONE_NEWUTS) == 0 &&
                         bindFolder(etc_, "/etc") && bindFolder(tree_.path("/run"), "/run"));
    if (ready && dup2(addressPipe, ADDRESS_DESCRIPTOR) >= 0)
        execlp("dbus-daemon", "dbus-daemon", configuration, "--nofork", "--nopidfile",
               "--print-address=9", static_cast<char*>(nullptr));
    _exit(127);
}

void PrivateBus::start()
{
    int ends[2];
    if (pipe(ends) != 0)
        throw std::runtime_error("no pipe");
    const std::string configuration = "--config-file=" + tree_.path("/bus.conf");
    process_ = fork();
    if (process_ == 0)
        run(configuration.c_str(), ends[1]);
    close(ends[1]);
    char first = 0;
    const bool ready = read(ends[0], &first, 1) == 1; // it prints its address once it listens
    close(ends[0]);
    if (!ready)
        throw std::runtime_error("dbus-daemon does not start");
    setenv("DBUS_SYSTEM_BUS_ADDRESS", address().c_str(), 1);
}

void PrivateBus::kill()
{
    ::kill(process_, SIGKILL);
    waitpid(process_, nullptr, 0);
    process_ = 0;
}

void PrivateBus::freeze() const
{
    ::kill(process_, SIGSTOP);
    waitpid(process_, nullptr, WUNTRACED); // until it has stopped
}

void PrivateBus::thaw() const
{
    ::kill(process_, SIGCONT);
}

// The processes on the bus besides this one: the daemons that it started.
std::vector<int> PrivateBus::daemons() const
try {
    std::vector<int> found;
    const Connection bus(connectToBus(address()));
    const Variant names = askBus(bus, "ListNames", nullptr);
    if (!names)
        return found;
    std::set<pid_t> seen = {getpid(), process_};
    GVariantIter* each = nullptr;
    const char* name = nullptr;
    g_variant_get(names.get(), "(as)", &each);
    while (g_variant_iter_next(each, "&s", &name)) {
        const Variant reply = askBus(bus, "GetConnectionUnixProcessID", g_variant_new("(s)", name));
        guint32 process = 0;
        if (reply)
            g_variant_get(reply.get(), "(u)", &process);
        if (process != 0 && seen.insert(static_cast<pid_t>(process)).second)
            found.push_back(pidfd_open(static_cast<pid_t>(process), 0));
    }
    g_variant_iter_free(each);
    return found;
} catch (const std::runtime_error&) { // the bus died before
    return {};
}

void PrivateBus::stop()
{
    if (process_ == 0)
        return;
    thaw();
    const std::vector<int> started = daemons();
    ::kill(process_, SIGTERM);
    waitpid(process_, nullptr, 0);
    for (const int daemon : started)
        endDaemon(daemon);
}
