// SPDX-License-Identifier: Apache-2.0
// Bodies of debug lines, made readable.
#ifndef CLI_DECIPHER_H
#define CLI_DECIPHER_H

#include <string>

namespace cli {

struct Deciphered {
    std::string line;
    unsigned failures = 0;
};

/// The line with every body in plain text that can be deciphered; the others stay as they are, and
/// are counted unless they say themselves why nothing was enciphered.
Deciphered decipherLine(const std::string& line);

} // namespace cli

#endif
