// SPDX-License-Identifier: Apache-2.0
// The one way in which a file that others read is changed.
#ifndef DEVICEFILE_CHANGE_FILE_H
#define DEVICEFILE_CHANGE_FILE_H

#include <cstddef>
#include <functional>
#include <string>

namespace port::devicefile {

/// Puts a new content in the place of a regular file's: at once, so that every reader finds the old
/// one or the new one whole, and on the disk before it returns. `change` gets the content (at most
/// `limit` bytes) and makes it the new one, or tells why not; then, as after any other failure, the
/// file stays as it is. An unchanged content is not written.
///
/// Who comes through here takes turns, whatever process it is in. The file's mode is kept, its
/// owner where that is permitted; a symbolic link goes on leading to the file. A file that may not
/// be written is refused, even where its folder would permit it.
///
/// The reason for people when it failed, else empty.
std::string changeFile(const std::string& path, std::size_t limit,
                       const std::function<std::string(std::string& content)>& change);

} // namespace port::devicefile

#endif
