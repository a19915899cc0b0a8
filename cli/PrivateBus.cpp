// SPDX-License-Identifier: Apache-2.0
#include "PrivateBus.h"

#include <cerrno>
#include <csignal>
#include <cstring>
#include <ctime>
#include <filesystem>
#include <fstream>
#include <stdexcept>

#include <fcntl.h>
#include <gio/gio.h>
#include <pwd.h>
#include <sys/file.h>
#include <sys/prctl.h>
#include <sys/stat.h>
#include <sys/un.h>
#include <sys/wait.h>
#include <unistd.h>

#include "Child.h"

namespace fs = std::filesystem;

namespace cli {
namespace {

constexpr timespec PATIENCE = {10, 0};
constexpr timespec LAST_WORDS = {2, 0};
constexpr char READY[] = "ready";
constexpr char NO_DAEMON[] = " (on Debian the package dbus-daemon has it)";

// Whoever gets into the folder may do anything.
const char CONFIGURATION[] =
    R"(<!DOCTYPE busconfig PUBLIC "-//freedesktop//DTD D-BUS Bus Configuration 1.0//EN"
 "http://www.freedesktop.org/standards/dbus/1.0/busconfig.dtd">
<busconfig>
  <type>system</type>
  <listen>%s</listen>
  <auth>EXTERNAL</auth>
  <servicedir>%s</servicedir>
  <policy context="default">
    <allow user="*"/>
    <allow own="*"/>
    <allow send_destination="*" eavesdrop="true"/>
    <allow eavesdrop="true"/>
  </policy>
</busconfig>
)";

const char SERVICE[] = R"([D-BUS Service]
Name=org.tizen.system.deviced
Exec=%s
User=root
)";

[[noreturn]] void fail(const std::string& what)
{
    throw std::runtime_error(what + ": " + std::strerror(errno));
}

std::string taken(char* text)
{
    const std::string copy = text;
    g_free(text);
    return copy;
}

void writeFile(const std::string& path, char* text)
{
    std::ofstream file(path, std::ios::binary);
    file << taken(text);
    if (!file.flush())
        fail(path);
}

std::string contentOf(const std::string& path)
{
    std::ifstream file(path, std::ios::binary);
    return {std::istreambuf_iterator<char>(file), {}};
}

// Where a socket's name fits.
std::string placeOfFolder()
{
    const std::string name = "/coresystem-XXXXXX";
    std::error_code error;
    const std::string place = fs::temp_directory_path(error).string();
    if (error)
        throw std::runtime_error("the folder for temporary files (TMPDIR) cannot be used: " +
                                 error.message());
    const bool fits = place.size() + name.size() + sizeof "/bus" <= sizeof sockaddr_un::sun_path;
    return (fits ? place : "/tmp") + name;
}

// The file in the folder that is locked for as long as the command or the keeper lives.
constexpr char LOCK[] = "/lock";

// Its descriptor; -1 when another process has it, or somebody has removed it meanwhile.
int lockIn(const std::string& folder, int flags)
{
    const std::string path = folder + LOCK;
    const int lock = open(path.c_str(), O_RDWR | O_CLOEXEC | O_NOFOLLOW | flags, 0600);
    struct stat held = {};
    struct stat there = {};
    const bool isIt = lock >= 0 && flock(lock, LOCK_EX | LOCK_NB) == 0 && fstat(lock, &held) == 0 &&
                      stat(path.c_str(), &there) == 0 && held.st_ino == there.st_ino &&
                      held.st_dev == there.st_dev;
    if (lock >= 0 && !isIt)
        close(lock);
    return isIt ? lock : -1;
}

bool isOwnFolder(const std::string& path)
{
    struct stat status = {};
    return lstat(path.c_str(), &status) == 0 && S_ISDIR(status.st_mode) &&
           status.st_uid == geteuid();
}

// Removes the folders of runs whose command and keeper were both killed.
void collectLeftovers(const fs::path& form)
{
    const std::string name = form.filename();
    const std::string begin = name.substr(0, name.find('X'));
    std::error_code ignored;
    for (auto entry = fs::directory_iterator(form.parent_path(), ignored);
         entry != fs::directory_iterator(); entry.increment(ignored)) {
        const fs::path& path = entry->path();
        const std::string found = path.filename();
        if (found.size() != name.size() || found.compare(0, begin.size(), begin) != 0 ||
            !isOwnFolder(path))
            continue;
        if (const int lock = lockIn(path, 0); lock >= 0) {
            fs::remove_all(path, ignored);
            close(lock);
        }
    }
}

// Beside this program in a build, where it is installed else.
std::string daemonNamed(const std::string& name)
{
    const fs::path beside = fs::read_symlink("/proc/self/exe").parent_path();
    for (const fs::path& place : {beside, beside / DEVICED_FROM_BIN})
        if (access((place / name).c_str(), X_OK) == 0)
            return (place / name).lexically_normal();
    throw std::runtime_error(name + " is neither in " + beside.string() + " nor in " +
                             (beside / DEVICED_FROM_BIN).lexically_normal().string());
}

struct Pipe {
    int out;
    int in;
};

Pipe makePipe()
{
    int ends[2];
    if (pipe2(ends, O_CLOEXEC) != 0)
        fail("no pipe");
    return {ends[0], ends[1]};
}

// Reads until the other side closes it.
std::string readAll(int end)
{
    std::string all;
    char block[512];
    for (ssize_t size = 1; size > 0 || (size < 0 && errno == EINTR);) {
        size = read(end, block, sizeof block);
        all.append(block, size > 0 ? static_cast<std::size_t>(size) : 0);
    }
    return all;
}

bool comesByte(int end)
{
    char byte = 0;
    return read(end, &byte, 1) == 1;
}

// Has a process of this one end, and waits for it; 0 is none.
void end(pid_t child)
{
    if (child == 0)
        return;
    kill(child, SIGTERM);
    while (waitpid(child, nullptr, WNOHANG) == 0)
        if (sigtimedwait(&signalsOfChildren(), nullptr, &LAST_WORDS) < 0 && errno == EAGAIN)
            return;
}

// Waits for every process that this one started, or inherited from one that it started.
void awaitChildren()
{
    for (;;) {
        const pid_t ended = waitpid(-1, nullptr, WNOHANG);
        if (ended < 0)
            return;
        if (ended == 0 && sigtimedwait(&signalsOfChildren(), nullptr, &PATIENCE) < 0 &&
            errno == EAGAIN)
            return;
    }
}

} // namespace

PrivateBus::PrivateBus()
{
    const std::string form = placeOfFolder();
    collectLeftovers(form);
    for (int attempt = 0; lock_ < 0; ++attempt) {
        folder_ = form;
        if (mkdtemp(folder_.data()) == nullptr)
            fail("no temporary folder " + folder_);
        lock_ = lockIn(folder_, O_CREAT);
        if (lock_ < 0 && attempt == 9) // one may be taken for a leftover
            fail(folder_ + LOCK);
    }
}

PrivateBus::~PrivateBus()
{
    close(lock_);
    std::error_code ignored;
    if (keeper_ == 0) {
        fs::remove_all(folder_, ignored);
        return;
    }
    close(lifeline_);
    waitpid(keeper_, nullptr, 0);
}

std::string PrivateBus::path(const char* name) const
{
    return folder_ + "/" + name;
}

std::string PrivateBus::address() const
{
    return "unix:path=" + taken(g_dbus_address_escape_value(path("bus").c_str()));
}

void PrivateBus::writeConfiguration() const
{
    fs::create_directory(path("services"));
    writeFile(path("bus.conf"),
              g_markup_printf_escaped(CONFIGURATION, address().c_str(), path("services").c_str()));
    const std::string daemon = taken(g_shell_quote(daemonNamed("coresystem-deviced").c_str()));
    writeFile(path("services/org.tizen.system.deviced.service"),
              g_strdup_printf(SERVICE, daemon.c_str()));
}

void PrivateBus::start(bool withBus, const std::vector<std::string>& services)
{
    if (withBus) {
        if (getpwuid(geteuid()) == nullptr) // as in a container with a user of any number
            throw std::runtime_error("the private bus lets in only users with a name, and user " +
                                     std::to_string(geteuid()) + " has none in /etc/passwd");
        writeConfiguration();
    }
    const Pipe readiness = makePipe();
    const Pipe lifeline = makePipe();
    keeper_ = fork();
    if (keeper_ < 0)
        fail("no process for the private bus");
    if (keeper_ == 0) {
        close(lifeline.in);
        keep(withBus, services, readiness.in, lifeline.out);
    }
    close(readiness.in);
    close(lifeline.out);
    lifeline_ = lifeline.in;
    const std::string answer = readAll(readiness.out);
    close(readiness.out);
    if (answer != READY)
        throw std::runtime_error(answer.empty() ? "the private bus does not start" : answer);
}

void PrivateBus::keep(bool withBus, const std::vector<std::string>& services, int readiness,
                      int lifeline) const
{
    setsid();                         // what is typed at the terminal is the command's
    prctl(PR_SET_CHILD_SUBREAPER, 1); // the bus leaves the daemons that it started to it
    const HeldSignals held;
    const int nowhere = open("/dev/null", O_RDWR | O_CLOEXEC);
    dup2(nowhere, STDIN_FILENO);
    dup2(nowhere, STDOUT_FILENO);
    pid_t bus = 0;
    pid_t played = 0;
    std::string answer = READY;
    try {
        bus = withBus ? startBus() : 0;
        played = withBus && !services.empty() ? startServices(services) : 0;
    } catch (const std::exception& error) {
        answer = error.what();
    }
    if (write(readiness, answer.data(), answer.size()) >= 0)
        close(readiness);
    readAll(lifeline);
    end(played); // first: it has last words
    end(bus);
    awaitChildren();
    std::error_code ignored;
    fs::remove_all(folder_, ignored);
    kill(0, SIGKILL); // itself, and what would not end
    _exit(EXIT_FAILURE);
}

pid_t PrivateBus::startBus() const
{
    const Pipe address = makePipe();
    const int log = open(path("log").c_str(), O_WRONLY | O_CREAT | O_APPEND | O_CLOEXEC, 0600);
    if (log < 0)
        fail(path("log"));
    pid_t bus = 0;
    try {
        bus = startChild({"dbus-daemon", "--config-file=" + path("bus.conf"), "--nofork",
                          "--nopidfile", "--print-address=1"},
                         {address.in, log});
    } catch (const NotStarted& failure) {
        throw std::runtime_error(failure.reason + (failure.isMissing ? NO_DAEMON : ""));
    }
    close(address.in);
    if (!comesByte(address.out)) // it tells its address once it listens
        throw std::runtime_error("dbus-daemon does not start: " + contentOf(path("log")));
    return bus;
}

// A mistake in the device file that comes later is told to whoever runs the command.
pid_t PrivateBus::startServices(const std::vector<std::string>& services) const
{
    const Pipe readiness = makePipe();
    std::vector<std::string> command = {daemonNamed("coresystem-played")};
    command.insert(command.end(), services.begin(), services.end());
    pid_t played = 0;
    try {
        played = startChild(command, {readiness.in});
    } catch (const NotStarted& failure) {
        throw std::runtime_error(failure.reason);
    }
    close(readiness.in);
    const bool isReady = comesByte(readiness.out);
    close(readiness.out);
    if (!isReady)
        throw std::runtime_error("the services cannot be played");
    return played;
}

} // namespace cli
