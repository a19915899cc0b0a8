// SPDX-License-Identifier: Apache-2.0
#include "ChangeFile.h"

#include <cerrno>
#include <chrono>
#include <cstdlib>
#include <cstring>
#include <filesystem>
#include <system_error>
#include <thread>

#include <fcntl.h>
#include <sys/file.h>
#include <sys/stat.h>
#include <unistd.h>

#include "../port/common/RegularFile.h"
#include "Descriptor.h"

namespace port::devicefile {
namespace {

namespace fs = std::filesystem;

// Something failed; errno tells what.
struct Failed {
    int error = errno;
};

void must(bool good)
{
    if (!good)
        throw Failed();
}

bool isSame(const struct stat& left, const struct stat& right)
{
    return left.st_dev == right.st_dev && left.st_ino == right.st_ino;
}

// The file that lies beside another while that is changed: hidden, and named after it.
constexpr char LOCK[] = ".coresystem-lock";
constexpr char SUCCESSOR[] = ".coresystem-XXXXXX";

std::string beside(const std::string& path, const char* ending)
{
    const fs::path file(path);
    return file.parent_path() / ("." + file.filename().string() + ending);
}

// Somebody else's turn takes too long.
struct NotMyTurn {};

constexpr std::chrono::seconds PATIENCE(5);

// One writer's turn. The lock is a file of its own, which those may open who may write the file
// itself: on the file itself everybody could hold it who may read. It goes away with the turn; what
// a writer left that was killed is taken over.
class Turn {
public:
    Turn(const std::string& path, const struct stat& status) : name_(beside(path, LOCK))
    {
        const auto deadline = std::chrono::steady_clock::now() + PATIENCE;
        while (!take(status)) {
            if (std::chrono::steady_clock::now() > deadline)
                throw NotMyTurn();
            std::this_thread::sleep_for(std::chrono::milliseconds(2));
        }
    }
    ~Turn()
    {
        unlink(name_.c_str());
    }
    Turn(const Turn&) = delete;
    Turn& operator=(const Turn&) = delete;

private:
    // False when another has it, or took it away meanwhile.
    bool take(const struct stat& status)
    {
        lock_ = Descriptor(
            open(name_.c_str(), O_RDWR | O_CREAT | O_CLOEXEC | O_NOFOLLOW | O_NONBLOCK, 0600));
        const int error = errno;
        if (lock_.number() < 0 && error == EACCES && access(name_.c_str(), F_OK) == 0)
            return false; // another user's, for now
        if (lock_.number() < 0)
            throw Failed{error};
        if (flock(lock_.number(), LOCK_EX | LOCK_NB) != 0) {
            must(errno == EWOULDBLOCK || errno == EINTR);
            return false;
        }
        struct stat held = {};
        struct stat there = {};
        must(fstat(lock_.number(), &held) == 0);
        if (stat(name_.c_str(), &there) != 0 || !isSame(held, there))
            return false;
        admitWriters(status);
        return true;
    }

    // As far as it is permitted.
    void admitWriters(const struct stat& status) const
    {
        if (fchown(lock_.number(), status.st_uid, status.st_gid) != 0)
            (void)!fchown(lock_.number(), static_cast<uid_t>(-1), status.st_gid);
        const mode_t writers = status.st_mode & (S_IWGRP | S_IWOTH);
        (void)!fchmod(lock_.number(), 0600 | writers | (writers << 1));
    }

    const std::string name_;
    Descriptor lock_;
};

// The file that a path leads to, while it is this writer's turn.
class LockedFile {
public:
    explicit LockedFile(const std::string& path)
        : path_(canonical(path)), turn_(path_, statusOf(path_)), status_(statusOf(path_))
    {
    }

    const std::string& path() const
    {
        return path_;
    }
    const struct stat& status() const
    {
        return status_;
    }

private:
    static std::string canonical(const std::string& path)
    {
        std::error_code error;
        std::string found = fs::canonical(path, error);
        if (error)
            throw Failed{error.value()};
        return found;
    }
    static struct stat statusOf(const std::string& path)
    {
        struct stat status = {};
        must(stat(path.c_str(), &status) == 0);
        if (S_ISDIR(status.st_mode))
            throw Failed{EISDIR};
        return status;
    }

    const std::string path_;
    const Turn turn_;
    const struct stat status_;
};

// Removes what writers left who were killed: it is this one's turn, so no other is at work.
void collectLeftovers(const std::string& path)
{
    const std::string form = fs::path(beside(path, SUCCESSOR)).filename();
    const std::string begin = form.substr(0, form.size() - 6);
    std::error_code ignored;
    for (auto entry = fs::directory_iterator(fs::path(path).parent_path(), ignored);
         entry != fs::directory_iterator(); entry.increment(ignored)) {
        const std::string name = entry->path().filename();
        if (name.size() == form.size() && name.compare(0, begin.size(), begin) == 0 &&
            entry->symlink_status(ignored).type() == fs::file_type::regular)
            unlink(entry->path().c_str());
    }
}

// Root may write any file: it is the mode that says what its owner wants.
void checkWritable(const LockedFile& file)
{
    constexpr mode_t ANY_WRITER = S_IWUSR | S_IWGRP | S_IWOTH;
    if ((file.status().st_mode & ANY_WRITER) == 0)
        throw Failed{EACCES};
    must(faccessat(AT_FDCWD, file.path().c_str(), W_OK, AT_EACCESS) == 0);
}

// A file beside another one that takes its place, or goes away.
class Successor {
public:
    explicit Successor(const std::string& path)
        : name_(beside(path, SUCCESSOR)), file_(mkostemp(name_.data(), O_CLOEXEC))
    {
        must(file_.number() >= 0);
    }
    ~Successor()
    {
        if (!hasSucceeded_)
            unlink(name_.c_str());
    }
    Successor(const Successor&) = delete;
    Successor& operator=(const Successor&) = delete;

    void write(const std::string& content)
    {
        for (std::size_t done = 0; done < content.size();) {
            const ssize_t step =
                ::write(file_.number(), content.data() + done, content.size() - done);
            must(step >= 0 || errno == EINTR);
            done += step > 0 ? static_cast<std::size_t>(step) : 0;
        }
    }

    // The owner as far as it is permitted; it comes first because it takes bits from the mode.
    void resemble(const struct stat& status)
    {
        if (fchown(file_.number(), status.st_uid, status.st_gid) != 0)
            (void)!fchown(file_.number(), static_cast<uid_t>(-1), status.st_gid);
        must(fchmod(file_.number(), status.st_mode & 07777) == 0);
    }

    void takePlaceOf(const std::string& path)
    {
        must(fsync(file_.number()) == 0);
        must(rename(name_.c_str(), path.c_str()) == 0);
        hasSucceeded_ = true;
        const Descriptor folder(
            open(fs::path(path).parent_path().c_str(), O_RDONLY | O_CLOEXEC | O_DIRECTORY));
        fsync(folder.number()); // not every file system can; the file is in its place all the same
    }

private:
    std::string name_;
    const Descriptor file_;
    bool hasSucceeded_ = false;
};

void replace(const LockedFile& file, const std::string& content)
{
    collectLeftovers(file.path());
    Successor successor(file.path());
    successor.write(content);
    successor.resemble(file.status());
    successor.takePlaceOf(file.path());
}

} // namespace
} // namespace port::devicefile

std::string
port::devicefile::changeFile(const std::string& path, std::size_t limit,
                             const std::function<std::string(std::string& content)>& change)
{
    try {
        const LockedFile file(path);
        std::string old;
        std::string problem;
        if (!readRegularFile(file.path(), limit, old, problem))
            return path + ": " + problem;
        std::string content = old;
        problem = change(content);
        if (!problem.empty() || content == old)
            return problem;
        checkWritable(file);
        replace(file, content);
        return {};
    } catch (const NotMyTurn&) {
        return path + " cannot be changed: somebody else has been changing it for " +
               std::to_string(PATIENCE.count()) + " seconds";
    } catch (const Failed& failed) {
        return path + " cannot be changed: " + std::strerror(failed.error);
    }
}
