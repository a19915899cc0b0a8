// SPDX-License-Identifier: Apache-2.0
#include "Interfaces.h"

#include <sstream>

namespace port::played {
namespace {

std::string arguments(const std::string& signature, const char* direction)
{
    std::string xml;
    const Owned<char> tuple(g_strdup_printf("(%s)", signature.c_str()));
    const auto* type = g_variant_type_first(G_VARIANT_TYPE(tuple.get()));
    for (; type != nullptr; type = g_variant_type_next(type)) {
        const std::string one(g_variant_type_peek_string(type),
                              g_variant_type_get_string_length(type));
        xml += "<arg type='" + one + "'" + direction + "/>";
    }
    return xml;
}

// Without the parentheses around all of it.
std::string inner(const std::string& text)
{
    return text.size() < 2 ? "" : text.substr(1, text.size() - 2);
}

// Reads the members of one interface.
class Description {
public:
    explicit Description(const std::string& name) : xml_("<node><interface name='" + name + "'>") {}

    void add(const std::string& line)
    {
        std::istringstream words(line);
        std::string first;
        std::string second;
        std::string third;
        words >> first >> second >> third;
        if (first == "signal")
            xml_ += "<signal name='" + second + "'>" + arguments(inner(third), "") + "</signal>";
        else if (second.front() == '(' && (third.empty() || third == "->"))
            addMethod(first, second, words);
        else
            addProperty(first, second, third, line.substr(line.find(" = ") + 3));
    }

    Interface end() const
    {
        GDBusNodeInfo* const node =
            g_dbus_node_info_new_for_xml((xml_ + "</interface></node>").c_str(), nullptr);
        GDBusInterfaceInfo* const info = g_dbus_interface_info_ref(node->interfaces[0]);
        g_dbus_interface_info_cache_build(info);
        g_dbus_node_info_unref(node);
        return {info, defaults_};
    }

private:
    void addMethod(const std::string& name, const std::string& in, std::istringstream& words)
    {
        std::string out;
        words >> out;
        xml_ += "<method name='" + name + "'>" + arguments(inner(in), " direction='in'") +
                arguments(inner(out), " direction='out'") + "</method>";
    }

    void addProperty(const std::string& name, const std::string& type, const std::string& access,
                     const std::string& value)
    {
        xml_ += "<property name='" + name + "' type='" + type + "' access='" +
                (access == "rw" ? "readwrite" : "read") + "'/>";
        defaults_[name] = share(g_variant_ref_sink(g_variant_parse(
            G_VARIANT_TYPE(type.c_str()), value.c_str(), nullptr, nullptr, nullptr)));
    }

    std::string xml_;
    Values defaults_;
};

void readAll(const char* text, std::map<std::string, Interface>& all)
{
    constexpr char BEGIN[] = "interface ";
    std::istringstream lines(text);
    std::string line;
    while (std::getline(lines, line)) {
        const std::string name = line.substr(sizeof BEGIN - 1);
        Description description(name);
        while (std::getline(lines, line) && !line.empty())
            description.add(line);
        all.emplace(name, description.end());
    }
}

std::map<std::string, Interface> readEverything()
{
    std::map<std::string, Interface> all;
    for (const char* const text : {MODEM_MANAGER_INTERFACES, NETWORK_MANAGER_INTERFACES,
                                   BLUEZ_INTERFACES, SYSTEMD_INTERFACES})
        readAll(text, all);
    return all;
}

} // namespace

const Interface& interfaceOf(const std::string& name)
{
    static const std::map<std::string, Interface> all = readEverything();
    return all.at(name);
}

} // namespace port::played
