// SPDX-License-Identifier: Apache-2.0
// Where a device file is looked for.
#ifndef DEVICEFILE_DEVICE_SEARCH_H
#define DEVICEFILE_DEVICE_SEARCH_H

#include <string>
#include <vector>

namespace port::devicefile {

struct FoundDevice {
    std::string path;       // the name itself when no file was found
    std::string elsewhere;  // ends a message about a missing one: where else it was looked for
    bool isShipped = false; // found by its name among those that come with the library
};

/// The file that a user's name of a device means.
///
/// With a slash it is a path. Otherwise NAME or NAME.toml is looked for among the user's own
/// devices, $XDG_CONFIG_HOME/coresystem/devices (by default in ~/.config), then among those that
/// are installed with the library. The current folder comes first when the name says that it is a
/// file's, by ending in ".toml", and last when it does not.
FoundDevice findDevice(const std::string& name);

struct NamedDevice {
    std::string name; // without ".toml"
    std::string path;
    bool isShipped; // else the user's own
};

/// Every device that a name alone leads to, by name. One of the user's own hides the shipped one.
std::vector<NamedDevice> listDevices();

} // namespace port::devicefile

#endif
