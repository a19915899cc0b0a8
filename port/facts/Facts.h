// SPDX-License-Identifier: Apache-2.0
// The rows of facts.def.
#ifndef PORT_FACTS_FACTS_H
#define PORT_FACTS_FACTS_H

#include <cstdint>
#include <string>
#include <string_view>
#include <variant>

#include <coresystem_port.h>

namespace port {

using coresystem_port::Question;

enum class FontSize { Small, Normal, Large, Huge, Giant };

enum class Privacy {
    Public,
    Private, // identifies a person or a device
};

struct FactRow {
    std::string_view section;
    std::string_view key; // empty: any
    Privacy privacy;
    std::string_view words;
};

// The keys of all facts, in the order in which they are listed.
constexpr FactRow FACTS[] = {
#define FACT(number, question, section, key, value, type, privacy, words) \
    {section, key, Privacy::privacy, words},
#define KEY(section, key, type, privacy, words) {section, key, Privacy::privacy, words},
#include "facts.def"
};

/// Null when there is no such key.
constexpr const FactRow* findFact(std::string_view section, std::string_view key)
{
    for (const FactRow& row : FACTS)
        if (row.section == section && (row.key == key || row.key.empty()))
            return &row;
    return nullptr;
}

/// Whether a value identifies a person or a device.
constexpr bool isPrivate(std::string_view section, std::string_view key)
{
    const FactRow* const row = findFact(section, key);
    return row != nullptr && row->privacy == Privacy::Private;
}

// A plain fact's answer: a text, a switch, or a number, which may be an enumerator's.
using FactValue = std::variant<std::string, bool, std::int64_t>;

// A plain fact by its question; other questions have none.
template <Question question>
struct PlainFact;

#define FACT(number, question, section, key, value, type, privacy, words) \
    template <>                                                           \
    struct PlainFact<Question::question> {                                \
        using Value = value;                                              \
        static constexpr const FactRow& row = *findFact(section, key);    \
        static_assert(static_cast<int>(Question::question) == (number),   \
                      "a question keeps its number; see tools/refresh");  \
    };
#define ASKED(number, question, words)                              \
    static_assert(static_cast<int>(Question::question) == (number), \
                  "a question keeps its number; see tools/refresh");
#include "facts.def"

/// The row of a plain fact; null for any other question.
constexpr const FactRow* rowOf(Question question)
{
    switch (question) {
#define FACT(number, question, section, key, value, type, privacy, words) \
    case Question::question:                                              \
        return &PlainFact<Question::question>::row;
#include "facts.def"
    default:
        return nullptr;
    }
}

} // namespace port

#endif
