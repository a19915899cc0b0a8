// SPDX-License-Identifier: Apache-2.0
#include "DeviceFile.h"

#include <algorithm>
#include <sstream>

#include <dlog.h>
#include <toml++/toml.h>

#include "../backend/Log.h"
#include "../common/RegularFile.h"

namespace port::simulator {
namespace {

constexpr long SCHEMA = 1;
constexpr std::size_t SIZE_LIMIT = 1024 * 1024;
constexpr std::size_t LINE_LIMIT = 1024;

// Every key that a device file may hold.
constexpr struct {
    const char* section;
    const char* key;
} TEXT_KEYS[] = {
    {"device", "platform_id"}, {"device", "platform_name"}, {"device", "platform_version"},
    {"device", "model_name"},  {"settings", "device_name"}, {"settings", "language"},
};

struct Problem {
    toml::source_region where;
    std::string text;
};

std::string describe(const std::string& path, const Problem& problem)
{
    return path + ":" + std::to_string(problem.where.begin.line) + ":" +
           std::to_string(problem.where.begin.column) + ": " + problem.text;
}

bool isSection(std::string_view name)
{
    for (const auto& row : TEXT_KEYS)
        if (row.section == name)
            return true;
    return false;
}

bool isTextKey(std::string_view section, std::string_view key)
{
    for (const auto& row : TEXT_KEYS)
        if (row.section == section && row.key == key)
            return true;
    return false;
}

// In quotes and on one line, whatever it holds.
std::string quoted(std::string_view name)
{
    const toml::value<std::string> text{std::string(name)};
    std::ostringstream stream;
    stream << toml::toml_formatter{text, toml::format_flags::none};
    return stream.str();
}

void checkSchema(const toml::table& root)
{
    const toml::node* const schema = root.get("schema");
    if (schema == nullptr)
        throw Problem{{{1, 1}, {1, 1}, {}}, "schema = 1 is missing"};
    if (schema->value_exact<std::int64_t>() != SCHEMA)
        throw Problem{schema->source(), "this version reads schema = 1 only"};
}

void readKey(Device& device, const std::string& section, const toml::key& key,
             const toml::node& node)
{
    if (!isTextKey(section, key))
        throw Problem{key.source(), "unknown key " + quoted(key) + " in [" + section + "]"};
    const auto value = node.value_exact<std::string>();
    if (!value)
        throw Problem{node.source(), quoted(key) + " must be a text in quotes"};
    if (value->find('\0') != std::string::npos)
        throw Problem{node.source(), quoted(key) + " must not hold a NUL"};
    device[{section, std::string(key.str())}] = {*value, node.source().begin.line};
}

void readSection(Device& device, const toml::key& name, const toml::node& node)
{
    if (!isSection(name))
        throw Problem{name.source(), "unknown key " + quoted(name)};
    const toml::table* const section = node.as_table();
    if (section == nullptr)
        throw Problem{node.source(), "[" + std::string(name.str()) + "] must be a section"};
    for (const auto& [key, value] : *section)
        readKey(device, std::string(name.str()), key, value);
}

// Keys with many dots nest tables, which the parser's objects release by recursion: a bound on the
// line (and on nested values, TOML_MAX_NESTED_VALUES) keeps that from using up the stack.
void checkLines(const std::string& text)
{
    toml::source_index line = 1;
    for (std::size_t begin = 0, end = 0; begin < text.size(); begin = end + 1, ++line) {
        end = std::min(text.find('\n', begin), text.size());
        if (end - begin > LINE_LIMIT)
            throw Problem{{{line, 1}, {line, 1}, {}},
                          "a line longer than " + std::to_string(LINE_LIMIT) + " bytes"};
    }
}

} // namespace

Result<Device> parseDevice(const std::string& text, const std::string& path)
{
    try {
        checkLines(text);
        const toml::table root = toml::parse(text, path);
        checkSchema(root);
        Device device;
        for (const auto& [key, node] : root)
            if (key != "schema")
                readSection(device, key, node);
        return device;
    } catch (const toml::parse_error& error) {
        return notAvailable(describe(path, {error.source(), std::string(error.description())}));
    } catch (const Problem& problem) {
        return notAvailable(describe(path, problem));
    }
}

Result<std::shared_ptr<const Device>> DeviceFile::device()
{
    const Result<std::shared_ptr<const Device>> now = read();
    report(now ? std::string() : now.error().reason);
    return now;
}

Result<std::shared_ptr<const Device>> DeviceFile::read()
{
    std::string text;
    std::string problem;
    if (!readRegularFile(path_, SIZE_LIMIT, text, problem))
        return notAvailable(path_ + ": " + problem);
    const std::lock_guard<std::mutex> lock(mutex_);
    if (parsed_ == nullptr || parsedText_ != text) {
        const Result<Device> fresh = parseDevice(text, path_);
        if (!fresh)
            return fresh.error();
        parsed_ = std::make_shared<const Device>(fresh.value());
        parsedText_ = text;
    }
    return parsed_;
}

void DeviceFile::report(const std::string& problem)
{
    {
        const std::lock_guard<std::mutex> lock(mutex_);
        if (problem == reported_)
            return;
        reported_ = problem;
    }
    if (!problem.empty())
        processLog().write(DLOG_ERROR, "coresystem-port", problem);
}

Result<Fact> DeviceFile::text(const std::string& section, const std::string& key)
{
    const Result<std::shared_ptr<const Device>> now = device();
    if (!now)
        return now.error();
    const auto found = now.value()->find({section, key});
    if (found == now.value()->end())
        return notAvailable(path_ + ": [" + section + "] has no " + key);
    return Fact{found->second.value, path_ + ":" + std::to_string(found->second.line)};
}

} // namespace port::simulator
