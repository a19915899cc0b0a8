// SPDX-License-Identifier: Apache-2.0
// A thread that runs a GLib main context of its own.
#ifndef PORT_COMMON_CONTEXT_THREAD_H
#define PORT_COMMON_CONTEXT_THREAD_H

#include <deque>
#include <functional>
#include <future>
#include <mutex>
#include <thread>

#include "GLibTypes.h"

namespace port {

/// The context is the thread's default one. Not to be used or destroyed by a task of its own.
class ContextThread {
public:
    ContextThread();
    ~ContextThread();

    /// Runs a task on the thread, after what runs there now, and waits for it.
    void run(std::function<void()> task);

private:
    void loop();
    void runTasks();

    const Owned<GMainContext> context_{g_main_context_new()};
    std::mutex mutex_;
    std::deque<std::packaged_task<void()>> tasks_;
    bool ending_ = false; // on the thread
    std::thread thread_;
};

} // namespace port

#endif
