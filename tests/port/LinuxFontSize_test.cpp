// SPDX-License-Identifier: Apache-2.0
// The size of texts, from a made-up setting of the desktop.
#include <cstdlib>

#include <gmock/gmock.h>

#include "linux/Settings.h"
#include "support/Child.h"
#include "support/Program.h"
#include "support/TemporaryTree.h"

using port::FontSize;
using port::linux_backend::Bus;
using port::linux_backend::fontSizeOf;
using port::linux_backend::LinuxSettings;

namespace {

const char SOURCE[] = "GSettings org.gnome.desktop.interface text-scaling-factor";

std::string schema(const std::string& key)
{
    return "<schemalist><schema id='org.gnome.desktop.interface' "
           "path='/org/gnome/desktop/interface/'>" +
           key + "</schema></schemalist>";
}

const std::string FACTOR = schema("<key name='text-scaling-factor' type='d'>"
                                  "<range min='0.5' max='3.0'/><default>1.0</default></key>");

// GLib looks at its surroundings once in a process, so each question is asked by a child.
class LinuxFontSizeTest : public testing::Test {
protected:
    void install(const std::string& schemaText)
    {
        tree.write("/schemas/test.gschema.xml", schemaText);
        outputOf("glib-compile-schemas --strict '" + tree.path("/schemas") + "'");
    }
    void set(const std::string& factor)
    {
        tree.write("/config/glib-2.0/settings/keyfile",
                   "[org/gnome/desktop/interface]\ntext-scaling-factor=" + factor + "\n");
    }
    std::string ask()
    {
        return inChild([this] {
            setenv("GSETTINGS_SCHEMA_DIR", tree.path("/schemas").c_str(), 1);
            setenv("XDG_DATA_DIRS", tree.path("/none").c_str(), 1);
            setenv("XDG_DATA_HOME", tree.path("/none").c_str(), 1);
            setenv("XDG_CONFIG_HOME", tree.path("/config").c_str(), 1);
            setenv("GSETTINGS_BACKEND", "keyfile", 1);
            Bus bus;
            const auto answer = LinuxSettings(bus).fontSize();
            return answer ? std::to_string(static_cast<int>(answer.value().value)) + " <" +
                                answer.value().source + ">"
                          : "error: " + answer.error().reason;
        });
    }
    static std::string size(FontSize size)
    {
        return std::to_string(static_cast<int>(size)) + " <" + SOURCE + ">";
    }
    static std::string missing(const std::string& what)
    {
        return std::string("error: ") + SOURCE + ": " + what;
    }

    const TemporaryTree tree;
};

TEST_F(LinuxFontSizeTest, FactorOfTheDesktopIsASize)
{
    install(FACTOR);
    EXPECT_EQ(size(FontSize::Normal), ask()); // as the schema says
    set("1.5");
    EXPECT_EQ(size(FontSize::Huge), ask());
    set("0.75");
    EXPECT_EQ(size(FontSize::Small), ask());
}

TEST_F(LinuxFontSizeTest, MalformedFactorIsTheUsualOne)
{
    install(FACTOR);
    for (const char* const factor : {"'large'", "9.5", "-1.0", "nan", "{", ""}) {
        set(factor);
        EXPECT_EQ(size(FontSize::Normal), ask()) << factor;
    }
}

TEST_F(LinuxFontSizeTest, MachineWithoutTheSettingHasNoFontSize)
{
    EXPECT_EQ(missing("the schema is not installed"), ask());
    install(schema("<key name='other' type='d'><default>1.0</default></key>"));
    EXPECT_EQ(missing("the schema has no such key"), ask());
    install(schema("<key name='text-scaling-factor' type='s'><default>''</default></key>"));
    EXPECT_EQ(missing("the schema has a key of another type"), ask());
    install("<schemalist><schema id='org.gnome.desktop.interface'>"
            "<key name='text-scaling-factor' type='d'><default>1.0</default></key>"
            "</schema></schemalist>");
    EXPECT_EQ(missing("the schema has no such key"), ask());
}

TEST_F(LinuxFontSizeTest, LimitsLieBetweenTheStepsOfDesktops)
{
    const std::pair<double, FontSize> rows[] = {
        {0.5, FontSize::Small},  {0.9, FontSize::Small},  {0.95, FontSize::Normal},
        {1.0, FontSize::Normal}, {1.1, FontSize::Normal}, {1.125, FontSize::Large},
        {1.25, FontSize::Large}, {1.375, FontSize::Huge}, {1.5, FontSize::Huge},
        {1.75, FontSize::Giant}, {2.0, FontSize::Giant},  {3.0, FontSize::Giant},
    };
    for (const auto& [factor, expected] : rows)
        EXPECT_EQ(expected, fontSizeOf(factor)) << factor;
}

} // namespace
