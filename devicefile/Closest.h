// SPDX-License-Identifier: Apache-2.0
// Finds the word that a mistyped one was meant to be.
#ifndef DEVICEFILE_CLOSEST_H
#define DEVICEFILE_CLOSEST_H

#include <string>
#include <vector>

namespace port::devicefile {

/// The candidate that takes the fewest edits to make from the word; there must be one.
std::string closest(const std::string& word, const std::vector<std::string>& candidates);

/// The same, but empty when even that one takes more edits than half of the word.
std::string similar(const std::string& word, const std::vector<std::string>& candidates);

} // namespace port::devicefile

#endif
