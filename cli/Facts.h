// SPDX-License-Identifier: Apache-2.0
// The facts that the library knows about a device, under the names that users type.
#ifndef CLI_FACTS_H
#define CLI_FACTS_H

#include <optional>
#include <string>
#include <vector>

namespace cli {

struct Fact {
    std::string name;
    std::optional<std::string> value;
    std::string source; // who served the value
    std::string reason; // why there is no value
};

/// The names of all facts, in the order in which they are shown.
std::vector<std::string> factNames();

/// Asks the library for one fact of factNames().
Fact askFact(const std::string& name);

} // namespace cli

#endif
