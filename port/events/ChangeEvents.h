// SPDX-License-Identifier: Apache-2.0
// Tells the callbacks of this process of changes of the network.
#ifndef PORT_EVENTS_CHANGE_EVENTS_H
#define PORT_EVENTS_CHANGE_EVENTS_H

#include <array>
#include <functional>
#include <list>
#include <memory>
#include <mutex>
#include <optional>

#include "../backend/Backend.h"

namespace port {

class Registration;

// The events, in the order in which they are posted when several facts change at once.
enum class Change { WifiDevice, WifiConnection, WifiStatus, PacketData, FlightMode, DataRoaming };

/// One callback for each change. The backend is watched only while there is a callback. Any thread,
/// also from inside a callback.
///
/// Two callbacks on two threads that remove each other wait for each other for ever.
class ChangeEvents {
public:
    /// Is given the new value: of WifiConnection a WifiConnection, of all others 0 or 1; WifiStatus
    /// is whether Wi-Fi is connected.
    using Callback = std::function<void(int value)>;

    explicit ChangeEvents(Backend& backend) : backend_(backend) {}

    /// Sets the callback of a change, in place of the one before. It is called on the GLib main
    /// context that is the thread's default now, whenever the value differs from the one that could
    /// be read last; the first one is read now. False when changes cannot be watched.
    bool set(Change change, Callback callback);

    /// Removes the callback of a change, if there is one, and the events that wait for it. A call
    /// of it that runs on another thread has ended when this returns.
    void unset(Change change);

    /// Has `look` called on the watch's thread after changes, once the events of all were posted,
    /// until it is forgotten. Nothing when changes cannot be watched.
    using Observer = std::list<std::function<void()>>::iterator;
    std::optional<Observer> observe(std::function<void()> look);
    /// Not from inside a call; one that runs has ended when this returns.
    void forget(Observer observer);

private:
    struct Slot {
        std::shared_ptr<Registration> registration;
        std::optional<int> value; // the last that could be read
    };

    Slot& slotOf(Change change);
    bool isWatched();
    bool isIdle() const;
    template <typename Remove>
    void removeOne(const Remove& remove);
    void tell();
    void observe();

    Backend& backend_;
    std::mutex lifecycle_; // of the watch; never held while waiting for a callback
    std::unique_ptr<Watch> watch_;
    std::mutex reading_; // of values, so that an older one never comes after a newer one
    std::array<Slot, 6> slots_;
    std::list<std::function<void()>> observers_;
};

/// The events of this process's backend. A forked child begins with no callback: the threads and
/// whoever held a lock are its parent's.
ChangeEvents& changeEvents();

} // namespace port

#endif
