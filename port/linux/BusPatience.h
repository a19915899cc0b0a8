// SPDX-License-Identifier: Apache-2.0
// How long the question that a thread asks may still take.
#ifndef PORT_LINUX_BUS_PATIENCE_H
#define PORT_LINUX_BUS_PATIENCE_H

#include <algorithm>
#include <chrono>

#include "Bus.h"

namespace port::linux_backend {

using BusClock = std::chrono::steady_clock;
using BusTime = BusClock::time_point;

// The time left to a thread for its question. Calls that follow each other at once belong to
// one question; calls that took no time cost none.
class Patience {
public:
    Patience() : begin_(BusClock::now())
    {
        if (begin_ - last().end > PAUSE ||
            (last().spent >= LIMIT && begin_ - last().exhausted > PAUSE))
            last().spent = std::chrono::milliseconds(0);
    }
    ~Patience()
    {
        last().end = BusClock::now();
        const bool wasExhausted = last().spent >= LIMIT;
        if (last().end - begin_ > QUICK)
            last().spent += last().end - begin_;
        if (!wasExhausted && last().spent >= LIMIT - std::chrono::milliseconds(10))
            last().spent = LIMIT;
        if (!wasExhausted)
            last().exhausted = last().end;
    }
    Patience(const Patience&) = delete;
    Patience& operator=(const Patience&) = delete;

    BusTime end() const
    {
        return begin_ + (LIMIT - std::min<BusClock::duration>(LIMIT, last().spent));
    }

private:
    struct Last {
        BusClock::duration spent{0};
        BusTime end;
        BusTime exhausted;
    };
    static constexpr BusClock::duration LIMIT = std::chrono::milliseconds(Bus::QUESTION_TIMEOUT_MS);
    static constexpr BusClock::duration PAUSE = std::chrono::milliseconds(20);
    static constexpr BusClock::duration QUICK = std::chrono::milliseconds(10);

    static Last& last()
    {
        thread_local Last mine;
        return mine;
    }

    const BusTime begin_;
};

} // namespace port::linux_backend

#endif
