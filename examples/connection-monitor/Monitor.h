// SPDX-License-Identifier: Apache-2.0
// Tells how the device is connected, whenever that changes: what an application does that downloads
// over Wi-Fi only.
#ifndef MONITOR_H
#define MONITOR_H

#include <CoreSystem.h>
#include <IConnectionStateListener.h>

#include <functional>
#include <string>
#include <utility>

inline std::string connection()
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
    // `tell` is called with how things are, at once and after each change.
    explicit Monitor(std::function<void(const std::string&)> tell) : tell_(std::move(tell))
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
    // Several facts may change at once: they are told once.
    void look()
    {
        const std::string now = connection();
        if (now == last_)
            return;
        last_ = now;
        tell_(now);
    }

    const std::function<void(const std::string&)> tell_;
    std::string last_;
};

#endif
