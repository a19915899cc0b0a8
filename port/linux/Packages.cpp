// SPDX-License-Identifier: Apache-2.0
#include "Packages.h"

#include <algorithm>
#include <cerrno>
#include <cstdint>
#include <cstring>
#include <ctime>
#include <mutex>
#include <string_view>
#include <tuple>

#include <unistd.h>

#include "../common/RegularFile.h"

namespace port::linux_backend {
namespace {

constexpr std::size_t STATUS_LIMIT = 64 * 1024 * 1024;
constexpr std::size_t INDEX_LIMIT = 4 * 1024 * 1024; // of names and versions
constexpr std::size_t STATUS_BLOCK = 256 * 1024;
constexpr char STANZA_END[] = "\n\n"; // of a stanza

// Takes one line off the front of a text.
std::string_view takeLine(std::string_view& text)
{
    const std::size_t end = text.find('\n');
    const std::string_view line = text.substr(0, end);
    text.remove_prefix(end == std::string_view::npos ? text.size() : end + 1);
    return line;
}

// Sets the value of "NAME: value", unless an earlier line did. A line that goes on another one
// begins with a blank and is no field.
void readField(std::string_view line, std::string_view name, std::optional<std::string_view>& value)
{
    if (value || line.substr(0, name.size()) != name || line.substr(name.size(), 1) != ":")
        return;
    line.remove_prefix(name.size() + 1);
    line.remove_prefix(std::min(line.find_first_not_of(" \t"), line.size()));
    value = line.substr(0, line.find_last_not_of(" \t") + 1);
}

struct Stanza {
    std::string_view package;
    std::string_view status;
    std::string_view version;
};

Stanza readStanza(std::string_view text)
{
    std::optional<std::string_view> package;
    std::optional<std::string_view> status;
    std::optional<std::string_view> version;
    while (!text.empty()) {
        const std::string_view line = takeLine(text);
        readField(line, "Package", package);
        readField(line, "Status", status);
        readField(line, "Version", version);
    }
    return {package.value_or(""), status.value_or(""), version.value_or("")};
}

Result<std::optional<std::string>> answer(const std::string& name, std::string_view version)
{
    if (version.empty())
        return notAvailable("it holds no version of " + name);
    return std::optional<std::string>(version);
}

// Rejects a stanza without an end: it is no package.
Result<std::optional<std::string>> answerAtEnd(const std::string& rest)
{
    // dpkg ends every stanza with an empty line.
    if (!rest.empty())
        return notAvailable("it is cut off in the middle of a package");
    return std::optional<std::string>();
}

auto identityOf(const struct stat& file)
{
    return std::make_tuple(file.st_dev, file.st_ino, file.st_size, file.st_mtim.tv_sec,
                           file.st_mtim.tv_nsec, file.st_ctim.tv_sec, file.st_ctim.tv_nsec);
}

// One that changed just now may change again and show the same times.
bool isAtRest(const struct stat& file)
{
    return std::time(nullptr) - file.st_mtim.tv_sec > 1;
}

} // namespace

// A package of several architectures has one stanza for each of them; the first that is installed
// tells the version. False, and nothing is known any more, when there is no room.
bool PackageIndex::add(std::string_view name, std::string_view version)
{
    if (versions_.find(name) != versions_.end())
        return true;
    size_ += name.size() + version.size();
    if (size_ <= INDEX_LIMIT)
        versions_.emplace(name, version);
    else
        *this = PackageIndex();
    return size_ != 0;
}

Result<std::optional<std::string>> PackageIndex::version(const std::string& name, const Read& read)
{
    if (name.empty())
        return std::optional<std::string>();
    if (const auto known = versions_.find(name); known != versions_.end())
        return answer(name, known->second);
    std::string text;
    std::size_t offset = known_; // of that text
    for (bool isKept = true;;) {
        const std::size_t before = text.size();
        if (!read(offset + before, text))
            return notAvailable("");
        if (text.size() == before)
            return answerAtEnd(text);
        std::string_view rest(text);
        for (std::size_t end = rest.find(STANZA_END, before - std::min<std::size_t>(before, 1));
             end != std::string_view::npos; end = rest.find(STANZA_END)) {
            const Stanza stanza = readStanza(rest.substr(0, end));
            rest.remove_prefix(end + 2);
            offset += end + 2;
            if (stanza.status != "install ok installed")
                continue;
            isKept = isKept && add(stanza.package, stanza.version);
            if (isKept)
                known_ = offset;
            if (stanza.package == name)
                return answer(name, stanza.version);
        }
        text.erase(0, text.size() - rest.size());
    }
}

Result<std::optional<std::string>> versionIn(const std::string& status, const std::string& name)
{
    return PackageIndex().version(name, [&status](std::size_t offset, std::string& text) {
        text.append(status, std::min(offset, status.size()), STATUS_BLOCK);
        return true;
    });
}

Result<std::optional<std::string>> LinuxPackages::ask(const std::string& name)
{
    std::string problem;
    const Descriptor file = openRegularFile(root_ + DPKG_STATUS, problem);
    struct stat before = {};
    if (!problem.empty() || fstat(file.number(), &before) != 0)
        return notAvailable(problem.empty() ? std::strerror(errno) : problem);
    if (static_cast<std::uintmax_t>(before.st_size) > STATUS_LIMIT)
        return notAvailable(largerThan(STATUS_LIMIT));
    if (identityOf(before) != identityOf(indexed_) || !isAtRest(before))
        index_ = PackageIndex();
    indexed_ = before;
    auto answer = index_.version(name, [&file](std::size_t offset, std::string& text) {
        const std::size_t size = text.size();
        text.resize(size + STATUS_BLOCK);
        const ssize_t count =
            pread(file.number(), &text[size], STATUS_BLOCK, static_cast<off_t>(offset));
        text.resize(size + static_cast<std::size_t>(std::max<ssize_t>(count, 0)));
        return count >= 0;
    });
    if (!answer && answer.error().reason.empty())
        return notAvailable(std::strerror(errno));
    return answer;
}

Result<Sourced<std::optional<std::string>>> LinuxPackages::version(const std::string& name)
{
    const std::lock_guard<devicefile::ForkMutex> lock(mutex_);
    const auto found = ask(name);
    if (!found)
        return notAvailable(std::string(DPKG_STATUS) + ": " + found.error().reason);
    return Sourced<std::optional<std::string>>{found.value(), DPKG_STATUS};
}

} // namespace port::linux_backend
