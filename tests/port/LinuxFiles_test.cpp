// SPDX-License-Identifier: Apache-2.0
// Facts from files, in a made-up tree and with no bus.
#include <cstdlib>
#include <filesystem>

#include <gmock/gmock.h>
#include <sys/stat.h>

#include "linux/DeviceInfo.h"
#include "linux/Settings.h"
#include "support/TemporaryTree.h"

using port::Fact;
using port::Result;
using port::linux_backend::Bus;
using port::linux_backend::LinuxDeviceInfo;
using testing::AllOf;
using testing::HasSubstr;
using testing::StartsWith;

namespace {

const std::string MACHINE_ID = "4f2d9c0b6a714e8d95c3b17e20fd86aa";

// Of that machine, as systemd hashes it for the port's name; it must never change.
const std::string PLATFORM_ID = "10822e47df3a4faab3de3467f6e05cf6 </etc/machine-id (hashed)>";

std::string show(const Result<Fact>& answer)
{
    if (answer)
        return answer.value().value + " <" + answer.value().source + ">";
    EXPECT_EQ(port::Error::Kind::NotAvailable, answer.error().kind);
    return "error: " + answer.error().reason;
}

class LinuxFilesTest : public testing::Test {
protected:
    LinuxFilesTest()
    {
        setenv("DBUS_SYSTEM_BUS_ADDRESS", "unix:path=/nowhere/bus", 1);
    }
    ~LinuxFilesTest() override
    {
        unsetenv("DBUS_SYSTEM_BUS_ADDRESS");
    }

    std::string nameIn(const std::string& osRelease)
    {
        tree.write("/etc/os-release", osRelease);
        return show(device.platformName());
    }

    const TemporaryTree tree;
    Bus bus;
    LinuxDeviceInfo device{bus, tree.root()};
};

TEST_F(LinuxFilesTest, PlatformIdIsTheHashThatSystemdComputes)
{
    tree.write("/etc/machine-id", MACHINE_ID + "\n");
    EXPECT_EQ(PLATFORM_ID, show(device.platformId()));
}

TEST_F(LinuxFilesTest, TextsThatAreNoMachineIdAreRefused)
{
    for (const std::string& text :
         {std::string("uninitialized\n"), MACHINE_ID + "00\n", MACHINE_ID.substr(1),
          MACHINE_ID.substr(1) + "g", std::string(32, '0'),
          std::string("4f2d9c0b-6a71-4e8d-95c3-b17e20fd86aa")}) {
        tree.write("/etc/machine-id", text);
        EXPECT_EQ("error: /etc/machine-id holds no machine id", show(device.platformId())) << text;
    }
}

TEST_F(LinuxFilesTest, MachineIdOfTheBusIsTheSecondChoice)
{
    EXPECT_EQ("error: /etc/machine-id: No such file or directory, "
              "/var/lib/dbus/machine-id: No such file or directory",
              show(device.platformId()));
    tree.write("/var/lib/dbus/machine-id", MACHINE_ID + "\n");
    EXPECT_THAT(show(device.platformId()), HasSubstr(" </var/lib/dbus/machine-id (hashed)>"));
    tree.write("/etc/machine-id", "\n");
    EXPECT_THAT(show(device.platformId()), HasSubstr(" </var/lib/dbus/machine-id (hashed)>"));
}

TEST_F(LinuxFilesTest, LanguageThatNobodyTellsIsNotAvailable)
{
    for (const char* const variable : {"LC_ALL", "LC_MESSAGES", "LANG"})
        unsetenv(variable);
    EXPECT_THAT(show(port::linux_backend::LinuxSettings(bus).language()), StartsWith("error: "));
}

TEST_F(LinuxFilesTest, OsReleaseNamesAndNumbersThePlatform)
{
    tree.write("/etc/os-release",
               "PRETTY_NAME=\"Some OS 7 (x)\"\nNAME=\"Some OS\"\nVERSION_ID=7.1\n");
    EXPECT_EQ("Some OS </etc/os-release NAME>", show(device.platformName()));
    EXPECT_EQ("7.1 </etc/os-release VERSION_ID>", show(device.platformVersion()));
}

TEST_F(LinuxFilesTest, OsReleaseIsUnquotedAsAShellDoesAndTheLastAssignmentCounts)
{
    for (const auto& [text, name] :
         {std::pair("NAME=Plain", "Plain"),
          {"NAME='a b'\n", "a b"},
          {"NAME=\"a \\\"b\\\" \\$c \\`d\\` \\\\\"\n", "a \"b\" $c `d` \\"},
          {"NAME='a\"b'\n", "a\"b"},
          {"  NAME=Plain  \r\n", "Plain"},
          {"NAME=a=b\n", "a=b"},
          {"NAME=Über\n", "Über"},
          {"NAME=one\nNAME=two\n", "two"}})
        EXPECT_EQ(std::string(name) + " </etc/os-release NAME>", nameIn(text)) << text;
}

TEST_F(LinuxFilesTest, OtherLinesOfOsReleaseAreNotTaken)
{
    for (const char* const text :
         {"# NAME=x\n", "MYNAME=x\n", "NAME_X=x\n", "NAME x\n", "NAME =x\n", "NAME=\n",
          "NAME=\"\"\n", "NAME=\"unclosed\n", "ID=x\n", "NAME=one\nNAME=\n"})
        EXPECT_EQ("error: /etc/os-release has no NAME", nameIn(text)) << text;
}

TEST_F(LinuxFilesTest, VendorsOsReleaseIsTheSecondChoice)
{
    tree.write("/usr/lib/os-release", "NAME=Vendor\n");
    EXPECT_EQ("Vendor </usr/lib/os-release NAME>", show(device.platformName()));
    EXPECT_EQ("Admin </etc/os-release NAME>", nameIn("NAME=Admin\n"));
}

TEST_F(LinuxFilesTest, ModelComesFromDmiThenFromTheDeviceTree)
{
    tree.write("/proc/device-tree/model", std::string("Board 3\0", 8));
    EXPECT_EQ("Board 3 </proc/device-tree/model>", show(device.modelName()));
    tree.write("/sys/class/dmi/id/product_name", "\n");
    EXPECT_EQ("Board 3 </proc/device-tree/model>", show(device.modelName()));
    tree.write("/sys/class/dmi/id/product_name", "Laptop 9 \n");
    EXPECT_EQ("Laptop 9 </sys/class/dmi/id/product_name>", show(device.modelName()));
}

TEST_F(LinuxFilesTest, AbsentModelNamesEveryPlace)
{
    EXPECT_THAT(show(device.modelName()),
                AllOf(StartsWith("error: no system bus: "),
                      HasSubstr("; /sys/class/dmi/id/product_name: No such file or directory, "
                                "/proc/device-tree/model: No such file or directory")));
}

TEST_F(LinuxFilesTest, SerialComesFromTheDeviceTreeThenFromDmi)
{
    EXPECT_EQ("error: /proc/device-tree/serial-number: No such file or directory, "
              "/sys/class/dmi/id/product_serial: No such file or directory",
              show(device.serial()));
    tree.write("/sys/class/dmi/id/product_serial", "SN-4711 \n");
    EXPECT_EQ("SN-4711 </sys/class/dmi/id/product_serial>", show(device.serial()));
    tree.write("/proc/device-tree/serial-number", std::string("10000000c0ffee\0", 15));
    EXPECT_EQ("10000000c0ffee </proc/device-tree/serial-number>", show(device.serial()));
}

TEST_F(LinuxFilesTest, PlaceholderIsNoSerial)
{
    tree.write("/sys/class/dmi/id/product_serial", "PF0ABCDE\n");
    for (const char* const text :
         {"To be filled by O.E.M.", "TO BE FILLED BY O.E.M.", "Default string",
          "System Serial Number", "Not Specified", "None", "n/a", "0", "0000000000000000",
          "XXXXXXX", "xXxX", "-", ".....", "0123456789", "123456789"}) {
        tree.write("/proc/device-tree/serial-number", text);
        EXPECT_EQ("PF0ABCDE </sys/class/dmi/id/product_serial>", show(device.serial())) << text;
    }
    tree.write("/sys/class/dmi/id/product_serial", "Default string\n");
    tree.write("/proc/device-tree/serial-number", std::string("0\0", 2));
    EXPECT_EQ(
        "error: /proc/device-tree/serial-number: holds what firmware says in place of a serial "
        "number, "
        "/sys/class/dmi/id/product_serial: holds what firmware says in place of a serial number",
        show(device.serial()));
}

TEST_F(LinuxFilesTest, OddFilesAreNamedAndNeverWaitedFor)
{
    const std::string path = tree.path("/etc/os-release");
    std::filesystem::create_directories(path);
    EXPECT_THAT(show(device.platformName()),
                StartsWith("error: /etc/os-release: Is a directory, "));
    std::filesystem::remove(path);
    ASSERT_EQ(0, mkfifo(path.c_str(), 0600));
    EXPECT_THAT(show(device.platformName()),
                StartsWith("error: /etc/os-release: not a regular file, "));
    std::filesystem::remove(path);
    EXPECT_THAT(nameIn(std::string(70000, '\n')),
                StartsWith("error: /etc/os-release: larger than 65536 bytes, "));
    EXPECT_THAT(nameIn(std::string("\0NAME=x\n", 8)),
                StartsWith("error: /etc/os-release: empty, "));
}

} // namespace
