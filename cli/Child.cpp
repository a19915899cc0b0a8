// SPDX-License-Identifier: Apache-2.0
#include "Child.h"

#include <cerrno>
#include <cstring>
#include <stdexcept>

#include <glib.h>
#include <sys/prctl.h>
#include <sys/signalfd.h>
#include <unistd.h>

namespace cli {
namespace {

sigset_t setOf(std::initializer_list<int> signals)
{
    sigset_t set;
    sigemptyset(&set);
    for (const int signal : signals)
        sigaddset(&set, signal);
    return set;
}

// Leaves out the end of a child, which a shell may have started before it became this program.
const sigset_t& endingSignals()
{
    static const sigset_t set = setOf({SIGHUP, SIGINT, SIGQUIT, SIGTERM, SIGUSR1, SIGUSR2});
    return set;
}

// Between fork and exec.
void becomeChild(gpointer parent)
{
    sigprocmask(SIG_UNBLOCK, &signalsOfChildren(), nullptr);
    prctl(PR_SET_PDEATHSIG, SIGKILL);
    if (getppid() != *static_cast<const pid_t*>(parent)) // it ended before the line above
        _exit(EXIT_FAILURE);
}

} // namespace

const sigset_t& signalsOfChildren()
{
    static const sigset_t set =
        setOf({SIGCHLD, SIGHUP, SIGINT, SIGQUIT, SIGTERM, SIGUSR1, SIGUSR2});
    return set;
}

HeldSignals::HeldSignals()
{
    signal(SIGCHLD, SIG_DFL); // a parent may have had it ignored
    sigprocmask(SIG_BLOCK, &signalsOfChildren(), &before_);
}

HeldSignals::~HeldSignals()
{
    sigprocmask(SIG_SETMASK, &before_, nullptr);
}

SignalReader::SignalReader()
    : descriptor_(signalfd(-1, &endingSignals(), SFD_CLOEXEC | SFD_NONBLOCK))
{
    if (descriptor_ < 0)
        throw std::runtime_error(std::string("no signals: ") + std::strerror(errno));
}

SignalReader::~SignalReader()
{
    close(descriptor_);
}

int SignalReader::read() const
{
    signalfd_siginfo signal = {};
    return ::read(descriptor_, &signal, sizeof signal) == sizeof signal
               ? static_cast<int>(signal.ssi_signo)
               : 0;
}

pid_t startChild(std::vector<std::string> command, const Streams& streams)
{
    std::vector<char*> arguments;
    arguments.reserve(command.size() + 1);
    for (std::string& word : command)
        arguments.push_back(word.data());
    arguments.push_back(nullptr);
    int flags = G_SPAWN_SEARCH_PATH | G_SPAWN_DO_NOT_REAP_CHILD;
    if (streams.sharesAll)
        flags |= G_SPAWN_CHILD_INHERITS_STDIN | G_SPAWN_LEAVE_DESCRIPTORS_OPEN;
    pid_t parent = getpid();
    pid_t child = 0;
    GError* error = nullptr;
    if (g_spawn_async_with_fds(nullptr, arguments.data(), nullptr, static_cast<GSpawnFlags>(flags),
                               becomeChild, &parent, &child, -1, streams.output, streams.errors,
                               &error) == FALSE) {
        const NotStarted failure = {error->code == G_SPAWN_ERROR_NOENT, error->message};
        g_error_free(error);
        throw failure;
    }
    return child;
}

} // namespace cli
