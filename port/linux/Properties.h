// SPDX-License-Identifier: Apache-2.0
// What a service tells of its objects, read without trusting it: a property that is missing or of
// another type is an error that names it.
#ifndef PORT_LINUX_PROPERTIES_H
#define PORT_LINUX_PROPERTIES_H

#include <cstdint>
#include <string>
#include <utility>
#include <vector>

#include "../backend/Result.h"
#include "../common/GLibTypes.h"

namespace port::linux_backend {

// The properties of one interface of an object.
class Properties {
public:
    /// `values` is an a{sv}.
    explicit Properties(Variant values) : values_(std::move(values)) {}

    bool has(const char* name) const;
    Result<bool> flag(const char* name) const;
    /// A text that is not empty.
    Result<std::string> text(const char* name) const;
    Result<std::vector<std::string>> texts(const char* name) const;
    Result<std::string> path(const char* name) const;
    Result<std::vector<std::string>> paths(const char* name) const;
    Result<std::uint32_t> number(const char* name) const;
    Result<std::int32_t> signedNumber(const char* name) const;
    /// The value of one key in a table of numbers.
    Result<std::uint32_t> numberOf(const char* name, std::uint32_t key) const;

private:
    Result<Variant> value(const char* name, const char* type, const char* noun) const;
    Result<std::vector<std::string>> list(const char* name, const char* type,
                                          const char* noun) const;

    Variant values_;
};

/// The properties in the reply of GetAll, (a{sv}).
Properties propertiesIn(const Variant& reply);

// An object and those of its interfaces that it has at the moment.
class Object {
public:
    /// `interfaces` is an a{sa{sv}}.
    Object(std::string path, Variant interfaces)
        : path_(std::move(path)), interfaces_(std::move(interfaces))
    {
    }

    const std::string& path() const
    {
        return path_;
    }
    bool has(const char* interface) const;
    Result<Properties> properties(const char* interface) const;

private:
    std::string path_;
    Variant interfaces_;
};

/// More objects than this are not believed.
constexpr std::size_t MOST_OBJECTS = 1000;

/// The objects in the reply of GetManagedObjects, (a{oa{sa{sv}}}).
Result<std::vector<Object>> objectsIn(const Variant& reply);

} // namespace port::linux_backend

#endif
