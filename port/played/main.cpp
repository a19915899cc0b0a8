// SPDX-License-Identifier: Apache-2.0
// Plays the services of a machine for a simulated device: coresystem-played [SERVICE...]
//
// CORESYSTEM_DEVICE is the path of the device file, DBUS_SYSTEM_BUS_ADDRESS the bus. Without a
// service it plays all. It writes "ready" when they are on the bus, and ends with 0 when SIGTERM or
// SIGINT tells it to, with 1 when it cannot begin.
#include <cstdio>
#include <cstdlib>
#include <stdexcept>

#include <glib-unix.h>
#include <sys/prctl.h>

#include "Player.h"

namespace {

void complain(const std::string& problem)
{
    std::fprintf(stderr, "coresystem-played: %s\n", problem.c_str());
}

std::string variable(const char* name)
{
    const char* const value = std::getenv(name);
    if (value == nullptr || *value == '\0')
        throw std::runtime_error(std::string(name) + " is not set");
    return value;
}

std::vector<std::string> chosen(int count, char** words)
{
    const std::vector<std::string> all = port::played::serviceNames();
    const std::vector<std::string> some(words + 1, words + count);
    return some.empty() ? all : some;
}

gboolean onSignal(gpointer loop)
{
    g_main_loop_quit(static_cast<GMainLoop*>(loop));
    return G_SOURCE_CONTINUE;
}

void play(const std::vector<std::string>& services)
{
    port::played::Player player(variable("CORESYSTEM_DEVICE"), variable("DBUS_SYSTEM_BUS_ADDRESS"),
                                services, complain);
    player.start();
    std::puts("ready");
    std::fflush(stdout);
    GMainLoop* const loop = g_main_loop_new(nullptr, FALSE);
    for (const int signal : {SIGTERM, SIGINT})
        g_unix_signal_add(signal, onSignal, loop);
    g_main_loop_run(loop);
    player.refresh(); // what changed just before the end is told as well
    g_main_loop_unref(loop);
}

} // namespace

int main(int count, char** words)
{
    try {
        play(chosen(count, words));
        return EXIT_SUCCESS;
    } catch (const std::exception& error) {
        complain(error.what());
        return EXIT_FAILURE;
    }
}
