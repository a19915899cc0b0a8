// SPDX-License-Identifier: Apache-2.0
#include "BusWatch.h"

#include <algorithm>
#include <set>
#include <string>
#include <utility>

#include "Bus.h"

namespace port::linux_backend {
namespace {

constexpr int RETRY_MS = 1000;
constexpr int SHORTEST_PAUSE_MS = 20; // between two calls of `changed`

constexpr char BUS_NAME[] = "org.freedesktop.DBus";

} // namespace

BusWatch::BusWatch(std::vector<BusSignal> signals, std::function<void()> changed)
    : signals_(std::move(signals)), changed_(std::move(changed))
{
    thread_.run([this] { connect(); });
}

BusWatch::~BusWatch()
{
    thread_.run([this] { stop(); });
}

void BusWatch::stop()
{
    isStopping_ = true;
    g_cancellable_cancel(cancellable_.get());
    leaveBus();
    while (answersAwaited_ > 0)
        g_main_context_iteration(g_main_context_get_thread_default(), TRUE);
}

void BusWatch::after(int milliseconds, GSourceFunc act)
{
    GSource* const timer = g_timeout_source_new(static_cast<guint>(milliseconds));
    g_source_set_callback(timer, act, this, nullptr);
    g_source_attach(timer, g_main_context_get_thread_default());
    g_source_unref(timer);
}

void BusWatch::connect()
{
    const Owned<char> address(g_dbus_address_get_for_bus_sync(G_BUS_TYPE_SYSTEM, nullptr, nullptr));
    if (!address) {
        after(RETRY_MS, &BusWatch::onRetry);
        return;
    }
    ++answersAwaited_;
    g_dbus_connection_new_for_address(address.get(), BUS_CLIENT, nullptr, cancellable_.get(),
                                      &BusWatch::onConnected, this);
}

void BusWatch::onConnected(GObject*, GAsyncResult* result, gpointer self)
{
    auto& watch = *static_cast<BusWatch*>(self);
    --watch.answersAwaited_;
    watch.connection_.reset(g_dbus_connection_new_for_address_finish(result, nullptr));
    if (watch.isStopping_)
        return;
    if (watch.connection_)
        watch.subscribe();
    else
        watch.after(RETRY_MS, &BusWatch::onRetry);
}

void BusWatch::subscribeTo(const BusSignal& signal)
{
    subscriptions_.push_back(g_dbus_connection_signal_subscribe(
        connection_.get(), signal.service, signal.interface, signal.member, nullptr,
        signal.firstArgument, G_DBUS_SIGNAL_FLAGS_NONE, &BusWatch::onSignal, this, nullptr));
}

void BusWatch::subscribe()
{
    g_signal_connect(connection_.get(), "closed", G_CALLBACK(&BusWatch::onClosed), this);
    std::set<std::string> services;
    for (const BusSignal& signal : signals_) {
        subscribeTo(signal);
        if (services.insert(signal.service).second)
            subscribeTo({BUS_NAME, BUS_NAME, "NameOwnerChanged", signal.service});
    }
    // The bus answers this after it has taken the subscriptions, so nothing is missed in between.
    ++answersAwaited_;
    g_dbus_connection_call(connection_.get(), BUS_NAME, "/org/freedesktop/DBus", BUS_NAME, "GetId",
                           nullptr, nullptr, G_DBUS_CALL_FLAGS_NONE, -1, cancellable_.get(),
                           &BusWatch::onSubscribed, this);
}

void BusWatch::onSubscribed(GObject* connection, GAsyncResult* result, gpointer self)
{
    auto& watch = *static_cast<BusWatch*>(self);
    --watch.answersAwaited_;
    GVariant* const id = g_dbus_connection_call_finish(
        reinterpret_cast<GDBusConnection*>(connection), result, nullptr);
    if (id != nullptr)
        g_variant_unref(id);
    watch.noteChange();
}

void BusWatch::leaveBus()
{
    if (!connection_)
        return;
    g_signal_handlers_disconnect_by_data(connection_.get(), this);
    for (const guint subscription : subscriptions_)
        g_dbus_connection_signal_unsubscribe(connection_.get(), subscription);
    subscriptions_.clear();
    connection_.reset();
}

void BusWatch::onClosed(GDBusConnection*, gboolean, GError*, gpointer self)
{
    auto& watch = *static_cast<BusWatch*>(self);
    watch.leaveBus();
    watch.noteChange();
    watch.after(RETRY_MS, &BusWatch::onRetry);
}

void BusWatch::onSignal(GDBusConnection*, const char*, const char*, const char*, const char*,
                        GVariant*, gpointer self)
{
    static_cast<BusWatch*>(self)->noteChange();
}

void BusWatch::noteChange()
{
    if (isDue_ || isStopping_)
        return;
    isDue_ = true;
    const gint64 rested = (g_get_monotonic_time() - lastTold_) / 1000;
    after(static_cast<int>(std::max<gint64>(0, SHORTEST_PAUSE_MS - rested)), &BusWatch::onDue);
}

gboolean BusWatch::onDue(gpointer self)
{
    auto& watch = *static_cast<BusWatch*>(self);
    watch.isDue_ = false;
    if (!watch.isStopping_)
        watch.changed_();
    watch.lastTold_ = g_get_monotonic_time();
    return G_SOURCE_REMOVE;
}

gboolean BusWatch::onRetry(gpointer self)
{
    auto& watch = *static_cast<BusWatch*>(self);
    if (!watch.isStopping_)
        watch.connect();
    return G_SOURCE_REMOVE;
}

} // namespace port::linux_backend
