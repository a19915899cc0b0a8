// SPDX-License-Identifier: Apache-2.0
// Several threads that do the same at the same time.
#ifndef TESTS_SUPPORT_TOGETHER_H
#define TESTS_SUPPORT_TOGETHER_H

#include <atomic>
#include <thread>
#include <vector>

/// Runs `work(number)` on `count` threads that start together; returns when all have ended.
template <typename Work>
void together(int count, Work work)
{
    std::atomic<int> waiting{count};
    std::vector<std::thread> threads;
    for (int number = 0; number < count; ++number)
        threads.emplace_back([&, number] {
            for (--waiting; waiting > 0;)
                std::this_thread::yield();
            work(number);
        });
    for (std::thread& thread : threads)
        thread.join();
}

#endif
