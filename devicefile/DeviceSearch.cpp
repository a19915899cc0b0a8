// SPDX-License-Identifier: Apache-2.0
#include "DeviceSearch.h"

#include <cstdlib>
#include <filesystem>
#include <map>
#include <system_error>

#include "Closest.h"
#include "port/common/OwnFile.h"

namespace port::devicefile {
namespace {

namespace fs = std::filesystem;

constexpr const char* DEVICES = "coresystem/devices";
constexpr const char* EXTENSION = ".toml";
// From lib/TRIPLET/ up to what lib/ stands in.
constexpr int LEVELS_UP = 3;

std::string variable(const char* name)
{
    const char* const value = secure_getenv(name);
    return value != nullptr ? value : "";
}

// Empty for a user without a home.
fs::path ownFolder()
{
    fs::path config = variable("XDG_CONFIG_HOME");
    if (!config.is_absolute()) // a relative one is to be ignored
        config = fs::path(variable("HOME")) / ".config";
    return config.is_absolute() ? config / DEVICES : fs::path();
}

// Found from the place of the library, so that an installed tree can be moved. Empty when not
// there.
fs::path shippedFolder()
{
    fs::path above = fs::path(ownFile()).parent_path();
    for (int level = 0; level < LEVELS_UP; ++level) {
        above = above.parent_path();
        std::error_code error;
        if (const fs::path folder = above / "share" / DEVICES; fs::is_directory(folder, error))
            return folder;
    }
    return {};
}

bool isFile(const fs::path& path)
{
    std::error_code error;
    return fs::is_regular_file(path, error);
}

bool isFileName(const std::string& name)
{
    return fs::path(name).extension() == EXTENSION;
}

// The device of that name in a folder; empty when there is none.
std::string fileIn(const fs::path& folder, const std::string& name)
{
    for (const std::string& file : {name, name + EXTENSION})
        if (!folder.empty() && isFile(folder / file))
            return folder / file;
    return {};
}

std::string fileOf(const std::string& name)
{
    if (isFileName(name) && isFile(name))
        return name;
    for (const fs::path& folder : {ownFolder(), shippedFolder()})
        if (const std::string file = fileIn(folder, name); !file.empty())
            return file;
    return isFile(name) ? name : "";
}

std::string placesOf(const std::string& name)
{
    std::string places = ", here";
    for (const fs::path& folder : {ownFolder(), shippedFolder()})
        if (!folder.empty())
            places += " or in " + folder.string();
    std::vector<std::string> names;
    for (const NamedDevice& device : listDevices())
        names.push_back(device.name);
    const std::string meant =
        similar(isFileName(name) ? fs::path(name).stem().string() : name, names);
    return places + (meant.empty() ? "" : "; did you mean \"" + meant + "\"?");
}

void addDevices(const fs::path& folder, bool areShipped,
                std::map<std::string, NamedDevice>& devices)
{
    std::error_code error;
    for (auto entry = fs::directory_iterator(folder, error); entry != fs::directory_iterator();
         entry.increment(error)) {
        const fs::path& path = entry->path();
        if (isFileName(path) && isFile(path))
            devices.insert({path.stem(), {path.stem(), path, areShipped}});
    }
}

} // namespace

FoundDevice findDevice(const std::string& name)
{
    if (name.find('/') != std::string::npos)
        return {name, "", false};
    if (const std::string file = fileOf(name); !file.empty())
        return {file, "", file != name && fs::path(file).parent_path() == shippedFolder()};
    return {name, placesOf(name), false};
}

std::vector<NamedDevice> listDevices()
{
    std::map<std::string, NamedDevice> byName;
    addDevices(ownFolder(), false, byName);
    addDevices(shippedFolder(), true, byName);
    std::vector<NamedDevice> devices;
    devices.reserve(byName.size());
    for (auto& [name, device] : byName)
        devices.push_back(std::move(device));
    return devices;
}

} // namespace port::devicefile
