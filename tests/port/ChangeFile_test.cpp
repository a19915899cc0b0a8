// SPDX-License-Identifier: Apache-2.0
// How files that others read are changed.
#include <csignal>
#include <filesystem>
#include <fstream>
#include <sstream>

#include <fcntl.h>
#include <gmock/gmock.h>
#include <sys/file.h>
#include <sys/resource.h>
#include <sys/stat.h>
#include <sys/wait.h>
#include <unistd.h>

#include "devicefile/ChangeFile.h"
#include "devicefile/Descriptor.h"
#include "support/Child.h"
#include "support/TemporaryTree.h"

using port::devicefile::changeFile;
using testing::ElementsAre;
using testing::HasSubstr;
using testing::UnorderedElementsAre;

namespace {

namespace fs = std::filesystem;

constexpr std::size_t LIMIT = 1 << 20;

class ChangeFileTest : public testing::Test {
protected:
    // Why a line could not be added; empty when it was.
    std::string addLine(const std::string& line) const
    {
        return addLineTo(path, line);
    }
    static std::string addLineTo(const std::string& file, const std::string& line)
    {
        return changeFile(file, LIMIT, [&](std::string& content) {
            content += line + "\n";
            return std::string();
        });
    }

    std::string content() const
    {
        std::ostringstream text;
        text << std::ifstream(path).rdbuf();
        return text.str();
    }

    // The file as it was, and nothing left behind in its folder.
    void expectUntouched() const
    {
        EXPECT_EQ("first\n", content());
        EXPECT_THAT(names(), ElementsAre("file"));
    }

    std::vector<std::string> names() const
    {
        std::vector<std::string> found;
        for (const auto& entry : fs::directory_iterator(tree.root()))
            found.push_back(entry.path().filename());
        return found;
    }

    struct stat status() const
    {
        struct stat found = {};
        stat(path.c_str(), &found);
        return found;
    }

    const TemporaryTree tree;
    const std::string path = tree.write("/file", "first\n");
};

TEST_F(ChangeFileTest, NewContentTakesTheOldOnesPlaceWithItsMode)
{
    ASSERT_EQ(0, chmod(path.c_str(), 0640));
    const struct stat before = status();
    EXPECT_EQ("", addLine("second"));
    EXPECT_EQ("first\nsecond\n", content());
    EXPECT_NE(before.st_ino, status().st_ino);
    EXPECT_EQ(before.st_mode, status().st_mode);
    EXPECT_THAT(names(), ElementsAre("file"));
}

TEST_F(ChangeFileTest, OwnerIsKeptWhereThatIsPermitted)
{
    if (chown(path.c_str(), 12345, 54321) != 0)
        GTEST_SKIP() << "only root gives files away";
    EXPECT_EQ("", addLine("second"));
    EXPECT_EQ(12345U, status().st_uid);
    EXPECT_EQ(54321U, status().st_gid);
}

TEST_F(ChangeFileTest, UnchangedContentIsNotWritten)
{
    const ino_t before = status().st_ino;
    EXPECT_EQ("", changeFile(path, LIMIT, [](std::string&) { return std::string(); }));
    EXPECT_EQ(before, status().st_ino);
}

TEST_F(ChangeFileTest, RefusalLeavesTheFile)
{
    EXPECT_EQ("no", changeFile(path, LIMIT, [](std::string& text) {
                  text = "other";
                  return std::string("no");
              }));
    EXPECT_THAT(addLineTo(tree.path("/none"), "x"), HasSubstr("No such file or directory"));
    EXPECT_THAT(addLineTo(tree.root(), "x"), HasSubstr("Is a directory"));
    expectUntouched();
}

TEST_F(ChangeFileTest, LinkGoesOnLeadingToTheFile)
{
    const TemporaryTree links;
    fs::create_symlink(path, links.path("/link"));
    EXPECT_EQ("", addLineTo(links.path("/link"), "second"));
    EXPECT_TRUE(fs::is_symlink(links.path("/link")));
    EXPECT_EQ("first\nsecond\n", content());
}

TEST_F(ChangeFileTest, ReadOnlyFolderIsAnError)
{
    ASSERT_EQ(0, chmod(path.c_str(), 0666));
    ASSERT_EQ(0, chmod(tree.root().c_str(), 0555));
    EXPECT_THAT(inChild([this] {
                    const bool isPlainUser = geteuid() != 0 || setuid(65534) == 0;
                    return isPlainUser ? addLine("second") : "root stays root";
                }),
                HasSubstr("Permission denied"));
    ASSERT_EQ(0, chmod(tree.root().c_str(), 0755));
    expectUntouched();
}

TEST_F(ChangeFileTest, FullDiskLeavesTheOldFileWhole)
{
    EXPECT_THAT(inChild([this] {
                    const rlimit tiny = {3, 3};
                    std::signal(SIGXFSZ, SIG_IGN);
                    return setrlimit(RLIMIT_FSIZE, &tiny) == 0 ? addLine("second") : "no limit";
                }),
                HasSubstr("File too large"));
    expectUntouched();
}

TEST_F(ChangeFileTest, WhatKilledWritersLeftIsCollected)
{
    const std::string kept = tree.write("/.file.abcdef", "another program's");
    for (int writer = 0; writer < 3; ++writer) {
        const pid_t child = fork();
        if (child == 0) {
            const rlimit tiny = {5000, 5000}; // the signal ends the process while it writes
            setrlimit(RLIMIT_FSIZE, &tiny);
            addLine(std::string(100000, 'x'));
            _exit(0);
        }
        int status = 0;
        EXPECT_EQ(child, waitpid(child, &status, 0));
        EXPECT_TRUE(WIFSIGNALED(status));
    }
    EXPECT_GE(names().size(), 4U); // the lock, what one writer left, and both files
    EXPECT_EQ("", addLine("second"));
    EXPECT_EQ("first\nsecond\n", content());
    EXPECT_THAT(names(), UnorderedElementsAre("file", ".file.abcdef"));
}

TEST_F(ChangeFileTest, WhoMayOnlyReadCannotKeepWritersOut)
{
    const port::Descriptor reader(open(path.c_str(), O_RDONLY | O_CLOEXEC));
    ASSERT_EQ(0, flock(reader.number(), LOCK_EX));
    EXPECT_EQ("", addLine("second"));
    EXPECT_THAT(inChild([this] {
                    return changeFile(path, LIMIT, [this](std::string&) {
                        struct stat lock = {};
                        return stat(tree.path("/.file.coresystem-lock").c_str(), &lock) == 0 &&
                                       (lock.st_mode & 07777) == 0600
                                   ? std::string("for its writers only")
                                   : std::string("for others too");
                    });
                }),
                HasSubstr("for its writers only"));
}

TEST_F(ChangeFileTest, WriterThatStandsStillIsNotWaitedForForEver)
{
    const std::string lock = tree.write("/.file.coresystem-lock", "");
    const port::Descriptor other(open(lock.c_str(), O_RDWR | O_CLOEXEC));
    ASSERT_EQ(0, flock(other.number(), LOCK_EX));
    EXPECT_EQ(path + " cannot be changed: somebody else has been changing it for 5 seconds",
              addLine("second"));
    EXPECT_EQ("first\n", content());
}

TEST_F(ChangeFileTest, ManyWritersLoseNothing)
{
    constexpr int WRITERS = 6;
    constexpr int LINES = 10;
    std::vector<pid_t> children;
    for (int writer = 0; writer < WRITERS; ++writer) {
        const pid_t child = fork();
        if (child == 0) {
            bool good = true;
            for (int line = 0; line < LINES; ++line)
                good = addLine(std::to_string(writer) + "." + std::to_string(line)).empty() && good;
            _exit(good ? 0 : 1);
        }
        children.push_back(child);
    }
    for (const pid_t child : children) {
        int result = -1;
        EXPECT_EQ(child, waitpid(child, &result, 0));
        EXPECT_EQ(0, result);
    }
    std::istringstream text(content());
    std::set<std::string> lines;
    for (std::string line; std::getline(text, line);)
        EXPECT_TRUE(lines.insert(line).second) << line;
    EXPECT_EQ(1U + WRITERS * LINES, lines.size());
    EXPECT_THAT(names(), ElementsAre("file"));
}

} // namespace
