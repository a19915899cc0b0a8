// SPDX-License-Identifier: Apache-2.0
#include "DeviceWrite.h"

#include <cerrno>
#include <cstring>
#include <stdexcept>

#include <fcntl.h>
#include <unistd.h>

#include "devicefile/ChangeFile.h"
#include "devicefile/DeviceFile.h"

namespace {

void throwUnless(const std::string& problem, bool isGood)
{
    if (!isGood)
        throw std::runtime_error(problem);
}

// Makes an empty file; false when there is one.
bool make(const std::string& path)
{
    const int made = open(path.c_str(), O_WRONLY | O_CREAT | O_EXCL | O_CLOEXEC, 0666);
    throwUnless(path + ": " + std::strerror(errno), made >= 0 || errno == EEXIST);
    return made >= 0 && close(made) == 0;
}

} // namespace

void cli::writeDevice(const std::string& path, const std::string& text, bool replace)
{
    const bool isNew = make(path);
    throwUnless(path + " is there; --force replaces it", isNew || replace);
    const std::string problem =
        port::devicefile::changeFile(path, port::devicefile::SIZE_LIMIT, [&](std::string& content) {
            content = text;
            return std::string();
        });
    if (!problem.empty() && isNew)
        unlink(path.c_str());
    throwUnless(problem, problem.empty());
}

void cli::changeDevice(const std::string& path, const std::vector<port::devicefile::Edit>& changes)
{
    const std::string problem =
        port::devicefile::changeFile(path, port::devicefile::SIZE_LIMIT, [&](std::string& content) {
            const auto changed = port::devicefile::changeText(content, path, changes);
            content = changed ? changed.value() : content;
            return changed ? std::string() : changed.error().reason;
        });
    throwUnless(problem, problem.empty());
}
