// SPDX-License-Identifier: Apache-2.0
// Installed packages, from a made-up package database and from this machine's own.
#include <fcntl.h>
#include <gmock/gmock.h>
#include <sys/stat.h>
#include <unistd.h>

#include "linux/Packages.h"
#include "support/Program.h"
#include "support/TemporaryTree.h"

using port::linux_backend::DPKG_STATUS;
using port::linux_backend::LinuxPackages;

namespace {

const std::string STATUS_FILE = " </var/lib/dpkg/status>";
const std::string CUT_OFF = "error: /var/lib/dpkg/status: it is cut off in the middle of a package";
const char INSTALLED[] = "install ok installed";
const std::string SHELL = "Package: shell\nStatus: install ok installed\nArchitecture: amd64\n"
                          "Version: 2:5.2.15-2+b8\nDescription: a shell\n"
                          " Package: hidden\n Status: install ok installed\n Version: 9\n\n";

std::string stanza(const std::string& name, const std::string& status, const std::string& version)
{
    return "Package: " + name + "\nStatus: " + status + "\nVersion: " + version + "\n\n";
}

class LinuxPackagesTest : public testing::Test {
protected:
    // "VERSION <STATUS_FILE>", "not installed" or "error: REASON".
    std::string versionIn(const std::string& status, const std::string& name)
    {
        tree.write(DPKG_STATUS, status);
        return version(name);
    }
    std::string version(const std::string& name)
    {
        const auto answer = LinuxPackages(tree.root()).version(name);
        if (!answer)
            return "error: " + answer.error().reason;
        const auto& found = answer.value().value;
        return found ? *found + " <" + answer.value().source + ">" : "not installed";
    }

    const TemporaryTree tree;
};

TEST_F(LinuxPackagesTest, VersionOfAnInstalledPackageIsTold)
{
    const std::string status =
        stanza("aaa", INSTALLED, "1") + SHELL + stanza("zzz", "hold ok installed", "3");
    EXPECT_EQ("2:5.2.15-2+b8" + STATUS_FILE, versionIn(status, "shell"));
    EXPECT_EQ("1" + STATUS_FILE, version("aaa"));
}

TEST_F(LinuxPackagesTest, OnlyAFullyInstalledPackageCounts)
{
    for (const char* const state :
         {"deinstall ok config-files", "install ok half-installed", "install ok unpacked",
          "install reinstreq installed", "install ok not-installed", "Install ok installed", ""})
        EXPECT_EQ("not installed", versionIn(stanza("shell", state, "1"), "shell")) << state;
    const std::string removed = stanza("shell", "deinstall ok config-files", "1");
    EXPECT_EQ("2" + STATUS_FILE, versionIn(removed + stanza("shell", INSTALLED, "2"), "shell"))
        << "that of the architecture that is installed";
}

TEST_F(LinuxPackagesTest, NameIsMatchedExactly)
{
    tree.write(DPKG_STATUS, SHELL);
    for (const char* const name :
         {"shel", "shell2", "Shell", "hidden", "", " shell", "shell\nVersion: 1",
          "../../etc/passwd", "a shell", "*", "$(reboot)", "shell:amd64"})
        EXPECT_EQ("not installed", version(name)) << name;
    EXPECT_EQ("not installed", version(std::string(10000000, 'x')));
    EXPECT_EQ("not installed", versionIn("", "shell"));
}

TEST_F(LinuxPackagesTest, NoCutOfTheDatabaseEverGivesAFalseAnswer)
{
    const std::string whole = stanza("aaa", INSTALLED, "1.2.3") + SHELL;
    const std::size_t first = whole.find("\n\n") + 2;
    for (std::size_t length = 1; length < whole.size(); ++length) {
        const std::string cut = whole.substr(0, length);
        // A cut between two packages cannot be seen.
        EXPECT_EQ(length == first ? "not installed" : CUT_OFF, versionIn(cut, "shell")) << cut;
        EXPECT_EQ(length < first ? CUT_OFF : "1.2.3" + STATUS_FILE, version("aaa")) << cut;
    }
}

TEST_F(LinuxPackagesTest, OddDatabasesAreTold)
{
    EXPECT_EQ("error: /var/lib/dpkg/status: No such file or directory", version("shell"));
    for (const char* const end : {"\n", "Version: \n\n"})
        EXPECT_EQ("error: /var/lib/dpkg/status: it holds no version of shell",
                  versionIn("Package: shell\nStatus: install ok installed\n" + std::string(end),
                            "shell"));
    EXPECT_EQ(CUT_OFF, versionIn(std::string(100000, '\x01'), "shell"));
    tree.remove(DPKG_STATUS);
    tree.write(std::string(DPKG_STATUS) + "/x", "");
    EXPECT_EQ("error: /var/lib/dpkg/status: Is a directory", version("shell"));
}

TEST_F(LinuxPackagesTest, FileThatDidNotChangeIsReadOnceAndNoFurtherThanNeeded)
{
    const std::string aaa = stanza("aaa", INSTALLED, "1");
    const std::string half = stanza("half", "install ok unpacked", "1");
    const std::string zzz = stanza("zzz", INSTALLED, "9");
    const std::string whole = aaa + half + zzz;
    port::linux_backend::PackageIndex index;
    std::vector<std::size_t> reads;
    const auto versionOf = [&](const std::string& name) {
        const auto found = index.version(name, [&](std::size_t offset, std::string& text) {
            reads.push_back(offset);
            text.append(whole, offset, 10);
            return true;
        });
        return found ? found.value().value_or("not installed") : found.error().reason;
    };
    EXPECT_EQ("1", versionOf("aaa"));
    EXPECT_LT(reads.back(), aaa.size());
    reads.clear();
    EXPECT_EQ("1", versionOf("aaa"));
    EXPECT_TRUE(reads.empty());
    EXPECT_EQ("9", versionOf("zzz"));
    EXPECT_EQ(aaa.size(), reads.front());
    EXPECT_EQ("not installed", versionOf("half"));
    reads.clear();
    EXPECT_EQ("9", versionOf("zzz"));
    EXPECT_EQ("not installed", versionOf("none"));
    EXPECT_THAT(reads, testing::ElementsAre(whole.size()));
}

TEST_F(LinuxPackagesTest, ChangedFileIsReadAnew)
{
    LinuxPackages packages(tree.root());
    for (const char* const version : {"1", "2", "3"}) {
        const std::string file =
            tree.write(DPKG_STATUS, stanza("aaa", INSTALLED, version)); // all of one size
        EXPECT_EQ(version, packages.version("aaa").value().value);
        const timespec long_ago[2] = {{1000000000, 0}, {1000000000, 0}};
        ASSERT_EQ(0, utimensat(AT_FDCWD, file.c_str(), long_ago, 0));
        EXPECT_EQ(version, packages.version("aaa").value().value);
    }
}

TEST_F(LinuxPackagesTest, MoreThanAnIndexHoldsIsAnsweredAllTheSame)
{
    std::string many;
    for (int i = 0; i < 9; ++i)
        many += stanza("p" + std::to_string(i), INSTALLED, std::string(1000000, 'v'));
    tree.write(DPKG_STATUS, many + stanza("last", INSTALLED, "1"));
    LinuxPackages packages(tree.root());
    for (const char* const name : {"last", "p8", "p0", "last"})
        EXPECT_TRUE(packages.version(name).value().value) << name;
    EXPECT_FALSE(packages.version("none").value().value);
}

TEST_F(LinuxPackagesTest, MachinesOwnDatabaseAgreesWithItsPackageManager)
{
    if (access(DPKG_STATUS, R_OK) != 0)
        GTEST_SKIP() << "needs a machine with dpkg";
    for (const char* const name : {"dpkg", "g++", "libc6", "base-files"}) {
        const auto answer = LinuxPackages("").version(name);
        ASSERT_TRUE(answer) << answer.error().reason;
        const std::string expected =
            outputOf(std::string("dpkg-query -W -f '${db:Status-Status} ${Version}\\n' ") + name +
                     " | sed -n 's/^installed //p' | head -n 1");
        EXPECT_EQ(expected, answer.value().value.value_or("") + "\n") << name;
    }
}

} // namespace
