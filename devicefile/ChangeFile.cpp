// SPDX-License-Identifier: Apache-2.0
#include "ChangeFile.h"

#include <cerrno>
#include <cstdlib>
#include <cstring>
#include <filesystem>
#include <system_error>

#include <fcntl.h>
#include <sys/file.h>
#include <sys/stat.h>
#include <unistd.h>

#include "../port/common/Descriptor.h"
#include "../port/common/RegularFile.h"

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

// The file that a path leads to, locked. The lock is on the file itself, so that none has to lie
// beside it; when somebody has put another file in its place meanwhile, that one is locked.
class LockedFile {
public:
    explicit LockedFile(const std::string& path)
    {
        while (!lock(path))
            continue;
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
    bool lock(const std::string& path)
    {
        std::error_code error;
        path_ = fs::canonical(path, error);
        if (error)
            throw Failed{error.value()};
        file_ = Descriptor(open(path_.c_str(), O_RDONLY | O_CLOEXEC | O_NONBLOCK | O_NOCTTY));
        must(file_.number() >= 0);
        while (flock(file_.number(), LOCK_EX) != 0)
            must(errno == EINTR);
        struct stat now = {};
        must(fstat(file_.number(), &status_) == 0);
        return stat(path_.c_str(), &now) == 0 && isSame(now, status_);
    }

    std::string path_;
    Descriptor file_;
    struct stat status_ = {};
};

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
        : name_(fs::path(path).parent_path() /
                ("." + fs::path(path).filename().string() + ".XXXXXX")),
          file_(mkostemp(name_.data(), O_CLOEXEC))
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
    } catch (const Failed& failed) {
        return path + " cannot be changed: " + std::strerror(failed.error);
    }
}
