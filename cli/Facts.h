// SPDX-License-Identifier: Apache-2.0
// The facts that the library knows about a device, under the names that users type.
#ifndef CLI_FACTS_H
#define CLI_FACTS_H

#include <string>
#include <utility>
#include <vector>

#include "Session.h"

namespace cli {

struct Fact { // NOLINT(bugprone-exception-escape): Json checks itself when it is moved
    std::string name;
    Json value;              // null when there is none
    std::string source;      // who served the value
    std::string reason;      // why there is no value
    bool isIdentity = false; // of a person or a device: masked where it was not asked for by name
    Json today = nullptr;    // what is true today, where the library's tables say something else
};

/// The names of all facts, in the order in which they are shown.
std::vector<std::string> factNames();

/// Throws a UsageError about a name that is none of those, nor a former one of them, with the one
/// that is meant.
void checkFactName(const std::string& name, const std::vector<std::string>& names);

/// Former names of facts, and their names: each asks for the same.
const std::vector<std::pair<std::string, std::string>>& factAliases();
/// The name itself, of a former one the present one.
std::string factNameOf(const std::string& name);

/// Asks the library for facts of factNames(), or by their former names, in that order. Returns within
/// seconds also when a source never answers: its fact has no value then, and a reason that says so.
std::vector<Fact> askFacts(const std::vector<std::string>& names);

/// The names of those that can be watched: all but the device daemon's, which tells of no change.
std::vector<std::string> watchableFactNames();

/// Asks for one of these on this thread, and waits for as long as its source takes.
Fact askFact(const std::string& name);

/// The facts of each SIM slot, "slot[1].roaming"; the first only what no other fact tells.
std::vector<Fact> askSlotFacts();

/// Whether a question of askFacts() is still waiting for its answer. It cannot be called back: such
/// a process must end without the destructors of its static objects.
bool isStillAsking();

/// The value as a user reads it; of a fact that has one.
std::string textOf(const Json& value);

} // namespace cli

#endif
