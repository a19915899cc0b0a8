// SPDX-License-Identifier: Apache-2.0
#include "Files.h"

#include <algorithm>
#include <filesystem>
#include <sstream>

#include "../common/GLibTypes.h"
#include "../common/RegularFile.h"

namespace port::linux_backend {
namespace {

constexpr std::size_t LIMIT = 64 * 1024;

// Empty, and the reason in `problem`, when there is no text.
std::string readText(const std::string& path, std::string& problem)
{
    std::string text;
    if (!readRegularFile(path, LIMIT, text, problem))
        return {};
    text.resize(std::min(text.find('\0'), text.size())); // device-tree texts end in a NUL
    text.resize(text.find_last_not_of(" \t\r\n") + 1);
    if (text.empty())
        problem = "empty";
    return text;
}

} // namespace

Result<Fact> readFirst(const std::string& root, Places places, TextCheck check)
{
    std::string problems;
    for (const char* const place : places) {
        std::string problem;
        const std::string text = readText(root + place, problem);
        if (problem.empty() && check != nullptr)
            problem = check(text);
        if (problem.empty())
            return Fact{text, place};
        problems += (problems.empty() ? "" : ", ") + std::string(place) + ": " + problem;
    }
    return notAvailable(problems);
}

std::vector<std::string> entriesOf(const std::string& folder)
{
    std::vector<std::string> entries;
    std::error_code ignored;
    for (std::filesystem::directory_iterator entry(folder, ignored), end; !ignored && entry != end;
         entry.increment(ignored))
        entries.push_back(entry->path().string());
    std::sort(entries.begin(), entries.end());
    return entries;
}

std::optional<std::string> osReleaseVariable(const std::string& content, const std::string& name)
{
    std::optional<std::string> found;
    std::istringstream lines(content);
    for (std::string line; std::getline(lines, line);) {
        g_strstrip(line.data());
        if (line.compare(0, name.size() + 1, name + "=") != 0)
            continue;
        // The quoting is a shell's, and as in a shell the last assignment counts.
        Owned<GError> error;
        const Owned<char> value(g_shell_unquote(line.c_str() + name.size() + 1, Out(error)));
        found = value && *value != '\0' ? std::optional<std::string>(value.get()) : std::nullopt;
    }
    return found;
}

} // namespace port::linux_backend
