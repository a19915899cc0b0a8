// SPDX-License-Identifier: Apache-2.0
// Signals are for the application's own threads: those made meanwhile get none.
#ifndef PORT_COMMON_BLOCKED_SIGNALS_H
#define PORT_COMMON_BLOCKED_SIGNALS_H

#include <csignal>

namespace port {

class BlockedSignals {
public:
    BlockedSignals()
    {
        sigset_t all;
        sigfillset(&all);
        pthread_sigmask(SIG_SETMASK, &all, &before_);
    }
    ~BlockedSignals()
    {
        pthread_sigmask(SIG_SETMASK, &before_, nullptr);
    }
    BlockedSignals(const BlockedSignals&) = delete;
    BlockedSignals& operator=(const BlockedSignals&) = delete;

private:
    sigset_t before_;
};

} // namespace port

#endif
