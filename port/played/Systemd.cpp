// SPDX-License-Identifier: Apache-2.0
// systemd's services of host name and locale.
#include <algorithm>

#include "Service.h"

namespace port::played {
namespace {

constexpr char HOSTNAME[] = "org.freedesktop.hostname1";
constexpr char LOCALE[] = "org.freedesktop.locale1";
constexpr char INVALID[] = "org.freedesktop.DBus.Error.InvalidArgs";
constexpr char LANG[] = "LANG=";

World hostname(const Scene& scene)
{
    const Facts& facts = scene.facts;
    const bool isNamed = !facts.hostName.empty();
    return {{"/org/freedesktop/hostname1",
             {face(HOSTNAME, {{"Hostname", textOf(isNamed ? facts.hostName : "localhost")},
                              {"StaticHostname", textOf(facts.hostName)},
                              {"PrettyHostname", textOf(facts.deviceName)},
                              {"HostnameSource", textOf(isNamed ? "static" : "default")},
                              {"OperatingSystemPrettyName", textOf(facts.platform)},
                              {"HardwareModel", textOf(facts.modelName)}})}}};
}

World locale(const Scene& scene)
{
    std::vector<std::string> all;
    if (!scene.facts.language.empty())
        all.push_back(LANG + scene.facts.language);
    return {{"/org/freedesktop/locale1", {face(LOCALE, {{"Locale", texts(all)}})}}};
}

const char* firstText(const Request& request)
{
    const char* text = nullptr;
    g_variant_get_child(request.arguments, 0, "&s", &text);
    return text;
}

Outcome setText(const char* path, const std::string& text)
{
    return Outcome::change({text.empty() ? unset(path) : set(path, text.c_str())});
}

// Labels of letters, digits and hyphens, with dots between them (hostname(5)).
bool isHostName(const std::string& name)
{
    const auto isBad = [](char c) { return g_ascii_isalnum(c) == FALSE && c != '-' && c != '.'; };
    return name.size() <= 64 && std::none_of(name.begin(), name.end(), isBad) &&
           name.find("..") == std::string::npos &&
           (name.empty() || (g_ascii_isalnum(name.front()) && g_ascii_isalnum(name.back())));
}

Outcome setStatic(const Request& request)
{
    const std::string name = firstText(request);
    if (!isHostName(name))
        return Outcome::refuse(INVALID, "Invalid static hostname '" + name + "'");
    return setText("settings.host_name", name);
}

Outcome setPretty(const Request& request)
{
    const std::string name = firstText(request);
    if (std::any_of(name.begin(), name.end(), [](char c) { return g_ascii_iscntrl(c); }))
        return Outcome::refuse(INVALID, "Invalid pretty hostname '" + name + "'");
    return setText("settings.device_name", name);
}

Outcome serial(const Request& request)
{
    if (request.scene.facts.serial.empty())
        return Outcome::refuse("org.freedesktop.DBus.Error.FileNotFound",
                               "No such file or directory");
    return Outcome::answer(g_variant_new("(s)", request.scene.facts.serial.c_str()));
}

// One assignment is what a device file can hold.
Outcome setLocale(const Request& request)
{
    const Owned<GVariant> all(g_variant_get_child_value(request.arguments, 0));
    std::string language;
    for (std::size_t i = 0; i < g_variant_n_children(all.get()); ++i) {
        const char* text = nullptr;
        g_variant_get_child(all.get(), i, "&s", &text);
        const std::string assignment = text;
        if (assignment.rfind(LANG, 0) != 0)
            return Outcome::refuse(INVALID,
                                   "Locale assignment " + assignment + " not valid, refusing.");
        language = assignment.substr(sizeof LANG - 1);
        if (language.find_first_of(" \t\n/=") != std::string::npos)
            return Outcome::refuse(
                INVALID, "Can not enable locale generation for invalid locale: " + language);
    }
    return setText("settings.language", language);
}

Outcome refuseInSystemd(const Request& request)
{
    if (request.member == "GetProductUUID")
        return Outcome::refuse("org.freedesktop.hostname1.NoProductUUID",
                               "Failed to read product UUID from firmware.");
    return Outcome::refuse("org.freedesktop.DBus.Error.AccessDenied", "Permission denied");
}

} // namespace

const Role& hostname1()
{
    static const Role service = {"hostname1",
                                 HOSTNAME,
                                 nullptr,
                                 hostname,
                                 nullptr,
                                 {{HOSTNAME, "SetStaticHostname", setStatic},
                                  {HOSTNAME, "SetPrettyHostname", setPretty},
                                  {HOSTNAME, "GetHardwareSerial", serial}},
                                 {},
                                 {},
                                 {},
                                 refuseInSystemd,
                                 false};
    return service;
}

const Role& locale1()
{
    static const Role service = {
        "locale1", LOCALE, nullptr, locale,          nullptr, {{LOCALE, "SetLocale", setLocale}},
        {},        {},     {},      refuseInSystemd, false};
    return service;
}

} // namespace port::played
