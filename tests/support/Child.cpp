// SPDX-License-Identifier: Apache-2.0
#include "support/Child.h"

#include <cerrno>
#include <csignal>
#include <stdexcept>

#include <fcntl.h>
#include <sched.h>
#include <sys/mount.h>
#include <sys/prctl.h>
#include <sys/wait.h>
#include <unistd.h>

namespace {

std::string readAll(int descriptor)
{
    std::string all;
    char block[4096];
    for (ssize_t size = 1; size > 0 || (size < 0 && errno == EINTR);) {
        size = read(descriptor, block, sizeof block);
        all.append(block, size > 0 ? static_cast<std::size_t>(size) : 0);
    }
    return all;
}

[[noreturn]] void answer(int descriptor, const std::function<std::string()>& work)
{
    int status = 1;
    try {
        const std::string text = work();
        status = write(descriptor, text.data(), text.size()) == static_cast<ssize_t>(text.size())
                     ? 0
                     : 1;
    } catch (...) {
        status = 2;
    }
    _exit(status); // without the parent's exit handlers
}

} // namespace

std::string inChild(const std::function<std::string()>& work)
{
    int ends[2];
    if (pipe(ends) != 0)
        throw std::runtime_error("no pipe");
    const pid_t child = fork();
    if (child == 0)
        answer(ends[1], work);
    close(ends[1]);
    const std::string text = readAll(ends[0]);
    close(ends[0]);
    int status = 0;
    if (child < 0 || waitpid(child, &status, 0) != child || status != 0)
        throw std::runtime_error("the child process failed");
    return text;
}

Process::~Process()
{
    kill();
}

void Process::start(const std::function<void()>& become)
{
    id_ = fork();
    if (id_ != 0)
        return;
    prctl(PR_SET_PDEATHSIG, SIGKILL); // a test that ends before its time leaves nothing behind
    become();
    _exit(127);
}

void Process::tell(int signal) const
{
    ::kill(id_, signal);
}

int Process::end()
{
    int status = 0;
    waitpid(id_, &status, 0);
    id_ = 0;
    return WIFEXITED(status) ? WEXITSTATUS(status) : -WTERMSIG(status);
}

void Process::kill()
{
    if (id_ == 0)
        return;
    tell(SIGKILL);
    end();
}

void Process::freeze() const
{
    tell(SIGSTOP);
    waitpid(id_, nullptr, WUNTRACED); // until it has stopped
}

void Process::thaw() const
{
    tell(SIGCONT);
}

bool writeInto(const char* file)
{
    const int log = open(file, O_WRONLY | O_CREAT | O_APPEND, 0600);
    return log >= 0 && dup2(log, STDOUT_FILENO) >= 0 && dup2(log, STDERR_FILENO) >= 0;
}

bool enterPrivateMounts()
{
    return unshare(CLONE_NEWNS) == 0 &&
           mount(nullptr, "/", nullptr, MS_REC | MS_PRIVATE, nullptr) == 0;
}

bool bindFolder(const std::string& shown, const std::string& place)
{
    return mount(shown.c_str(), place.c_str(), nullptr, MS_BIND, nullptr) == 0;
}

bool canHavePrivateMounts()
{
    return inChild([] { return std::string(enterPrivateMounts() ? "yes" : ""); }) == "yes";
}
