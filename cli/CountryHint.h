// SPDX-License-Identifier: Apache-2.0
// What to tell somebody whose country key the library does not know.
#ifndef CLI_COUNTRY_HINT_H
#define CLI_COUNTRY_HINT_H

#include <string>

#include "CountryAtlas.h"

namespace cli {

/// One line that says why the key is none, and the right form where it can be guessed.
std::string unknownCountryHint(const CountryAtlas& atlas, const std::string& key);

} // namespace cli

#endif
