// SPDX-License-Identifier: Apache-2.0
// How long this machine lets a thread stand that wants to run, for limits on the time of answers.
#ifndef TESTS_SUPPORT_PAUSES_H
#define TESTS_SUPPORT_PAUSES_H

#include <algorithm>
#include <atomic>
#include <chrono>
#include <thread>

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
        using std::chrono::milliseconds;
        const auto start = std::chrono::steady_clock::now();
        std::this_thread::sleep_for(milliseconds(1));
        const auto took = std::chrono::steady_clock::now() - start;
        longest_ = std::max<long>(
            longest_, std::chrono::duration_cast<milliseconds>(took - milliseconds(1)).count());
    }

    std::atomic<bool> isOver_{false};
    std::atomic<long> longest_{0};
    std::thread thread_; // begins last
};

#endif
