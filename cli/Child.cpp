// SPDX-License-Identifier: Apache-2.0
#include "Child.h"

#include <glib.h>
#include <sys/prctl.h>
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
