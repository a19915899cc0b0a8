// SPDX-License-Identifier: Apache-2.0
#include "Packages.h"

#include <algorithm>
#include <string_view>

#include "../common/RegularFile.h"

namespace port::linux_backend {
namespace {

constexpr std::size_t STATUS_LIMIT = 64 * 1024 * 1024;

// Takes one line off the front of a text.
std::string_view takeLine(std::string_view& text)
{
    const std::size_t end = text.find('\n');
    const std::string_view line = text.substr(0, end);
    text.remove_prefix(end == std::string_view::npos ? text.size() : end + 1);
    return line;
}

// The value of "NAME: value" in a stanza, empty when there is none. A line that goes on another one
// begins with a blank and is no field.
std::string_view field(std::string_view stanza, std::string_view name)
{
    while (!stanza.empty()) {
        std::string_view line = takeLine(stanza);
        if (line.substr(0, name.size()) != name || line.substr(name.size(), 1) != ":")
            continue;
        line.remove_prefix(name.size() + 1);
        line.remove_prefix(std::min(line.find_first_not_of(" \t"), line.size()));
        return line.substr(0, line.find_last_not_of(" \t") + 1);
    }
    return {};
}

// A package of several architectures has one stanza for each of them; the first that is installed
// tells the version.
bool isInstalled(std::string_view stanza, const std::string& name)
{
    return field(stanza, "Package") == name && field(stanza, "Status") == "install ok installed";
}

} // namespace

Result<std::optional<std::string>> versionIn(const std::string& status, const std::string& name)
{
    using Version = std::optional<std::string>;
    std::string_view rest(status);
    while (!rest.empty() && !name.empty()) {
        const std::size_t end = rest.find("\n\n");
        // dpkg ends every stanza with an empty line.
        if (end == std::string_view::npos)
            return notAvailable("it is cut off in the middle of a package");
        const std::string_view stanza = rest.substr(0, end);
        rest.remove_prefix(end + 2);
        if (!isInstalled(stanza, name))
            continue;
        const std::string_view version = field(stanza, "Version");
        if (version.empty())
            return notAvailable("it holds no version of " + name);
        return Version(version);
    }
    return Version();
}

Result<Sourced<std::optional<std::string>>> LinuxPackages::version(const std::string& name)
{
    std::string status;
    std::string problem;
    if (!readRegularFile(root_ + DPKG_STATUS, STATUS_LIMIT, status, problem))
        return notAvailable(std::string(DPKG_STATUS) + ": " + problem);
    const auto found = versionIn(status, name);
    if (!found)
        return notAvailable(std::string(DPKG_STATUS) + ": " + found.error().reason);
    return Sourced<std::optional<std::string>>{found.value(), DPKG_STATUS};
}

} // namespace port::linux_backend
