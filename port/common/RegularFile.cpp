// SPDX-License-Identifier: Apache-2.0
#include "RegularFile.h"

#include <cerrno>
#include <cstring>

#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>

namespace {

using port::Descriptor;

// Why the file is not one to read; empty when it is.
std::string refusal(const Descriptor& file)
{
    struct stat status = {};
    if (file.number() < 0 || fstat(file.number(), &status) != 0)
        return std::strerror(errno);
    if (S_ISDIR(status.st_mode))
        return std::strerror(EISDIR);
    return S_ISREG(status.st_mode) ? "" : "not a regular file";
}

// Stops one byte after the limit. The size that fstat tells is no help: files of the kernel say 0.
bool readUpTo(const Descriptor& file, std::size_t limit, std::string& content)
{
    content.clear();
    char block[4096];
    ssize_t step = 1;
    while (step > 0 && content.size() <= limit) {
        step = read(file.number(), block, sizeof block);
        content.append(block, step > 0 ? static_cast<std::size_t>(step) : 0);
    }
    return step >= 0;
}

} // namespace

port::Descriptor port::openRegularFile(const std::string& path, std::string& problem)
{
    Descriptor file(open(path.c_str(), O_RDONLY | O_CLOEXEC | O_NONBLOCK | O_NOCTTY));
    problem = refusal(file);
    return problem.empty() ? std::move(file) : Descriptor();
}

std::string port::largerThan(std::size_t limit)
{
    return "larger than " + std::to_string(limit) + " bytes";
}

bool port::readRegularFile(const std::string& path, std::size_t limit, std::string& content,
                           std::string& problem)
{
    const Descriptor file = openRegularFile(path, problem);
    if (problem.empty() && !readUpTo(file, limit, content))
        problem = std::strerror(errno);
    if (problem.empty() && content.size() > limit)
        problem = largerThan(limit);
    return problem.empty();
}
