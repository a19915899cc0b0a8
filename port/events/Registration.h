// SPDX-License-Identifier: Apache-2.0
// One callback, and the events that wait for it.
#ifndef PORT_EVENTS_REGISTRATION_H
#define PORT_EVENTS_REGISTRATION_H

#include <condition_variable>
#include <functional>
#include <list>
#include <memory>
#include <mutex>
#include <thread>

#include "../common/GLibTypes.h"

namespace port {

class Registration : public std::enable_shared_from_this<Registration> {
public:
    /// The callback runs on the GLib main context that is the thread's default now.
    explicit Registration(std::function<void(int)> callback);

    /// Has the callback called, after the calls that were posted before.
    void post(int value);

    /// Drops what waits. No call begins after this, and one that runs on another thread has ended.
    void close();

private:
    struct Event {
        Owned<GSource> source;
        int value;
    };
    using Events = std::list<Event>;

    static gboolean dispatch(gpointer registration);
    static void release(gpointer registration);

    Events begin();
    void end();

    const std::function<void(int)> callback_;
    const Owned<GMainContext> context_;
    std::mutex mutex_;
    std::condition_variable ended_;
    bool open_ = true;
    unsigned running_ = 0;   // calls; more than one when a callback runs its loop itself
    std::thread::id runner_; // of these calls
    Events waiting_;
    unsigned sources_ = 0;               // that GLib knows
    std::shared_ptr<Registration> self_; // while there are any
};

} // namespace port

#endif
