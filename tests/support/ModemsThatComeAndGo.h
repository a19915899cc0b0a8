// SPDX-License-Identifier: Apache-2.0
// The real ModemManager while its modems come and go, and it too.
#ifndef TESTS_SUPPORT_MODEMS_THAT_COME_AND_GO_H
#define TESTS_SUPPORT_MODEMS_THAT_COME_AND_GO_H

#include <atomic>
#include <chrono>
#include <cstdlib>
#include <future>
#include <string>

#include "support/ModemsOnBus.h"
#include "support/Together.h"

/// Several modems, each with a card whose MCC tells whose it is.
class ModemsThatComeAndGo {
public:
    static constexpr int THREADS = 8;
    static constexpr int MODEMS = 3;

    ModemsThatComeAndGo()
    {
        for (int modem = 0; modem < MODEMS; ++modem)
            modems_.add(idOf(modem), stateOf(modem));
    }

    static std::string slotOf(int modem)
    {
        return "/virtual/" + idOf(modem);
    }
    static std::string mccOf(int modem)
    {
        return std::to_string(200 + modem);
    }

    /// Calls `ask(round)` on 8 threads again and again, for CORESYSTEM_STRESS_SECONDS or 3 seconds,
    /// while modems are unplugged and plugged in and the daemon is killed and started. How many
    /// such things happened.
    template <typename Ask>
    int whileTheyComeAndGo(Ask ask)
    {
        std::atomic<bool> done{false};
        auto askers = std::async(std::launch::async, [&] {
            together(THREADS, [&](int number) {
                for (int round = number; !done; ++round)
                    ask(round);
            });
        });
        int steps = 0;
        try {
            const auto end = std::chrono::steady_clock::now() + duration();
            while (std::chrono::steady_clock::now() < end)
                disturb(steps++);
        } catch (...) {
            done = true;
            throw;
        }
        done = true;
        askers.get();
        return steps;
    }

private:
    static std::chrono::seconds duration()
    {
        const char* const seconds = std::getenv("CORESYSTEM_STRESS_SECONDS");
        return std::chrono::seconds(seconds != nullptr ? std::atoi(seconds) : 3);
    }

    static std::string idOf(int modem)
    {
        return "m" + std::to_string(modem);
    }

    static AtModem::State stateOf(int modem)
    {
        AtModem::State state;
        state.imsi = mccOf(modem) + "01" + "1234567890";
        return state;
    }

    void disturb(int step)
    {
        const int modem = step / 2 % MODEMS;
        if (step % 12 == 11) {
            modems_.kill();
            modems_.start();
            for (int i = 0; i < MODEMS; ++i)
                modems_.plugIn(idOf(i), stateOf(i));
        } else if (step % 2 == 0) {
            modems_.unplug(idOf(modem));
        } else {
            modems_.add(idOf(modem), stateOf(modem));
        }
    }

    ModemsOnBus modems_;
};

#endif
