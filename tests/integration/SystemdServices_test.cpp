// SPDX-License-Identifier: Apache-2.0
// The real host name and locale services, started by a private bus, with an /etc and a host name of
// their own.
#include <cstdlib>

#include <gmock/gmock.h>
#include <unistd.h>

#include "linux/Bus.h"
#include "linux/Hostname1.h"
#include "linux/Locale1.h"
#include "linux/Settings.h"
#include "support/Answer.h"
#include "support/Child.h"
#include "support/PrivateBus.h"
#include "support/Together.h"

using port::linux_backend::Bus;
using port::linux_backend::HOSTNAME1;
using port::linux_backend::LinuxSettings;
using port::linux_backend::LOCALE1;

namespace {

const char HOSTNAMED[] = "/lib/systemd/systemd-hostnamed";
const char LOCALED[] = "/lib/systemd/systemd-localed";

class SystemdServicesTest : public testing::Test {
protected:
    void SetUp() override
    {
        if (access(HOSTNAMED, X_OK) != 0 || access(LOCALED, X_OK) != 0)
            GTEST_SKIP() << "needs systemd-hostnamed and systemd-localed (package systemd)";
        if (!canHavePrivateMounts())
            GTEST_SKIP()
                << "needs a mount namespace, so that the machine's own /etc stays as it is";
        for (const char* const variable : {"LC_ALL", "LC_MESSAGES", "LANG"})
            unsetenv(variable);
        etc.write("/passwd", "root:x:0:0:root:/root:/bin/sh\n");
        etc.write("/group", "root:x:0:\n");
        etc.write("/hostname", "static-name\n");
        // Newer ones answer nothing without it.
        etc.write("/machine-id", "0123456789abcdef0123456789abcdef\n");
        setLocale("");
        bus.addActivatable(HOSTNAME1.name, HOSTNAMED);
        bus.addActivatable(LOCALE1.name, LOCALED);
        bus.useEtc(etc.root());
        bus.start();
    }

    // The service reads one of the two, by distribution.
    void setLocale(const std::string& assignments) const
    {
        etc.write("/locale.conf", assignments);
        etc.write("/default/locale", assignments);
    }

    std::string deviceName()
    {
        return show(settings.deviceName());
    }
    std::string language()
    {
        return show(settings.language());
    }

    const TemporaryTree etc;
    PrivateBus bus;
    Bus client;
    LinuxSettings settings{client};
};

TEST_F(SystemdServicesTest, PrettyNameComesBeforeTheStaticOne)
{
    EXPECT_EQ("static-name <hostname1 StaticHostname>", deviceName());
    etc.write("/machine-info", "PRETTY_HOSTNAME=\"Grandma's \xe2\x98\x8e phone\"\n");
    EXPECT_EQ("Grandma's \xe2\x98\x8e phone <hostname1 PrettyHostname>", deviceName());
    etc.remove("/machine-info");
    EXPECT_EQ("static-name <hostname1 StaticHostname>", deviceName());
    BusClient(bus.address())
        .mustCall(HOSTNAME1.name, HOSTNAME1.path, HOSTNAME1.interface, "SetPrettyHostname",
                  g_variant_new("(sb)", "Pocket", FALSE));
    EXPECT_EQ("Pocket <hostname1 PrettyHostname>", deviceName());
}

TEST_F(SystemdServicesTest, LanguageOfTheMachineIsSeen)
{
    EXPECT_EQ("error: locale1: Locale sets no language; LC_ALL, LC_MESSAGES and LANG are not set",
              language());
    setenv("LANG", "fr_FR.UTF-8", 1);
    EXPECT_EQ("fr_FR.UTF-8 <environment LANG>", language());
    setLocale("LANG=ko_KR.UTF-8\n");
    EXPECT_EQ("ko_KR.UTF-8 <locale1 LANG>", language());
    unsetenv("LANG");
    setLocale("LANG=ko_KR.UTF-8\nLC_MESSAGES=de_DE.UTF-8\n");
    EXPECT_EQ("de_DE.UTF-8 <locale1 LC_MESSAGES>", language());
}

TEST_F(SystemdServicesTest, ThreadsMayAskTheServiceThatStartsMeanwhile)
{
    together(8, [this](int) { EXPECT_EQ("static-name <hostname1 StaticHostname>", deviceName()); });
}

} // namespace
