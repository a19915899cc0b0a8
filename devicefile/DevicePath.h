// SPDX-License-Identifier: Apache-2.0
// The path of a value in a device file, as people write it.
#ifndef DEVICEFILE_DEVICE_PATH_H
#define DEVICEFILE_DEVICE_PATH_H

#include <optional>
#include <string>
#include <vector>

#include "../port/backend/Result.h"

namespace port::devicefile {

/// The names on the way from the file to a value; an index in a list is its number.
using DevicePath = std::vector<std::string>;

/// Reads settings.flight_mode, slot[0].sim (or slot.0.sim) and packages."org.example.app". A
/// section with keys of any name takes all that follows for one, so that the quotes may be left
/// out.
Result<DevicePath> parsePath(const std::string& text);

/// The number of an index; nothing when it is none.
std::optional<std::size_t> indexOf(const std::string& word);

/// A name as it stands before "=" in a device file: in quotes where it needs them.
std::string writtenKey(const std::string& name);

} // namespace port::devicefile

#endif
