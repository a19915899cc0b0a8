// SPDX-License-Identifier: Apache-2.0
// Small text files of this machine.
#ifndef PORT_LINUX_FILES_H
#define PORT_LINUX_FILES_H

#include <initializer_list>
#include <optional>
#include <string>
#include <vector>

#include "../backend/Result.h"

namespace port::linux_backend {

// Files that may hold a fact, the preferred one first.
using Places = std::initializer_list<const char*>;

constexpr Places MACHINE_ID = {"/etc/machine-id", "/var/lib/dbus/machine-id"};
constexpr Places OS_RELEASE = {"/etc/os-release", "/usr/lib/os-release"};
constexpr Places HARDWARE_MODEL = {"/sys/class/dmi/id/product_name", "/proc/device-tree/model"};
constexpr Places SERIAL_NUMBER = {"/proc/device-tree/serial-number",
                                  "/sys/class/dmi/id/product_serial"};

// Says what is wrong with a text; "" when nothing is.
using TextCheck = std::string (*)(const std::string& text);

/// The text of the first place below `root` that holds one, with that place as its source. It ends
/// at the first NUL and has no white space at its end. A file that is no regular file, is larger
/// than 64 KiB or holds nothing is passed over, and so is a text that `check` refuses; the
/// error says why each of them was.
Result<Fact> readFirst(const std::string& root, Places places, TextCheck check = nullptr);

/// The entries of a folder as paths, in a fixed order; none when it is not there.
std::vector<std::string> entriesOf(const std::string& folder);

/// A variable of an os-release(5) file, unquoted; nothing when it is missing, empty or malformed.
std::optional<std::string> osReleaseVariable(const std::string& content, const std::string& name);

} // namespace port::linux_backend

#endif
