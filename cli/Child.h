// SPDX-License-Identifier: Apache-2.0
// Processes that this one starts, and that do not outlive it.
#ifndef CLI_CHILD_H
#define CLI_CHILD_H

#include <string>
#include <vector>

#include <signal.h>
#include <sys/types.h>

namespace cli {

/// A program could not be started.
struct NotStarted {
    bool isMissing; // there is none of that name
    std::string reason;
};

/// Where a child's standard streams lead; -1: the first nowhere, the others where this process's
/// do.
struct Streams {
    int output = -1;
    int errors = -1;
    bool sharesAll = false; // its input is this process's, and so is every descriptor left open
};

/// Starts a program, looked for in PATH. It is killed when the calling thread ends before it.
/// Throws NotStarted.
pid_t startChild(std::vector<std::string> command, const Streams& streams);

/// Signals that are passed on to a child, and the one that tells of its end.
const sigset_t& signalsOfChildren();

/// While it lives, these signals wait for sigwaitinfo(); not so in children.
class HeldSignals {
public:
    HeldSignals();
    ~HeldSignals();
    HeldSignals(const HeldSignals&) = delete;
    HeldSignals& operator=(const HeldSignals&) = delete;

private:
    sigset_t before_;
};

/// While it lives, the signals that would end this process wait to be read. Needs no thread, which
/// GLib's way does.
class SignalReader {
public:
    /// Throws std::runtime_error when there is no descriptor left.
    SignalReader();
    ~SignalReader();
    SignalReader(const SignalReader&) = delete;
    SignalReader& operator=(const SignalReader&) = delete;

    /// Can be polled for input.
    int descriptor() const
    {
        return descriptor_;
    }
    /// The signal that came; 0 when none did. Does not wait.
    int read() const;

private:
    const HeldSignals held_;
    const int descriptor_;
};

} // namespace cli

#endif
