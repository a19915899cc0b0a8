// SPDX-License-Identifier: Apache-2.0
#include "DeviceFile.h"

#include <cerrno>
#include <cstring>

#include <fcntl.h>
#include <sys/stat.h>
#include <toml++/toml.h>
#include <unistd.h>

namespace port::simulator {
namespace {

constexpr long SCHEMA = 1;
constexpr std::size_t SIZE_LIMIT = 1024 * 1024;

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

std::string quoted(std::string_view name)
{
    return "\"" + std::string(name) + "\"";
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

Error unreadable(const std::string& path, const std::string& why)
{
    return notAvailable(path + ": " + why);
}

struct Descriptor {
    const int number;
    ~Descriptor()
    {
        if (number >= 0)
            close(number);
    }
};

Result<std::string> readDeviceFile(const std::string& path)
{
    // Does not wait when somebody names a pipe.
    const Descriptor file{open(path.c_str(), O_RDONLY | O_CLOEXEC | O_NONBLOCK)};
    struct stat status = {};
    if (file.number < 0 || fstat(file.number, &status) != 0)
        return unreadable(path, std::strerror(errno));
    if (S_ISDIR(status.st_mode))
        return unreadable(path, std::strerror(EISDIR));
    if (!S_ISREG(status.st_mode))
        return unreadable(path, "not a regular file");

    std::string text(SIZE_LIMIT + 1, '\0');
    std::size_t size = 0;
    while (size < text.size()) {
        const ssize_t step = read(file.number, text.data() + size, text.size() - size);
        if (step < 0)
            return unreadable(path, std::strerror(errno));
        if (step == 0)
            break;
        size += static_cast<std::size_t>(step);
    }
    if (size > SIZE_LIMIT)
        return unreadable(path, "larger than 1 MiB, which no device file is");
    text.resize(size);
    return text;
}

} // namespace

Result<Device> parseDevice(const std::string& text, const std::string& path)
{
    try {
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
    const Result<std::string> text = readDeviceFile(path_);
    if (!text)
        return text.error();
    const std::lock_guard<std::mutex> lock(mutex_);
    if (parsed_ == nullptr || parsedText_ != text.value()) {
        const Result<Device> fresh = parseDevice(text.value(), path_);
        if (!fresh)
            return fresh.error();
        parsed_ = std::make_shared<const Device>(fresh.value());
        parsedText_ = text.value();
    }
    return parsed_;
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
