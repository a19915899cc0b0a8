// SPDX-License-Identifier: Apache-2.0
// The schema of device files: their sections, their keys and the type of each.
#ifndef DEVICEFILE_SCHEMA_H
#define DEVICEFILE_SCHEMA_H

#include <cstdint>
#include <string>
#include <string_view>
#include <vector>

namespace port::devicefile {

// The meaning of a number or of a name in quotes.
struct Meaning {
    enum class Kind {
        Number,       // `number`, which may be an enumerator's or an error's
        NotSupported, // this device has no such thing
        Nothing,      // a call succeeds with null or an empty list
        NotAString,   // a reply over the bus has another type
        BusError,     // an error of the bus, which has a name only
    };
    Kind kind;
    std::int64_t number;

    constexpr Meaning(std::int64_t itself = 0) : kind(Kind::Number), number(itself) {}
    constexpr Meaning(Kind other) : kind(other), number(0) {}

    constexpr bool operator==(const Meaning& other) const
    {
        return kind == other.kind && number == other.number;
    }
};

// The fault of the bus of a program that is run on a device.
enum class BusFault { NoBus };

// How a service misbehaves.
enum class ServiceFault { None, Absent, Silent, Slow, Crashing };

struct Name {
    std::string_view name; // in quotes
    Meaning meaning;
};

struct Names {
    const Name* rows;
    std::size_t count;

    const Name* begin() const
    {
        return rows;
    }
    const Name* end() const
    {
        return rows + count;
    }
};

struct Type {
    enum class Kind {
        Text,     // in quotes, without a NUL, from `least` to `most` bytes; no end below `least`
        Digits,   // in quotes, from `least` to `most` of them
        Number,   // a phone number in quotes, or "null"
        Switch,   // true or false
        Whole,    // a whole number from `least` to `most`
        Name,     // one of `names` in quotes, or a whole number from `least` to `most`
        Fault,    // one of `names` in quotes, or a table with it as "error" and the keys of a fault
        Changes,  // a table of paths and values; of a step
        Paths,    // a list of paths in quotes; of a step
        BusFault, // the same, and the error may be any error name of the bus
    };
    Kind kind;
    std::int64_t least = 0;
    std::int64_t most = -1; // below `least`: no number at all
    Names names = {nullptr, 0};
};

enum class Form {
    Section, // [name]
    List,    // [[name]], any number of them
    Free,    // [name] with keys of any name
};

struct SectionRow {
    std::string_view name;
    Form form;
};

const SectionRow* findSection(std::string_view name);

/// The type of a key; null when the section has no such key.
const Type* findKey(const SectionRow& section, std::string_view key);

/// The type of a key beside "error" in a fault's table; null when there is no such key.
const Type* findFaultKey(std::string_view key);

/// The keys of a section in order; none when it has keys of any name.
std::vector<std::string> keyNames(const SectionRow& section);

/// The keys beside "error" in a fault's table.
std::vector<std::string> faultKeyNames();

/// All sections in order, for `for`.
const SectionRow* beginSections();
const SectionRow* endSections();

} // namespace port::devicefile

#endif
