// SPDX-License-Identifier: Apache-2.0
// Stands in for the device daemon: owns its name on the system bus and tells the board's serial
// number.
//
// It ends with 0 when it is told to by SIGTERM or SIGINT, or when the bus goes away, and with 1
// when there is no bus or the name is another's.
#include <cstdio>

#include <glib-unix.h>

#include "../backend/Backend.h"
#include "Board.h"

namespace {

class Daemon {
public:
    int run()
    {
        const guint name = g_bus_own_name(G_BUS_TYPE_SYSTEM, port::deviced::BUS_NAME,
                                          G_BUS_NAME_OWNER_FLAGS_DO_NOT_QUEUE, &Daemon::onBus,
                                          nullptr, &Daemon::onNameLost, this, nullptr);
        for (const int signal : {SIGTERM, SIGINT})
            g_unix_signal_add(signal, &Daemon::onSignal, this);
        g_main_loop_run(loop_);
        g_bus_unown_name(name);
        g_main_loop_unref(loop_);
        return status_;
    }

private:
    static void onBus(GDBusConnection* bus, const char*, gpointer self)
    {
        auto& daemon = *static_cast<Daemon*>(self);
        daemon.hadBus_ = true;
        g_dbus_connection_set_exit_on_close(bus, FALSE);
        if (!daemon.board_.show(bus))
            daemon.fail("cannot show the board");
    }

    static void onNameLost(GDBusConnection* bus, const char*, gpointer self)
    {
        auto& daemon = *static_cast<Daemon*>(self);
        if (bus != nullptr)
            daemon.fail("the name is taken, or not this user's to take");
        else if (daemon.hadBus_)
            daemon.end();
        else
            daemon.fail("there is no system bus");
    }

    static gboolean onSignal(gpointer self)
    {
        static_cast<Daemon*>(self)->end();
        return G_SOURCE_CONTINUE;
    }

    void fail(const char* reason)
    {
        std::fprintf(stderr, "coresystem-deviced: %s: %s\n", port::deviced::BUS_NAME, reason);
        status_ = 1;
        end();
    }

    void end()
    {
        g_main_loop_quit(loop_);
    }

    port::deviced::Board board_{port::backend()};
    GMainLoop* const loop_ = g_main_loop_new(nullptr, FALSE);
    bool hadBus_ = false;
    int status_ = 0;
};

} // namespace

int main()
{
    return Daemon().run();
}
