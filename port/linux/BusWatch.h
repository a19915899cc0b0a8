// SPDX-License-Identifier: Apache-2.0
// Listens to signals of the system bus, on a thread and a connection of its own.
#ifndef PORT_LINUX_BUS_WATCH_H
#define PORT_LINUX_BUS_WATCH_H

#include <functional>
#include <vector>

#include "../backend/Network.h"
#include "../common/ContextThread.h"
#include "../common/GLibTypes.h"

namespace port::linux_backend {

// A signal that may tell of a change; null where anything will do.
struct BusSignal {
    const char* service;
    const char* interface;
    const char* member;
    const char* firstArgument;
};

// Tells of each of the signals, and when one of their services, or the bus itself, comes or goes.
// Signals that follow each other closely are told once. It outlives the bus: it looks for a new one
// until it is destroyed.
class BusWatch : public Watch {
public:
    /// `changed` is called once soon after the beginning, too, for what happened until then.
    BusWatch(std::vector<BusSignal> signals, std::function<void()> changed);
    ~BusWatch() override;
    BusWatch(const BusWatch&) = delete;
    BusWatch& operator=(const BusWatch&) = delete;

private:
    void connect();
    void subscribe();
    void subscribeTo(const BusSignal& signal);
    void leaveBus();
    void stop();
    void noteChange();
    void after(int milliseconds, GSourceFunc act);

    static void onConnected(GObject*, GAsyncResult* result, gpointer self);
    static void onSubscribed(GObject* connection, GAsyncResult* result, gpointer self);
    static void onClosed(GDBusConnection*, gboolean, GError*, gpointer self);
    static void onSignal(GDBusConnection*, const char*, const char*, const char*, const char*,
                         GVariant*, gpointer self);
    static gboolean onRetry(gpointer self);
    static gboolean onDue(gpointer self);

    const std::vector<BusSignal> signals_;
    const std::function<void()> changed_;
    const Owned<GCancellable> cancellable_{g_cancellable_new()};
    // Of the thread:
    Owned<GDBusConnection> connection_;
    std::vector<guint> subscriptions_;
    int answersAwaited_ = 0;
    bool isStopping_ = false;
    bool isDue_ = false;
    gint64 lastTold_ = 0;
    ContextThread thread_; // last, so that it ends first
};

} // namespace port::linux_backend

#endif
