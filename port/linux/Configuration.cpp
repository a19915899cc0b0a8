// SPDX-License-Identifier: Apache-2.0
#include "Configuration.h"

#include "../common/GLibTypes.h"
#include "../common/RegularFile.h"

namespace port::linux_backend {
namespace {

constexpr std::size_t LIMIT = 1024 * 1024;

// "db/csc/salescode" stands in the group [db/csc], under the name salescode.
struct Place {
    std::string group;
    std::string name;
};

Result<Place> placeOf(const std::string& key)
{
    const std::size_t slash = key.rfind('/');
    if (slash == std::string::npos || slash == 0 || slash + 1 == key.size())
        return notAvailable("\"" + key + "\" is no key: it has no group or no name");
    return Place{key.substr(0, slash), key.substr(slash + 1)};
}

// The reason without the file, which the caller tells.
Result<std::string> readText(const std::string& file, const Place& place)
{
    std::string content;
    std::string problem;
    if (!readRegularFile(file, LIMIT, content, problem))
        return notAvailable(problem);
    Owned<GError> error;
    const Owned<GKeyFile> keyFile(g_key_file_new());
    if (!g_key_file_load_from_data(keyFile.get(), content.data(), content.size(), G_KEY_FILE_NONE,
                                   Out(error)))
        return notAvailable(error->message);
    const Owned<char> text(
        g_key_file_get_string(keyFile.get(), place.group.c_str(), place.name.c_str(), Out(error)));
    if (!text)
        return notAvailable(error->message);
    return *text != '\0' ? Result<std::string>(text.get()) : notAvailable("it is empty");
}

} // namespace

Result<Fact> LinuxConfiguration::text(const std::string& key)
{
    const Result<Place> place = placeOf(key);
    if (!place)
        return place.error();
    std::string problems;
    for (const std::string& file : files_) {
        const Result<std::string> text = readText(file, place.value());
        if (text)
            return Fact{text.value(), file};
        problems += (problems.empty() ? "" : "; ") + file + ": " + text.error().reason;
    }
    return notAvailable(problems);
}

} // namespace port::linux_backend
