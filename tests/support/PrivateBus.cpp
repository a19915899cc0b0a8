// SPDX-License-Identifier: Apache-2.0
#include "support/PrivateBus.h"

#include <csignal>
#include <cstdlib>
#include <cstring>
#include <set>
#include <stdexcept>

#include <poll.h>
#include <sched.h>
#include <unistd.h>

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

std::string configurationFor(const std::string& root, const std::string& policy)
{
    std::string text = CONFIGURATION;
    for (const auto& [mark, value] : {std::pair("@ROOT@", root), {"@POLICY@", policy}})
        for (std::size_t at; (at = text.find(mark)) != std::string::npos;)
            text.replace(at, std::strlen(mark), value);
    return text;
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

BusClient::BusClient(const std::string& address)
    : connection_(g_dbus_connection_new_for_address_sync(
          address.c_str(),
          static_cast<GDBusConnectionFlags>(G_DBUS_CONNECTION_FLAGS_AUTHENTICATION_CLIENT |
                                            G_DBUS_CONNECTION_FLAGS_MESSAGE_BUS_CONNECTION),
          nullptr, nullptr, nullptr))
{
    if (!connection_)
        throw std::runtime_error("no bus at " + address);
}

BusClient::~BusClient()
{
    g_dbus_connection_close_sync(connection(), nullptr, nullptr);
}

port::Owned<GVariant> BusClient::call(const std::string& name, const std::string& path,
                                      const std::string& interface, const char* method,
                                      GVariant* arguments, GError** error, int timeoutMs) const
{
    return port::Owned<GVariant>(g_dbus_connection_call_sync(
        connection(), name.c_str(), path.c_str(), interface.c_str(), method, arguments, nullptr,
        G_DBUS_CALL_FLAGS_NONE, timeoutMs, nullptr, error));
}

port::Owned<GVariant> BusClient::mustCall(const std::string& name, const std::string& path,
                                          const std::string& interface, const char* method,
                                          GVariant* arguments) const
{
    port::Owned<GError> error;
    auto reply = call(name, path, interface, method, arguments, port::Out(error));
    if (!reply)
        throw std::runtime_error(std::string(method) + ": " + error->message);
    return reply;
}

port::Owned<GVariant> BusClient::askBus(const char* method, GVariant* arguments) const
{
    return call("org.freedesktop.DBus", "/org/freedesktop/DBus", "org.freedesktop.DBus", method,
                arguments);
}

bool BusClient::isThere(const char* name) const
{
    const auto reply = askBus("NameHasOwner", g_variant_new("(s)", name));
    gboolean is = FALSE;
    if (reply)
        g_variant_get(reply.get(), "(b)", &is);
    return is != FALSE;
}

bool BusClient::waitUntil(const std::function<bool()>& condition) const
{
    const port::Owned<GMainContext> context(g_main_context_new());
    g_main_context_push_thread_default(context.get());
    // Subscribed before the first look, so that no change is missed. That the context ran is all.
    const guint subscription = g_dbus_connection_signal_subscribe(
        connection(), nullptr, nullptr, nullptr, nullptr, nullptr, G_DBUS_SIGNAL_FLAGS_NONE,
        [](GDBusConnection*, const char*, const char*, const char*, const char*, GVariant*,
           gpointer) {},
        nullptr, nullptr);
    // On a busy machine a look may find no answer in time, and no signal come after it.
    const port::Owned<GSource> again(g_timeout_source_new(500));
    g_source_set_callback(
        again.get(), [](gpointer) -> gboolean { return G_SOURCE_CONTINUE; }, nullptr, nullptr);
    g_source_attach(again.get(), context.get());
    const bool isMet = runUntil(condition);
    g_dbus_connection_signal_unsubscribe(connection(), subscription);
    g_main_context_pop_thread_default(context.get());
    return isMet;
}

PrivateBus::PrivateBus()
{
    tree_.write("/bus.conf", configurationFor(tree_.root(), ALLOW_ALL));
    tree_.write("/services/none", "");
}

PrivateBus::~PrivateBus()
{
    if (process_.id() != 0) {
        thaw();
        const std::vector<int> started = daemons();
        process_.tell(SIGTERM);
        process_.end();
        for (const int daemon : started)
            endDaemon(daemon);
    }
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

void PrivateBus::start()
{
    int ends[2];
    if (pipe(ends) != 0)
        throw std::runtime_error("no pipe");
    const std::string configuration = "--config-file=" + tree_.path("/bus.conf");
    const std::string run = tree_.path("/run");
    process_.start([&] {
        const bool isReady = etc_.empty() || (enterPrivateMounts() && unshare(CLONE_NEWUTS) == 0 &&
                                              bindFolder(etc_, "/etc") && bindFolder(run, "/run"));
        if (isReady && dup2(ends[1], ADDRESS_DESCRIPTOR) >= 0)
            execlp("dbus-daemon", "dbus-daemon", configuration.c_str(), "--nofork", "--nopidfile",
                   "--print-address=9", static_cast<char*>(nullptr));
    });
    close(ends[1]);
    char first = 0;
    const bool ready = read(ends[0], &first, 1) == 1; // it prints its address once it listens
    close(ends[0]);
    if (!ready)
        throw std::runtime_error("dbus-daemon does not start");
    setenv("DBUS_SYSTEM_BUS_ADDRESS", address().c_str(), 1);
}

// The processes on the bus besides this one: the daemons that it started.
std::vector<int> PrivateBus::daemons() const
try {
    std::vector<int> found;
    const BusClient bus(address());
    const auto names = bus.askBus("ListNames", nullptr);
    if (!names)
        return found;
    std::set<pid_t> seen = {getpid(), process_.id()};
    GVariantIter* each = nullptr;
    const char* name = nullptr;
    g_variant_get(names.get(), "(as)", &each);
    while (g_variant_iter_next(each, "&s", &name)) {
        const auto reply = bus.askBus("GetConnectionUnixProcessID", g_variant_new("(s)", name));
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
