// SPDX-License-Identifier: Apache-2.0
#include "Files.h"

#include <fstream>
#include <iterator>
#include <sstream>

#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>

#include "GLibTypes.h"

namespace port::linux_backend {
namespace {

constexpr std::size_t LIMIT = 64 * 1024;

// A descriptor that closes itself.
class File {
public:
    // Never waits for the writer of a pipe.
    explicit File(const std::string& path)
        : descriptor_(open(path.c_str(), O_RDONLY | O_CLOEXEC | O_NONBLOCK))
    {
    }
    ~File()
    {
        if (descriptor_ >= 0)
            close(descriptor_);
    }
    File(const File&) = delete;
    File& operator=(const File&) = delete;

    bool isRegular() const
    {
        struct stat status = {};
        return descriptor_ >= 0 && fstat(descriptor_, &status) == 0 && S_ISREG(status.st_mode);
    }

    // Everything, or nothing when it is more than the limit or cannot be read.
    std::optional<std::string> readAll() const
    {
        std::string content(LIMIT + 1, '\0');
        std::size_t size = 0;
        ssize_t step = 1;
        while (step > 0 && size < content.size()) {
            step = read(descriptor_, content.data() + size, content.size() - size);
            size += step > 0 ? static_cast<std::size_t>(step) : 0;
        }
        if (step < 0 || size > LIMIT)
            return std::nullopt;
        content.resize(size);
        return content;
    }

private:
    const int descriptor_;
};

} // namespace

std::optional<std::string> readSmallFile(const std::string& path)
{
    const File file(path);
    if (!file.isRegular())
        return std::nullopt;
    const std::optional<std::string> content = file.readAll();
    if (!content)
        return std::nullopt;
    // Device-tree texts end in a NUL.
    std::string text = content->substr(0, content->find('\0'));
    text.resize(text.find_last_not_of(" \t\r\n") + 1);
    if (text.empty())
        return std::nullopt;
    return text;
}

std::optional<std::string> osReleaseVariable(const std::string& content, const std::string& name)
{
    std::istringstream lines(content);
    for (std::string line; std::getline(lines, line);) {
        if (line.compare(0, name.size() + 1, name + "=") != 0)
            continue;
        Owned<GError> error;
        const Owned<char> value(g_shell_unquote(line.c_str() + name.size() + 1, Out(error)));
        if (!value || *value == '\0')
            return std::nullopt;
        return std::string(value.get());
    }
    return std::nullopt;
}

} // namespace port::linux_backend
