// SPDX-License-Identifier: Apache-2.0
#include "Settings.h"

#include <cstdlib>
#include <cstring>
#include <optional>
#include <utility>

#include <sys/utsname.h>

#include "Environment.h"
#include "Hostname1.h"
#include "Locale1.h"
#include "TextScaling.h"

namespace port::linux_backend {
namespace {

// language_REGION.codeset, without an @modifier; nothing for an empty text.
std::optional<std::string> localeName(const std::string& text)
{
    const std::string name = text.substr(0, text.find('@'));
    return name.empty() ? std::nullopt : std::optional<std::string>(name);
}

// The value among locale1's assignments, "LANG=de_DE.UTF-8".
std::optional<std::string> assigned(const std::vector<std::string>& locale,
                                    const std::string& variable)
{
    for (const std::string& assignment : locale)
        if (assignment.compare(0, variable.size() + 1, variable + "=") == 0)
            return localeName(assignment.substr(variable.size() + 1));
    return std::nullopt;
}

Result<Fact> languageOfMachine(Bus& bus)
{
    const Result<Properties> properties = bus.properties(LOCALE1);
    if (!properties)
        return properties.error();
    const Result<std::vector<std::string>> locale = properties.value().texts("Locale");
    if (!locale)
        return notAvailable("locale1: Locale is missing or no list of texts");
    for (const char* const variable : {"LC_MESSAGES", "LANG"})
        if (const auto name = assigned(locale.value(), variable))
            return Fact{*name, std::string("locale1 ") + variable};
    return notAvailable("locale1: Locale sets no language");
}

Result<Fact> languageOfProcess()
{
    if (hasMoreRightsThanItsCaller())
        return notAvailable("the environment is not read in a set-user-ID process");
    // In the order in which POSIX looks at them.
    for (const char* const variable : {"LC_ALL", "LC_MESSAGES", "LANG"}) {
        const char* const value = std::getenv(variable);
        if (const auto name = localeName(value != nullptr ? value : ""))
            return Fact{*name, std::string("environment ") + variable};
    }
    return notAvailable("LC_ALL, LC_MESSAGES and LANG are not set");
}

Result<Fact> hostNameOfKernel()
{
    struct utsname system = {};
    if (uname(&system) != 0 || *system.nodename == '\0' ||
        std::strcmp(system.nodename, "(none)") == 0) // what it says before anybody named it
        return notAvailable("the kernel has no host name");
    return Fact{system.nodename, "kernel host name"};
}

} // namespace

Result<Fact> LinuxSettings::deviceName()
{
    const Result<Fact> name = bus_.textProperty(HOSTNAME1, {"PrettyHostname", "StaticHostname"});
    return name ? name : orElse(name.error(), hostNameOfKernel());
}

Result<Fact> LinuxSettings::language()
{
    const Result<Fact> language = languageOfMachine(bus_);
    return language ? language : orElse(language.error(), languageOfProcess());
}

// Halfway between the steps that desktops offer: 1, 1.25, 1.5 and 2 times the usual size.
FontSize fontSizeOf(double textScaling)
{
    constexpr std::pair<double, FontSize> LIMITS[] = {
        {0.95, FontSize::Small},
        {1.125, FontSize::Normal},
        {1.375, FontSize::Large},
        {1.75, FontSize::Huge},
    };
    for (const auto& [limit, size] : LIMITS)
        if (textScaling < limit)
            return size;
    return FontSize::Giant;
}

Result<Sourced<FontSize>> LinuxSettings::fontSize()
{
    const Result<Sourced<double>> scaling = textScaling();
    if (!scaling)
        return scaling.error();
    return Sourced<FontSize>{fontSizeOf(scaling.value().value), scaling.value().source};
}

} // namespace port::linux_backend
