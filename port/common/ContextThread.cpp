// SPDX-License-Identifier: Apache-2.0
#include "ContextThread.h"

#include <utility>

#include "BlockedSignals.h"

namespace port {
ContextThread::ContextThread()
{
    const BlockedSignals blocked;
    thread_ = std::thread([this] { loop(); });
}

ContextThread::~ContextThread()
{
    run([this] { ending_ = true; });
    thread_.join();
}

void ContextThread::loop()
{
    g_main_context_push_thread_default(context_.get());
    for (runTasks(); !ending_; runTasks())
        g_main_context_iteration(context_.get(), TRUE);
    g_main_context_pop_thread_default(context_.get());
}

void ContextThread::run(std::function<void()> task)
{
    std::packaged_task<void()> packaged(std::move(task));
    std::future<void> done = packaged.get_future();
    {
        const std::lock_guard<std::mutex> lock(mutex_);
        tasks_.push_back(std::move(packaged));
    }
    g_main_context_wakeup(context_.get());
    done.get();
}

void ContextThread::runTasks()
{
    std::deque<std::packaged_task<void()>> tasks;
    {
        const std::lock_guard<std::mutex> lock(mutex_);
        tasks.swap(tasks_);
    }
    for (auto& task : tasks)
        task();
}

} // namespace port
