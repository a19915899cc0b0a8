// SPDX-License-Identifier: Apache-2.0
#include "Configuration.h"

#include "../common/GLibTypes.h"
#include "../common/RegularFile.h"

namespace port::linux_backend {
namespace {

constexpr std::size_t CONFIGURATION_LIMIT = 1024 * 1024;

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

// GLib's own texts repeat lines of the file, which may be anybody's: a reason never does.
Error refusalOf(const GError& error)
{
    switch (error.code) {
    case G_KEY_FILE_ERROR_GROUP_NOT_FOUND:
    case G_KEY_FILE_ERROR_KEY_NOT_FOUND:
        return notAvailable("it has no such key");
    case G_KEY_FILE_ERROR_UNKNOWN_ENCODING:
    case G_KEY_FILE_ERROR_INVALID_VALUE:
        return notAvailable("it has no readable text for the key");
    default:
        return notAvailable("it is no file of groups and keys");
    }
}

// The reason without the file, which the caller tells.
Result<std::string> readText(const std::string& file, const Place& place)
{
    std::string content;
    std::string problem;
    if (!readRegularFile(file, CONFIGURATION_LIMIT, content, problem))
        return notAvailable(problem);
    Owned<GError> error;
    const Owned<GKeyFile> keyFile(g_key_file_new());
    if (!g_key_file_load_from_data(keyFile.get(), content.data(), content.size(), G_KEY_FILE_NONE,
                                   Out(error)))
        return refusalOf(*error);
    const Owned<char> text(
        g_key_file_get_string(keyFile.get(), place.group.c_str(), place.name.c_str(), Out(error)));
    if (!text)
        return refusalOf(*error);
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
