// SPDX-License-Identifier: Apache-2.0
#include "BusMessage.h"

#include <algorithm>

namespace port::linux_backend {
namespace {

// The cost of an entry of a list or a table beside its text.
constexpr std::size_t ENTRY_BYTES = 64;

bool isWanted(const std::string& interface, Names wanted)
{
    return wanted.size() == 0 || std::find(wanted.begin(), wanted.end(), interface) != wanted.end();
}

} // namespace

bool MessageReader::tooMany(const char* noun, std::size_t limit)
{
    problem_ = "told of more than " + std::to_string(limit) + " " + noun;
    return false;
}

bool MessageReader::isRoomFor(std::size_t bytes)
{
    bytes_ += bytes;
    return bytes_ <= MOST_BYTES || tooMany("bytes", MOST_BYTES);
}

template <typename T>
bool MessageReader::basic(char type, T& value)
{
    return sd_bus_message_read_basic(message_, type, &value) > 0;
}

bool MessageReader::text(std::string& text, char type)
{
    const char* found = nullptr;
    if (!basic(type, found))
        return false;
    text = found;
    return isRoomFor(text.size());
}

// The elements of an array.
template <typename Read>
bool MessageReader::each(const char* type, Read read)
{
    if (sd_bus_message_enter_container(message_, SD_BUS_TYPE_ARRAY, type) <= 0)
        return false;
    while (sd_bus_message_at_end(message_, 0) == 0)
        if (!isRoomFor(ENTRY_BYTES) || !read())
            return false;
    return sd_bus_message_exit_container(message_) > 0;
}

bool MessageReader::texts(std::vector<std::string>& texts)
{
    return each("s", [&] {
        texts.emplace_back();
        return text(texts.back());
    });
}

bool MessageReader::numbers(std::map<std::uint32_t, std::uint32_t>& numbers)
{
    return each("{uu}", [&] {
        std::uint32_t key = 0;
        std::uint32_t number = 0;
        if (sd_bus_message_read(message_, "{uu}", &key, &number) <= 0)
            return false;
        numbers.emplace(key, number);
        return true;
    });
}

bool MessageReader::numberAndFlag(std::pair<std::uint32_t, bool>& both)
{
    int flag = 0; // as sd-bus has it
    const bool good = sd_bus_message_read(message_, "(ub)", &both.first, &flag) > 0;
    both.second = flag != 0;
    return good;
}

bool MessageReader::bytes(std::vector<std::uint8_t>& bytes)
{
    const void* data = nullptr;
    std::size_t size = 0;
    if (sd_bus_message_read_array(message_, SD_BUS_TYPE_BYTE, &data, &size) < 0 || !isRoomFor(size))
        return false;
    const auto* const begin = static_cast<const std::uint8_t*>(data);
    bytes.assign(begin, begin + size);
    return true;
}

bool MessageReader::contents(const std::string& type, Value& value)
{
    if (type == "b") {
        int flag = 0; // as sd-bus has it
        const bool good = basic('b', flag);
        value = flag != 0;
        return good;
    }
    if (type == "u")
        return basic('u', value.emplace<std::uint32_t>());
    if (type == "i")
        return basic('i', value.emplace<std::int32_t>());
    if (type == "y")
        return basic('y', value.emplace<std::uint8_t>());
    if (type == "s")
        return text(value.emplace<std::string>());
    if (type == "o")
        return text(value.emplace<ObjectPath>().text, SD_BUS_TYPE_OBJECT_PATH);
    if (type == "as")
        return texts(value.emplace<std::vector<std::string>>());
    if (type == "ay")
        return bytes(value.emplace<std::vector<std::uint8_t>>());
    if (type == "(ub)")
        return numberAndFlag(value.emplace<std::pair<std::uint32_t, bool>>());
    if (type == "a{uu}")
        return numbers(value.emplace<std::map<std::uint32_t, std::uint32_t>>());
    if (type == "ao") {
        auto& paths = value.emplace<std::vector<ObjectPath>>();
        return each("o", [&] {
            paths.emplace_back();
            return text(paths.back().text, SD_BUS_TYPE_OBJECT_PATH);
        });
    }
    value = OtherValue();
    return sd_bus_message_skip(message_, type.c_str()) >= 0;
}

bool MessageReader::value(Value& value)
{
    const char* type = nullptr;
    if (sd_bus_message_peek_type(message_, nullptr, &type) <= 0 || type == nullptr)
        return false;
    const std::string content = type;
    return sd_bus_message_enter_container(message_, SD_BUS_TYPE_VARIANT, content.c_str()) > 0 &&
           contents(content, value) && sd_bus_message_exit_container(message_) > 0;
}

bool MessageReader::properties(PropertyMap& properties)
{
    return each("{sv}", [&] {
        std::string name;
        if (sd_bus_message_enter_container(message_, SD_BUS_TYPE_DICT_ENTRY, "sv") <= 0 ||
            !text(name) || !value(properties[name]))
            return false;
        if (properties.size() > MOST_PROPERTIES)
            return tooMany("properties", MOST_PROPERTIES);
        return sd_bus_message_exit_container(message_) > 0;
    });
}

bool MessageReader::interfaces(Interfaces& interfaces, Names wanted)
{
    return each("{sa{sv}}", [&] {
        std::string name;
        if (sd_bus_message_enter_container(message_, SD_BUS_TYPE_DICT_ENTRY, "sa{sv}") <= 0 ||
            !text(name))
            return false;
        if (!isWanted(name, wanted))
            return sd_bus_message_skip(message_, "a{sv}") >= 0 &&
                   sd_bus_message_exit_container(message_) > 0;
        PropertyMap found;
        if (!properties(found))
            return false;
        interfaces[name] = std::make_shared<const PropertyMap>(std::move(found));
        return sd_bus_message_exit_container(message_) > 0;
    });
}

bool MessageReader::objects(Tree& objects, Names wanted)
{
    std::size_t count = 0;
    return each("{oa{sa{sv}}}", [&] {
        std::string path;
        if (++count > MOST_OBJECTS)
            return tooMany("objects", MOST_OBJECTS);
        return sd_bus_message_enter_container(message_, SD_BUS_TYPE_DICT_ENTRY, "oa{sa{sv}}") > 0 &&
               text(path, SD_BUS_TYPE_OBJECT_PATH) && interfaces(objects[path], wanted) &&
               sd_bus_message_exit_container(message_) > 0;
    });
}

} // namespace port::linux_backend
