// SPDX-License-Identifier: Apache-2.0
#include "Settings.h"

#include <cstdlib>
#include <optional>

#include <sys/utsname.h>

#include "Hostname1.h"
#include "Locale1.h"

namespace port::linux_backend {
namespace {

// language_REGION.codeset, without an @modifier; nothing for an empty text.
std::optional<std::string> localeName(const std::string& text)
{
    const std::string name = text.substr(0, text.find('@'));
    return name.empty() ? std::nullopt : std::optional<std::string>(name);
}

// The language among locale1's assignments, "LANG=de_DE.UTF-8".
std::optional<Fact> languageOf(const Variant& properties)
{
    const Owned<GVariant> locale(
        g_variant_lookup_value(properties.get(), "Locale", G_VARIANT_TYPE_STRING_ARRAY));
    if (!locale)
        return std::nullopt;
    for (const std::string variable : {"LC_MESSAGES", "LANG"}) {
        for (std::size_t i = 0; i < g_variant_n_children(locale.get()); ++i) {
            const Owned<GVariant> item(g_variant_get_child_value(locale.get(), i));
            const std::string assignment = g_variant_get_string(item.get(), nullptr);
            if (assignment.compare(0, variable.size() + 1, variable + "=") != 0)
                continue;
            if (const auto name = localeName(assignment.substr(variable.size() + 1)))
                return Fact{*name, "locale1 " + variable};
        }
    }
    return std::nullopt;
}

} // namespace

Result<Fact> LinuxSettings::deviceName()
{
    const Result<Variant> properties = bus_.properties(HOSTNAME1);
    if (properties) {
        for (const char* const property : {"PrettyHostname", "StaticHostname"}) {
            const Result<std::string> name = textProperty(properties.value(), property);
            if (name)
                return Fact{name.value(), std::string("hostname1 ") + property};
        }
    }
    struct utsname system = {};
    // "(none)" is what the kernel says before anybody named the machine.
    if (uname(&system) == 0 && *system.nodename != '\0' && std::string(system.nodename) != "(none)")
        return Fact{system.nodename, "kernel host name"};
    return notAvailable("no host name from hostname1 or the kernel");
}

Result<Fact> LinuxSettings::language()
{
    const Result<Variant> properties = bus_.properties(LOCALE1);
    if (properties) {
        const std::optional<Fact> language = languageOf(properties.value());
        if (language)
            return *language;
    }
    // In the order in which POSIX looks at them.
    for (const char* const variable : {"LC_ALL", "LC_MESSAGES", "LANG"}) {
        const char* const value = std::getenv(variable);
        if (const auto name = localeName(value != nullptr ? value : ""))
            return Fact{*name, std::string("environment ") + variable};
    }
    return notAvailable("no locale from locale1, LC_ALL, LC_MESSAGES or LANG");
}

} // namespace port::linux_backend
