// SPDX-License-Identifier: Apache-2.0
#include "support/ModemsOnBus.h"

#include <stdexcept>

#include <unistd.h>

#include "linux/ModemManager.h"

using port::linux_backend::Bus;
using port::linux_backend::Modem;
using port::linux_backend::MODEM_MANAGER;

namespace {

const char DAEMON[] = "/usr/sbin/ModemManager";
const char POLICY_DAEMON[] = "/usr/lib/polkit-1/polkitd";

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

} // namespace

ModemsOnBus::ModemsOnBus()
{
    // Only the policy daemon may let somebody switch a modem on.
    bus_.addActivatable("org.freedesktop.PolicyKit1", std::string(POLICY_DAEMON) + " --no-debug");
    bus_.start();
    client_ = std::make_unique<BusClient>(bus_.address());
    start();
}

std::string ModemsOnBus::obstacle()
{
    if (access(DAEMON, X_OK) != 0 || access(POLICY_DAEMON, X_OK) != 0)
        return "needs ModemManager and polkitd (packages modemmanager, polkitd)";
    return geteuid() == 0 ? "" : "needs root, whom polkitd lets switch a modem on";
}

void ModemsOnBus::start()
{
    // The bus may not have noticed yet that the one before was killed.
    if (!waitUntil([this] { return !client_->isThere(MODEM_MANAGER.name); }))
        throw std::runtime_error("ModemManager does not leave the bus");
    const std::string log = tree_.path("/log");
    process_.start([&] {
        if (writeInto(log.c_str()))
            execl(DAEMON, DAEMON, "--test-enable", "--test-no-udev", "--test-no-qrtr",
                  "--test-no-suspend-resume", "--log-level=WARN", static_cast<char*>(nullptr));
    });
    if (!waitUntil([this] { return client_->isThere(MODEM_MANAGER.name); }))
        throw std::runtime_error("ModemManager does not start");
}

void ModemsOnBus::setProfile(const std::string& id, const std::string& port) const
{
    const char* const ports[] = {port.c_str(), nullptr};
    client_->mustCall(MODEM_MANAGER.name, MODEM_MANAGER.path, MM_DBUS_INTERFACE ".Test",
                      "SetProfile", g_variant_new("(ss^as)", id.c_str(), "generic", ports));
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
    client_->mustCall(MODEM_MANAGER.name, pathOf(id), MM_DBUS_INTERFACE_MODEM, "Enable",
                      g_variant_new("(b)", TRUE));
}

int ModemsOnBus::stateOf(const std::string& id) const
{
    const auto reply =
        client_->mustCall(MODEM_MANAGER.name, pathOf(id), "org.freedesktop.DBus.Properties", "Get",
                          g_variant_new("(ss)", MM_DBUS_INTERFACE_MODEM, "State"));
    const port::Owned<GVariant> value(g_variant_get_child_value(reply.get(), 0));
    return g_variant_get_int32(port::Owned<GVariant>(g_variant_get_variant(value.get())).get());
}
