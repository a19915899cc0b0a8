// SPDX-License-Identifier: Apache-2.0
// Tells how the device is connected, whenever that changes: what an application does that downloads
// over Wi-Fi only.
//
// It begins with how things are, and ends after as many changes as its argument says, without one
// when it is told to (SIGTERM).
#include <CoreSystem.h>
#include <IConnectionStateListener.h>

#include <glib-unix.h>

#include <cstdlib>
#include <iostream>
#include <string>

namespace {

std::string connection()
{
    CoreSystem& device = *CoreSystem::GetInstance();
    if (device.IsFlightMode())
        return "offline: flight mode";
    if (device.IsNetworkConnected(false, false)) // the cellular network alone
        return "paused: cellular network only";
    return device.IsNetworkConnected(true, false) ? "downloading over Wi-Fi" : "offline";
}

// The callbacks come in the thread that set the listener, out of its main loop.
class Monitor : public IConnectionStateListener {
public:
    Monitor(GMainLoop* loop, long changes) : loop_(loop), changes_(changes)
    {
        CoreSystem::GetInstance()->SetConnectionEventListener(this, nullptr);
        look();
    }
    ~Monitor() override
    {
        CoreSystem::GetInstance()->SetConnectionEventListener(nullptr, nullptr);
    }
    Monitor(const Monitor&) = delete;
    Monitor& operator=(const Monitor&) = delete;

    void OnWifiDeviceStateChanged(int, void*) override
    {
        look();
    }
    void OnWifiConnectionStateChanged(int, wifi_ap_h, void*) override
    {
        look();
    }
    void OnFlightModeChanged(bool, void*) override
    {
        look();
    }
    void OnPacketDataChanged(bool, void*) override
    {
        look();
    }
    void OnWifiStatusChanged(bool, void*) override
    {
        look();
    }

private:
    // Several facts may change at once: one line tells of all of them.
    void look()
    {
        const std::string now = connection();
        if (now == last_)
            return;
        last_ = now;
        std::cout << now << std::endl;
        if (changes_-- == 0)
            g_main_loop_quit(loop_);
    }

    GMainLoop* const loop_;
    long changes_; // still to come; below 0: any number
    std::string last_;
};

gboolean quit(gpointer loop)
{
    g_main_loop_quit(static_cast<GMainLoop*>(loop));
    return G_SOURCE_CONTINUE;
}

} // namespace

int main(int argc, char** argv)
{
    GMainLoop* const loop = g_main_loop_new(nullptr, FALSE);
    g_unix_signal_add(SIGTERM, quit, loop);
    {
        const Monitor monitor(loop, argc > 1 ? std::atol(argv[1]) : -1);
        g_main_loop_run(loop);
    }
    g_main_loop_unref(loop);
    return EXIT_SUCCESS;
}
