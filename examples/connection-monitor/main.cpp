// SPDX-License-Identifier: Apache-2.0
// Prints how the device is connected, until it is told to end (SIGTERM).
#include "Monitor.h"

#include <glib-unix.h>

#include <iostream>

namespace {

gboolean quit(gpointer loop)
{
    g_main_loop_quit(static_cast<GMainLoop*>(loop));
    return G_SOURCE_CONTINUE;
}

} // namespace

int main()
{
    GMainLoop* const loop = g_main_loop_new(nullptr, FALSE);
    g_unix_signal_add(SIGTERM, quit, loop);
    {
        const Monitor monitor([](const std::string& how) { std::cout << how << std::endl; });
        g_main_loop_run(loop);
    }
    g_main_loop_unref(loop);
}
