// SPDX-License-Identifier: Apache-2.0
// Reads the properties of a service's objects without trusting it: a property that is missing or of
// another type is an error that names it.
#ifndef PORT_LINUX_PROPERTIES_H
#define PORT_LINUX_PROPERTIES_H

#include <cstdint>
#include <map>
#include <memory>
#include <string>
#include <utility>
#include <variant>
#include <vector>

#include "../backend/Result.h"

namespace port::linux_backend {

struct ObjectPath {
    std::string text;
};
inline bool operator==(const ObjectPath& a, const ObjectPath& b)
{
    return a.text == b.text;
}

// The value of a property; of the types that no question needs only that it is there is kept.
struct OtherValue {};
inline bool operator==(const OtherValue&, const OtherValue&)
{
    return true;
}
using Value = std::variant<OtherValue, bool, std::int32_t, std::uint32_t, std::string, ObjectPath,
                           std::vector<std::string>, std::vector<ObjectPath>,
                           std::map<std::uint32_t, std::uint32_t>, std::uint8_t,
                           std::vector<std::uint8_t>, std::pair<std::uint32_t, bool>>;
using PropertyMap = std::map<std::string, Value>;

// The properties of one interface of an object.
class Properties {
public:
    explicit Properties(std::shared_ptr<const PropertyMap> values) : values_(std::move(values)) {}

    bool has(const char* name) const;
    Result<bool> flag(const char* name) const;
    /// A text that is not empty.
    Result<std::string> text(const char* name) const;
    Result<std::vector<std::string>> texts(const char* name) const;
    Result<std::string> path(const char* name) const;
    Result<std::vector<std::string>> paths(const char* name) const;
    Result<std::uint32_t> number(const char* name) const;
    Result<std::int32_t> signedNumber(const char* name) const;
    Result<std::pair<std::uint32_t, bool>> numberAndFlag(const char* name) const;
    Result<std::vector<std::uint8_t>> bytes(const char* name) const;
    /// The value of one key in a table of numbers.
    Result<std::uint32_t> numberOf(const char* name, std::uint32_t key) const;

private:
    template <typename T>
    Result<const T*> value(const char* name, const char* noun) const;

    std::shared_ptr<const PropertyMap> values_;
};

// The interfaces of an object, and all objects of a service by their paths. What was handed out
// never changes: a change makes another map.
using Interfaces = std::map<std::string, std::shared_ptr<const PropertyMap>>;
using Tree = std::map<std::string, Interfaces>;
using Objects = std::shared_ptr<const Tree>;

// An object and those of its interfaces that it has at the moment.
class Object {
public:
    Object(std::string path, Interfaces interfaces)
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
    Interfaces interfaces_;
};

} // namespace port::linux_backend

#endif
