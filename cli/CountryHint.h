// SPDX-License-Identifier: Apache-2.0
// Hints for somebody whose country key the library does not know.
#ifndef CLI_COUNTRY_HINT_H
#define CLI_COUNTRY_HINT_H

#include <string>

#include "CountryAtlas.h"

namespace cli {

/// The MCC of a key that only the command reads: an alpha-3 code, a whole name, or a calling code
/// with its area digits ("1-876", "+1 876"); empty when it is none, or several countries'.
std::string mccOfOtherKey(const CountryAtlas& atlas, const std::string& key);

/// One line that says why the key is none, and the right form where it can be guessed.
std::string unknownCountryHint(const CountryAtlas& atlas, const std::string& key);

} // namespace cli

#endif
