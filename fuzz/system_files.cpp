// SPDX-License-Identifier: Apache-2.0
// Any bytes as a file of the system: the first tells which kind it is.
#include <string>

#include <sys/mman.h>
#include <unistd.h>

#include "Fuzz.h"
#include "port/linux/Configuration.h"
#include "port/linux/Files.h"
#include "port/linux/Packages.h"

using namespace port::linux_backend;

namespace {

// A file of that content while it lives.
class MemoryFile {
public:
    explicit MemoryFile(const std::string& content) : file_(memfd_create("fuzz", MFD_CLOEXEC))
    {
        require(write(file_, content.data(), content.size()) ==
                    static_cast<ssize_t>(content.size()),
                "a file in memory can be written");
    }
    ~MemoryFile()
    {
        close(file_);
    }
    MemoryFile(const MemoryFile&) = delete;
    MemoryFile& operator=(const MemoryFile&) = delete;

    std::string path() const
    {
        return "/proc/self/fd/" + std::to_string(file_);
    }

private:
    const int file_;
};

void readOsRelease(const std::string& text)
{
    for (const char* const name : {"NAME", "VERSION_ID", ""})
        if (const auto value = osReleaseVariable(text, name))
            require(!value->empty(), "a variable that is empty is none", name);
}

void readPackages(const std::string& text)
{
    const std::size_t end = text.find('\n');
    for (const std::string& name : {std::string("libc6"), text.substr(0, end)}) {
        const auto version = versionIn(text, name);
        if (version && version.value())
            require(!version.value()->empty() && version.value()->find('\n') == std::string::npos &&
                        text.find("install ok installed") != std::string::npos,
                    "a version is one line of an installed package", *version.value());
    }
}

// A reason's own characters are in none of the made-up texts' alphabet.
void readConfiguration(const std::string& text)
{
    const MemoryFile file(text);
    const auto value = LinuxConfiguration({file.path()}).text("db/csc/salescode");
    if (value)
        require(!value.value().value.empty(), "an empty value is none");
    else
        require(value.error().reason.size() < 120, "a reason repeats nothing of the file",
                value.error().reason);
}

void readFirmware(const std::string& text)
{
    const MemoryFile file(text);
    const std::string path = file.path();
    const auto value = readFirst("", {path.c_str()});
    if (value)
        require(!value.value().value.empty() &&
                    value.value().value.find('\0') == std::string::npos &&
                    value.value().value.back() != '\n',
                "a text ends at its first NUL and without white space", value.value().value);
}

} // namespace

int LLVMFuzzerTestOneInput(const unsigned char* data, std::size_t size)
{
    if (size == 0)
        return 0;
    const std::string text(reinterpret_cast<const char*>(data) + 1, size - 1);
    switch (data[0]) {
    case 'o':
        readOsRelease(text);
        break;
    case 'p':
        readPackages(text);
        break;
    case 'c':
        readConfiguration(text);
        break;
    default:
        readFirmware(text);
    }
    return 0;
}
