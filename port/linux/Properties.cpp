// SPDX-License-Identifier: Apache-2.0
#include "Properties.h"

#include <algorithm>
#include <string_view>

namespace port::linux_backend {
namespace {

// "Modem" of "org.freedesktop.ModemManager1.Modem".
std::string shortName(const char* interface)
{
    const std::string_view name(interface);
    return std::string(name.substr(name.rfind('.') + 1));
}

template <typename T>
Result<T> copied(const Result<const T*>& found)
{
    return found ? Result<T>(*found.value()) : found.error();
}

} // namespace

template <typename T>
Result<const T*> Properties::value(const char* name, const char* noun) const
{
    const auto found = values_->find(name);
    if (found == values_->end())
        return notAvailable(std::string(name) + " is missing");
    if (const T* const typed = std::get_if<T>(&found->second))
        return typed;
    return notAvailable(std::string(name) + " is no " + noun);
}

bool Properties::has(const char* name) const
{
    return values_->count(name) != 0;
}

Result<bool> Properties::flag(const char* name) const
{
    return copied(value<bool>(name, "truth value"));
}

Result<std::string> Properties::text(const char* name) const
{
    const auto found = copied(value<std::string>(name, "text"));
    return found && found.value().empty() ? notAvailable(std::string(name) + " is empty") : found;
}

Result<std::string> Properties::path(const char* name) const
{
    const auto found = value<ObjectPath>(name, "object path");
    return found ? Result<std::string>(found.value()->text) : found.error();
}

Result<std::vector<std::string>> Properties::texts(const char* name) const
{
    return copied(value<std::vector<std::string>>(name, "list of texts"));
}

Result<std::vector<std::string>> Properties::paths(const char* name) const
{
    const auto found = value<std::vector<ObjectPath>>(name, "list of object paths");
    if (!found)
        return found.error();
    std::vector<std::string> texts;
    for (const ObjectPath& path : *found.value())
        texts.push_back(path.text);
    return texts;
}

Result<std::uint32_t> Properties::number(const char* name) const
{
    return copied(value<std::uint32_t>(name, "number"));
}

Result<std::int32_t> Properties::signedNumber(const char* name) const
{
    return copied(value<std::int32_t>(name, "number"));
}

Result<std::pair<std::uint32_t, bool>> Properties::numberAndFlag(const char* name) const
{
    return copied(value<std::pair<std::uint32_t, bool>>(name, "number with a truth value"));
}

Result<std::vector<std::uint8_t>> Properties::bytes(const char* name) const
{
    return copied(value<std::vector<std::uint8_t>>(name, "list of bytes"));
}

Result<std::uint32_t> Properties::numberOf(const char* name, std::uint32_t key) const
{
    const auto found = value<std::map<std::uint32_t, std::uint32_t>>(name, "table of numbers");
    if (!found)
        return found.error();
    const auto entry = found.value()->find(key);
    return entry != found.value()->end() ? Result<std::uint32_t>(entry->second)
                                         : notAvailable(std::string(name) + " lacks an entry");
}

bool Object::has(const char* interface) const
{
    return interfaces_.count(interface) != 0;
}

Result<Properties> Object::properties(const char* interface) const
{
    const auto found = interfaces_.find(interface);
    if (found == interfaces_.end())
        return notAvailable(path_ + " has no " + shortName(interface));
    return Properties(found->second);
}

} // namespace port::linux_backend
