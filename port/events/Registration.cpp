// SPDX-License-Identifier: Apache-2.0
#include "Registration.h"

#include <utility>

namespace port {

Registration::Registration(std::function<void(int)> callback)
    : callback_(std::move(callback)), context_(g_main_context_ref_thread_default())
{
}

void Registration::post(int value)
{
    const std::lock_guard<std::mutex> lock(mutex_);
    if (!open_)
        return;
    Event event{Owned<GSource>(g_idle_source_new()), value};
    g_source_set_priority(event.source.get(), G_PRIORITY_DEFAULT);
    g_source_set_callback(event.source.get(), dispatch, this, release);
    if (sources_++ == 0)
        self_ = shared_from_this();
    g_source_attach(event.source.get(), context_.get());
    waiting_.push_back(std::move(event));
}

// A source may be on its way to dispatch() when its event is dropped.
void Registration::release(gpointer registration)
{
    auto& self = *static_cast<Registration*>(registration);
    std::shared_ptr<Registration> last; // ends after the lock
    const std::lock_guard<std::mutex> lock(self.mutex_);
    if (--self.sources_ == 0)
        last.swap(self.self_);
}

gboolean Registration::dispatch(gpointer registration)
{
    auto& self = *static_cast<Registration*>(registration);
    const Events current = self.begin();
    if (!current.empty()) {
        self.callback_(current.front().value);
        self.end();
    }
    return G_SOURCE_REMOVE;
}

// The event of the source that GLib dispatches now; none when it was dropped.
Registration::Events Registration::begin()
{
    const GSource* const source = g_main_current_source();
    Events current;
    const std::lock_guard<std::mutex> lock(mutex_);
    for (auto event = waiting_.begin(); event != waiting_.end() && current.empty(); ++event)
        if (event->source.get() == source)
            current.splice(current.end(), waiting_, event);
    if (!current.empty()) {
        ++running_;
        runner_ = std::this_thread::get_id();
    }
    return current;
}

void Registration::end()
{
    const std::lock_guard<std::mutex> lock(mutex_);
    if (--running_ == 0)
        ended_.notify_all();
}

void Registration::close()
{
    Events dropped; // ends after the lock
    std::unique_lock<std::mutex> lock(mutex_);
    open_ = false;
    dropped.swap(waiting_);
    if (runner_ != std::this_thread::get_id())
        ended_.wait(lock, [this] { return running_ == 0; });
}

} // namespace port
