// SPDX-License-Identifier: Apache-2.0
// Prints the JSON Schema of device files, made of the rows that the reader goes by; with device
// files as arguments, prints what the reader says of each: a line with its mistake, empty when it
// has none.
#include <fstream>
#include <iostream>
#include <iterator>
#include <limits>
#include <map>

#include <nlohmann/json.hpp>

#include "devicefile/DeviceFile.h"
#include "devicefile/Schema.h"

using Json = nlohmann::ordered_json;
using namespace port::devicefile;

namespace {

const char NO_NUL[] = "^[^\\u0000]*$";
// One part of an error name, and how it goes on.
const char BUS_ERROR_NAME[] = "^[A-Za-z_][A-Za-z0-9_]*(\\.[A-Za-z_][A-Za-z0-9_]*)+$";

class Printer {
public:
    Json print()
    {
        Json sections = {{"schema", {{"const", 1}}}};
        for (const SectionRow* row = beginSections(); row != endSections(); ++row)
            sections[std::string(row->name)] = sectionOf(*row);
        Json all = {{"$schema", "http://json-schema.org/draft-07/schema#"},
                    {"title", "A simulated device"},
                    {"type", "object"},
                    {"required", {"schema"}},
                    {"additionalProperties", false},
                    {"properties", std::move(sections)},
                    {"definitions", Json::object()}};
        for (const auto& [errors, name] : names_)
            all["definitions"][name] = Json::parse(errors);
        return all;
    }

private:
    Json sectionOf(const SectionRow& row)
    {
        Json section = {{"type", "object"}};
        if (row.form == Form::Free) {
            section["additionalProperties"] = typeOf(row.name, *findKey(row, ""));
            return section;
        }
        section["additionalProperties"] = false;
        for (const std::string& key : keyNames(row))
            section["properties"][key] = typeOf(key, *findKey(row, key));
        return row.form == Form::List ? Json{{"type", "array"}, {"items", section}} : section;
    }

    Json typeOf(std::string_view key, const Type& type)
    {
        switch (type.kind) {
        case Type::Kind::Text:
            return textOf(type);
        case Type::Kind::Digits:
            return {{"type", "string"},
                    {"pattern", "^[0-9]{" + std::to_string(type.least) + "," +
                                    std::to_string(type.most) + "}$"}};
        case Type::Kind::Number:
            return {{"type", "string"}, {"pattern", "^(\\+?[0-9*#]{1,20}|null)$"}};
        case Type::Kind::Switch:
            return {{"type", "boolean"}};
        case Type::Kind::Whole:
            return wholeNumber(type);
        case Type::Kind::Name:
            return type.most < type.least ? namesOf(type)
                                          : Json{{"anyOf", {namesOf(type), wholeNumber(type)}}};
        case Type::Kind::Changes: // paths are the reader's to judge
            return {{"type", "object"}};
        case Type::Kind::Paths:
            return {{"type", "array"}, {"items", {{"type", "string"}}}};
        case Type::Kind::Fault:
        case Type::Kind::BusFault:
            break;
        }
        return faultOf(errorsOf(key, type));
    }

    // A schema counts characters, which may be several bytes each.
    static Json textOf(const Type& type)
    {
        Json text = {{"type", "string"}, {"minLength", type.least}, {"pattern", NO_NUL}};
        if (type.most >= type.least)
            text["maxLength"] = type.most;
        return text;
    }

    static Json wholeNumber(const Type& type)
    {
        Json number = {{"type", "integer"}, {"minimum", type.least}};
        if (type.most < std::numeric_limits<int>::max())
            number["maximum"] = type.most;
        return number;
    }

    static Json namesOf(const Type& type)
    {
        Json names = Json::array();
        for (const Name& row : type.names)
            names.push_back(row.name);
        return {{"enum", names}};
    }

    // Errors that several functions have stand in one place, under the name of the first one.
    Json errorsOf(std::string_view function, const Type& type)
    {
        Json errors = namesOf(type);
        if (type.kind == Type::Kind::BusFault)
            errors = {{"anyOf", {errors, {{"type", "string"}, {"pattern", BUS_ERROR_NAME}}}}};
        const auto found =
            names_.try_emplace(errors.dump(), "errors of " + std::string(function)).first;
        return {{"$ref", "#/definitions/" + escaped(found->second)}};
    }

    // As a part of a URI.
    static std::string escaped(std::string text)
    {
        for (std::size_t at = 0; (at = text.find(' ')) != std::string::npos;)
            text.replace(at, 1, "%20");
        return text;
    }

    Json faultOf(const Json& errors)
    {
        Json keys = {{"error", errors}};
        for (const std::string& key : faultKeyNames())
            keys[key] = typeOf(key, *findFaultKey(key));
        const Json error = {{"required", {"error"}}};
        const Json delay = {{"required", {"delay_ms"}}};
        const Json table = {{"type", "object"},
                            {"additionalProperties", false},
                            {"properties", keys},
                            {"anyOf", {error, delay}}};
        return {{"anyOf", {errors, table}}};
    }

    std::map<std::string, std::string> names_; // of definitions, by what they hold
};

std::string problemOf(const char* path)
{
    std::ifstream file(path, std::ios::binary);
    const std::string text{std::istreambuf_iterator<char>(file), {}};
    const auto device = parseDevice(text, path);
    return device ? "" : device.error().reason;
}

} // namespace

int main(int count, char** arguments)
{
    if (count == 1)
        std::cout << Printer().print().dump(1) << "\n";
    for (int i = 1; i < count; ++i)
        std::cout << problemOf(arguments[i]) << "\n";
    return std::cout.flush() ? 0 : 1;
}
