// SPDX-License-Identifier: Apache-2.0
#include "DevicePath.h"

#include <charconv>
#include <sstream>

#include "DeviceFile.h"
#include "Schema.h"
#include "TextPlaces.h"
#include "Toml.h"

namespace port::devicefile {
namespace {

// An index is no key of TOML's: it becomes one of digits.
std::string withIndexAsKey(const std::string& text)
{
    const std::size_t open = text.find_first_of("[.\"'");
    const std::size_t close = text.find(']');
    if (open == std::string::npos || text[open] != '[' || close == std::string::npos)
        return text;
    const auto index = indexOf(text.substr(open + 1, close - open - 1));
    return index ? text.substr(0, open) + "." + std::to_string(*index) + text.substr(close + 1)
                 : text;
}

// Whether the key ends where the text does, unlike that of "a = 1 #".
bool isWhole(const std::string& text, const toml::node& value)
{
    return text.find('\n') == std::string::npos &&
           value.source().begin.column == charactersOf(text) + 2; // behind "="
}

// The keys of `text = 0`; none when that is something else.
DevicePath keysOf(const std::string& text)
{
    DevicePath path;
    const toml::table root = parseToml(text + "=0");
    const toml::node* node = &root;
    while (const toml::table* const table = node->as_table()) {
        if (table->size() != 1)
            return {};
        path.emplace_back(table->begin()->first.str());
        node = &table->begin()->second;
    }
    return isWhole(text, *node) ? path : DevicePath();
}

DevicePath withFreeKeyJoined(DevicePath path)
{
    const SectionRow* const section = findSection(path.front());
    if (section == nullptr || section->form != Form::Free)
        return path;
    while (path.size() > 2) {
        path[1] += "." + path[2];
        path.erase(path.begin() + 2);
    }
    return path;
}

} // namespace

Result<DevicePath> parsePath(const std::string& text)
{
    try {
        if (text.size() <= LINE_LIMIT)
            if (DevicePath path = keysOf(withIndexAsKey(text)); !path.empty())
                return withFreeKeyJoined(std::move(path));
    } catch (const TomlError&) { // said below
    }
    return notAvailable("it is no path like settings.flight_mode, slot[0].sim or "
                        "packages.\"org.example.app\"");
}

std::optional<std::size_t> indexOf(const std::string& word)
{
    std::size_t index = 0;
    const char* const end = word.data() + word.size();
    const auto [behind, error] = std::from_chars(word.data(), end, index);
    return error == std::errc() && behind == end ? std::optional<std::size_t>(index) : std::nullopt;
}

std::string writtenKey(const std::string& name)
{
    const toml::table table{{name, 0}};
    std::ostringstream stream;
    stream << toml::toml_formatter{table, toml::format_flags::allow_unicode_strings};
    const std::string written = stream.str();
    return written.substr(0, written.rfind(" = 0"));
}

} // namespace port::devicefile
