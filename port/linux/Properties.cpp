// SPDX-License-Identifier: Apache-2.0
#include "Properties.h"

#include <string_view>

namespace port::linux_backend {
namespace {

Variant child(const Variant& container, std::size_t index)
{
    return share(g_variant_get_child_value(container.get(), index));
}

// Of a text or an object path.
std::string textIn(const Variant& value)
{
    return g_variant_get_string(value.get(), nullptr);
}

Variant lookUp(const Variant& dictionary, const char* key)
{
    return share(g_variant_lookup_value(dictionary.get(), key, nullptr));
}

// "Modem" of "org.freedesktop.ModemManager1.Modem".
std::string shortName(const char* interface)
{
    const std::string_view name(interface);
    return std::string(name.substr(name.rfind('.') + 1));
}

} // namespace

Result<Variant> Properties::value(const char* name, const char* type, const char* noun) const
{
    const Variant found = lookUp(values_, name);
    if (!found)
        return notAvailable(std::string(name) + " is missing");
    if (!g_variant_is_of_type(found.get(), G_VARIANT_TYPE(type)))
        return notAvailable(std::string(name) + " is no " + noun);
    return found;
}

bool Properties::has(const char* name) const
{
    return lookUp(values_, name) != nullptr;
}

Result<bool> Properties::flag(const char* name) const
{
    const Result<Variant> found = value(name, "b", "truth value");
    if (!found)
        return found.error();
    return g_variant_get_boolean(found.value().get()) != FALSE;
}

Result<std::string> Properties::text(const char* name) const
{
    const Result<Variant> found = value(name, "s", "text");
    if (!found)
        return found.error();
    const std::string text = textIn(found.value());
    return text.empty() ? Result<std::string>(notAvailable(std::string(name) + " is empty")) : text;
}

Result<std::string> Properties::path(const char* name) const
{
    const Result<Variant> found = value(name, "o", "object path");
    if (!found)
        return found.error();
    return textIn(found.value());
}

Result<std::vector<std::string>> Properties::list(const char* name, const char* type,
                                                  const char* noun) const
{
    const Result<Variant> found = value(name, type, noun);
    if (!found)
        return found.error();
    std::vector<std::string> items;
    for (std::size_t i = 0; i < g_variant_n_children(found.value().get()); ++i)
        items.push_back(textIn(child(found.value(), i)));
    return items;
}

Result<std::vector<std::string>> Properties::texts(const char* name) const
{
    return list(name, "as", "list of texts");
}

Result<std::vector<std::string>> Properties::paths(const char* name) const
{
    return list(name, "ao", "list of object paths");
}

Result<std::uint32_t> Properties::number(const char* name) const
{
    const Result<Variant> found = value(name, "u", "number");
    if (!found)
        return found.error();
    return g_variant_get_uint32(found.value().get());
}

Result<std::int32_t> Properties::signedNumber(const char* name) const
{
    const Result<Variant> found = value(name, "i", "number");
    if (!found)
        return found.error();
    return g_variant_get_int32(found.value().get());
}

Result<std::uint32_t> Properties::numberOf(const char* name, std::uint32_t key) const
{
    const Result<Variant> found = value(name, "a{uu}", "table of numbers");
    if (!found)
        return found.error();
    for (std::size_t i = 0; i < g_variant_n_children(found.value().get()); ++i) {
        guint32 candidate = 0;
        guint32 number = 0;
        g_variant_get_child(found.value().get(), i, "{uu}", &candidate, &number);
        if (candidate == key)
            return number;
    }
    return notAvailable(std::string(name) + " lacks an entry");
}

Properties propertiesIn(const Variant& reply)
{
    return Properties(child(reply, 0));
}

bool Object::has(const char* interface) const
{
    return lookUp(interfaces_, interface) != nullptr;
}

Result<Properties> Object::properties(const char* interface) const
{
    const Variant found = lookUp(interfaces_, interface);
    if (!found)
        return notAvailable(path_ + " has no " + shortName(interface));
    return Properties(found);
}

Result<std::vector<Object>> objectsIn(const Variant& reply)
{
    const Variant all = child(reply, 0);
    const std::size_t count = g_variant_n_children(all.get());
    if (count > MOST_OBJECTS)
        return notAvailable("told of " + std::to_string(count) + " objects");
    std::vector<Object> objects;
    for (std::size_t i = 0; i < count; ++i) {
        const Variant entry = child(all, i);
        objects.emplace_back(textIn(child(entry, 0)), child(entry, 1));
    }
    return objects;
}

} // namespace port::linux_backend
