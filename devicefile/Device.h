// SPDX-License-Identifier: Apache-2.0
// The content of a device file, as values that know where they stand.
#ifndef DEVICEFILE_DEVICE_H
#define DEVICEFILE_DEVICE_H

#include <cstdint>
#include <map>
#include <string>
#include <type_traits>
#include <utility>
#include <variant>
#include <vector>

#include "../port/backend/FactAnswer.h"
#include "../port/backend/Result.h"
#include "DeviceText.h"
#include "Schema.h"

namespace port::devicefile {

// The behaviour that replaces a call's own.
struct Fault {
    std::string error; // its name in the file; empty: none, the call is late only
    Meaning meaning;   // the error's
    std::int64_t delayMs = 0;
    std::int64_t call = 0; // counted from 1; 0: every one
};

struct Value {
    std::variant<std::string, bool, Meaning, Fault> content;
    std::string source; // FILE:LINE
};

class Section {
public:
    Section(std::string title, std::string source)
        : title_(std::move(title)), source_(std::move(source))
    {
    }

    /// Where it stands as FILE:LINE, or the file when it is not there.
    const std::string& source() const
    {
        return source_;
    }

    void set(const std::string& key, Value value)
    {
        values_[key] = std::move(value);
    }

    /// Null when the key is absent.
    const Value* find(const std::string& key) const
    {
        const auto found = values_.find(key);
        return found != values_.end() ? &found->second : nullptr;
    }

    /// The value of a plain fact's key.
    FactAnswer fact(const std::string& key) const
    {
        const Value* const value = find(key);
        if (value != nullptr && std::holds_alternative<std::string>(value->content))
            return factAnswer(get<std::string>(key));
        if (value != nullptr && std::holds_alternative<bool>(value->content))
            return factAnswer(get<bool>(key));
        return factAnswer(get<std::int64_t>(key));
    }

    /// A value of the type that the schema gives the key: std::string, bool, Fault,
    /// std::int64_t, or the enumeration behind its names.
    template <typename T>
    Result<Sourced<T>> get(const std::string& key) const
    {
        const Value* const value = find(key);
        if (value == nullptr)
            return notAvailable(source_ + ": " + title_ + " has no " + key);
        if constexpr (std::is_same_v<T, std::string> || std::is_same_v<T, bool> ||
                      std::is_same_v<T, Fault>) {
            return Sourced<T>{std::get<T>(value->content), value->source};
        } else {
            const auto meaning = std::get<Meaning>(value->content);
            if (meaning == Meaning::Kind::NotSupported)
                return notSupported(value->source + ": this device has no " + key);
            return Sourced<T>{static_cast<T>(meaning.number), value->source};
        }
    }

private:
    std::string title_; // [name]
    std::string source_;
    std::map<std::string, Value> values_;
};

// The changes that a scenario makes at once, some time after the step before.
struct Step {
    std::int64_t afterMs = 0;
    std::string note;
    std::vector<Edit> changes;
    std::string source; // FILE:LINE
};

struct Device {
    std::map<std::string, Section, std::less<>> sections; // every one, there or not
    std::vector<Section> slots;                           // each with a cp_name of its own
    std::vector<Step> steps;

    const Section& section(const std::string& name) const
    {
        return sections.find(name)->second;
    }
};

} // namespace port::devicefile

#endif
