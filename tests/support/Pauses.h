// SPDX-License-Identifier: Apache-2.0
// How long this machine lets a thread stand that wants to run, for limits on the time of answers.
#ifndef TESTS_SUPPORT_PAUSES_H
#define TESTS_SUPPORT_PAUSES_H

#include <algorithm>
#include <atomic>
#include <chrono>
#include <thread>

/// How long something takes.
template <typename Work>
int millisecondsOf(Work work)
{
    const auto begin = std::chrono::steady_clock::now();
    work();
    const auto time = std::chrono::steady_clock::now() - begin;
    return static_cast<int>(std::chrono::duration_cast<std::chrono::milliseconds>(time).count());
}

// Measures as long as it lives.
class Pauses {
public:
    Pauses()
        : thread_([this] {
              while (!isOver_)
                  measure();
          })
    {
    }
    ~Pauses()
    {
        isOver_ = true;
        thread_.join();
    }
    Pauses(const Pauses&) = delete;
    Pauses& operator=(const Pauses&) = delete;

    /// Milliseconds that an answer may be late for it: it goes through three processes.
    long ofAnAnswer() const
    {
        return 3 * longest_;
    }

private:
    void measure()
    {
        const int took =
            millisecondsOf([] { std::this_thread::sleep_for(std::chrono::milliseconds(1)); });
        longest_ = std::max<long>(longest_, took - 1);
    }

    std::atomic<bool> isOver_{false};
    std::atomic<long> longest_{0};
    std::thread thread_; // begins last
};

#endif
