// SPDX-License-Identifier: Apache-2.0
#include "support/ModemsOnBus.h"

#include <csignal>
#include <stdexcept>

#include <fcntl.h>
#include <sys/prctl.h>
#include <sys/wait.h>
#include <unistd.h>

#include "linux/ModemManager.h"
#include "support/PrivateBus.h"
#include "support/Wait.h"

using port::linux_backend::Bus;
using port::linux_backend::Modem;
using port::linux_backend::MODEM_MANAGER;

namespace {

const char DAEMON[] = "/usr/sbin/ModemManager";
const char POLICY_DAEMON[] = "/usr/lib/polkit-1/polkitd";
constexpr int AGAIN_MS = 500;

// The object of the modem on a device; empty while its state is not known yet.
std::string settledModem(const std::string& device)
{
    Bus bus;
    const auto modems =
        port::linux_backend::modemsIn(bus.look({port::linux_backend::MODEMS, nullptr}));
    if (!modems)
        return "";
    for (const Modem& modem : modems.value()) {
        const auto state = modem.state();
        if (modem.device() == device && state && state.value() != MM_MODEM_STATE_UNKNOWN &&
            state.value() != MM_MODEM_STATE_INITIALIZING)
            return modem.path();
    }
    return "";
}

void onSignal(GDBusConnection*, const char*, const char*, const char*, const char*, GVariant*,
              gpointer)
{
    // The context has run, which is all.
}

gboolean onTimeout(gpointer isOver)
{
    *static_cast<bool*>(isOver) = true;
    return G_SOURCE_CONTINUE;
}

} // namespace

ModemsOnBus::ModemsOnBus() : context_(g_main_context_new())
{
    // Only the policy daemon may let somebody switch a modem on.
    bus_.addActivatable("org.freedesktop.PolicyKit1", std::string(POLICY_DAEMON) + " --no-debug");
    bus_.start();
    connection_ = connectToBus(bus_.address());
    start();
}

ModemsOnBus::~ModemsOnBus()
{
    kill();
    g_dbus_connection_close_sync(connection_, nullptr, nullptr);
    g_object_unref(connection_);
    g_main_context_unref(context_);
}

std::string ModemsOnBus::obstacle()
{
    if (access(DAEMON, X_OK) != 0 || access(POLICY_DAEMON, X_OK) != 0)
        return "needs ModemManager and polkitd (packages modemmanager, polkitd)";
    return geteuid() == 0 ? "" : "needs root, whom polkitd lets switch a modem on";
}

// In a forked child, where another thread may hold the allocator's lock for good.
void ModemsOnBus::run(const char* logFile) const
{
    prctl(PR_SET_PDEATHSIG, SIGKILL);
    const int log = open(logFile, O_WRONLY | O_CREAT | O_APPEND, 0600);
    if (log >= 0 && dup2(log, STDOUT_FILENO) >= 0 && dup2(log, STDERR_FILENO) >= 0)
        execl(DAEMON, DAEMON, "--test-enable", "--test-no-udev", "--test-no-qrtr",
              "--test-no-suspend-resume", "--log-level=WARN", static_cast<char*>(nullptr));
    _exit(127);
}

void ModemsOnBus::start()
{
    // The bus may not have noticed yet that the one before was killed.
    if (!waitUntil([this] { return !hasName(); }))
        throw std::runtime_error("ModemManager does not leave the bus");
    const std::string logFile = tree_.path("/log");
    process_ = fork();
    if (process_ == 0)
        run(logFile.c_str());
    if (!waitUntil([this] { return hasName(); }))
        throw std::runtime_error("ModemManager does not start");
}

void ModemsOnBus::kill()
{
    if (process_ == 0)
        return;
    ::kill(process_, SIGKILL);
    waitpid(process_, nullptr, 0);
    process_ = 0;
}

void ModemsOnBus::freeze() const
{
    ::kill(process_, SIGSTOP);
    waitpid(process_, nullptr, WUNTRACED);
}

void ModemsOnBus::thaw() const
{
    ::kill(process_, SIGCONT);
}

bool ModemsOnBus::hasName() const
{
    GVariant* const reply =
        call("org.freedesktop.DBus", "/org/freedesktop/DBus", "org.freedesktop.DBus",
             "NameHasOwner", g_variant_new("(s)", MODEM_MANAGER.name));
    gboolean has = FALSE;
    g_variant_get(reply, "(b)", &has);
    g_variant_unref(reply);
    return has != FALSE;
}

GVariant* ModemsOnBus::call(const std::string& name, const std::string& path, const char* interface,
                            const char* method, GVariant* arguments) const
{
    GError* error = nullptr;
    GVariant* const reply = g_dbus_connection_call_sync(
        connection_, name.c_str(), path.c_str(), interface, method, arguments, nullptr,
        G_DBUS_CALL_FLAGS_NONE, PATIENCE_MS, nullptr, &error);
    if (reply == nullptr) {
        const std::string reason = error->message;
        g_error_free(error);
        throw std::runtime_error(std::string(method) + ": " + reason);
    }
    return reply;
}

void ModemsOnBus::setProfile(const std::string& id, const std::string& port) const
{
    const char* const ports[] = {port.c_str(), nullptr};
    g_variant_unref(call(MODEM_MANAGER.name, MODEM_MANAGER.path, MM_DBUS_INTERFACE ".Test",
                         "SetProfile", g_variant_new("(ss^as)", id.c_str(), "generic", ports)));
}

AtModem& ModemsOnBus::plugIn(const std::string& id, const AtModem::State& state)
{
    auto& modem = modems_[id];
    modem.reset(); // before another listens in its place
    modem = std::make_unique<AtModem>(id, state);
    setProfile(id, modem->port());
    return *modem;
}

AtModem& ModemsOnBus::add(const std::string& id, const AtModem::State& state)
{
    AtModem& modem = plugIn(id, state);
    pathOf(id);
    return modem;
}

// Waits for it: on a busy machine a look may find no answer in time.
std::string ModemsOnBus::pathOf(const std::string& id) const
{
    std::string path;
    if (!waitUntil([&] { return !(path = settledModem("/virtual/" + id)).empty(); }))
        throw std::runtime_error("ModemManager does not take the modem " + id);
    return path;
}

void ModemsOnBus::unplug(const std::string& id)
{
    setProfile(id, "abstract:nobody-listens");
}

void ModemsOnBus::enable(const std::string& id) const
{
    g_variant_unref(call(MODEM_MANAGER.name, pathOf(id), MM_DBUS_INTERFACE_MODEM, "Enable",
                         g_variant_new("(b)", TRUE)));
}

int ModemsOnBus::stateOf(const std::string& id) const
{
    GVariant* const reply = call(MODEM_MANAGER.name, pathOf(id), "org.freedesktop.DBus.Properties",
                                 "Get", g_variant_new("(ss)", MM_DBUS_INTERFACE_MODEM, "State"));
    GVariant* value = nullptr;
    g_variant_get(reply, "(v)", &value);
    const int state = g_variant_get_int32(value);
    g_variant_unref(value);
    g_variant_unref(reply);
    return state;
}

bool ModemsOnBus::waitUntil(const std::function<bool()>& condition) const
{
    bool isOver = false;
    g_main_context_push_thread_default(context_);
    const guint subscription =
        g_dbus_connection_signal_subscribe(connection_, nullptr, nullptr, nullptr, nullptr, nullptr,
                                           G_DBUS_SIGNAL_FLAGS_NONE, &onSignal, nullptr, nullptr);
    // On a busy machine a look may find no answer in time, and no signal come after it.
    GSource* const again = g_timeout_source_new(AGAIN_MS);
    g_source_set_callback(
        again, [](gpointer) -> gboolean { return G_SOURCE_CONTINUE; }, nullptr, nullptr);
    g_source_attach(again, context_);
    GSource* const timer = g_timeout_source_new(PATIENCE_MS);
    g_source_set_callback(timer, &onTimeout, &isOver, nullptr);
    g_source_attach(timer, context_);
    // Subscribed before the first look, so that no change is missed.
    bool isMet = condition();
    for (; !isMet && !isOver; isMet = condition())
        g_main_context_iteration(context_, TRUE);
    for (GSource* const source : {again, timer}) {
        g_source_destroy(source);
        g_source_unref(source);
    }
    g_dbus_connection_signal_unsubscribe(connection_, subscription);
    g_main_context_pop_thread_default(context_);
    return isMet;
}
