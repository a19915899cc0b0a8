// SPDX-License-Identifier: Apache-2.0
// The configuration store, in made-up files.
#include <gmock/gmock.h>
#include <sys/stat.h>

#include "linux/Configuration.h"
#include "support/TemporaryTree.h"

using port::linux_backend::LinuxConfiguration;
using testing::AllOf;
using testing::AnyOf;
using testing::HasSubstr;
using testing::Not;
using testing::StartsWith;

namespace {

const char KEY[] = "db/csc/salescode";

class LinuxConfigurationTest : public testing::Test {
protected:
    std::string ask(const std::string& key)
    {
        const auto answer = store.text(key);
        return answer ? answer.value().value + " <" + answer.value().source + ">"
                      : "error: " + answer.error().reason;
    }

    const TemporaryTree tree;
    const std::string user = tree.path("/user.ini");
    const std::string machine = tree.path("/machine.ini");
    LinuxConfiguration store{{user, machine}};
};

TEST_F(LinuxConfigurationTest, UsersFileComesBeforeTheMachines)
{
    tree.write("/machine.ini", "[db/csc]\nsalescode=DBT\n");
    EXPECT_EQ("DBT <" + machine + ">", ask(KEY));
    tree.write("/user.ini", "# mine\n[db/csc]\nsalescode = XEF\n");
    EXPECT_EQ("XEF <" + user + ">", ask(KEY));
}

TEST_F(LinuxConfigurationTest, GroupIsAllButTheLastPartOfTheKey)
{
    tree.write("/user.ini", "[db]\ncsc/x=1\n[db/csc]\nx=2\n[memory/a/b/c]\nd=3\n");
    EXPECT_EQ("2 <" + user + ">", ask("db/csc/x"));
    EXPECT_EQ("3 <" + user + ">", ask("memory/a/b/c/d"));
    EXPECT_THAT(ask("db/csc"), StartsWith("error: "));
}

TEST_F(LinuxConfigurationTest, FileWithoutTheKeyIsPassedOver)
{
    tree.write("/machine.ini", "[db/csc]\nsalescode=DBT\n");
    for (const char* const text :
         {"", "[db/csc]\n", "[db/csc]\nother=x\n", "[other]\nsalescode=x\n",
          "[db/csc]\nsalescode=\n", "salescode=x\n", "garbage", "[db/csc\nsalescode=x\n",
          "[db/csc]\nsalescode=\xff\n"}) {
        tree.write("/user.ini", text);
        EXPECT_EQ("DBT <" + machine + ">", ask(KEY)) << text;
    }
}

TEST_F(LinuxConfigurationTest, ReasonNamesEveryFile)
{
    EXPECT_EQ("error: " + user + ": No such file or directory; " + machine +
                  ": No such file or directory",
              ask(KEY));
    for (const auto& [text, reason] :
         {std::pair("[db/csc]\nsalescode=\n", "it is empty"),
          {"[db/csc]\n", "it has no such key"},
          {"[other]\n", "it has no such key"},
          {"[db/csc]\nsalescode=\xff\n", "it has no readable text for the key"},
          {"[db/csc\n", "it is no file of groups and keys"}}) {
        tree.write("/user.ini", text);
        EXPECT_EQ("error: " + user + ": " + reason + "; " + machine + ": No such file or directory",
                  ask(KEY));
    }
}

// The file may be one that the asker must not read, as a link of a set-user-ID program's caller.
TEST_F(LinuxConfigurationTest, NoReasonRepeatsWhatAFileHolds)
{
    for (const char* const text :
         {"root:secret:1:", "[db/csc]\nsecret\n", "[secret", "[db/csc]\nsalescode=secret\xff\n",
          "[db/csc]\nsalescode=\\", "Encoding=secret\n",
          "[db/csc]\nEncoding=secret\nsalescode=x\\z\n", "[secret]\nsecret=secret\n",
          "[db/csc]\nsecret[secret]=x\n", "\xffsecret\n"}) {
        tree.write("/user.ini", text);
        EXPECT_THAT(ask(KEY), AllOf(StartsWith("error: " + user + ": it "),
                                    Not(AnyOf(HasSubstr("secret"), HasSubstr("\\")))))
            << text;
    }
}

TEST_F(LinuxConfigurationTest, OddFilesAreNeverWaitedFor)
{
    ASSERT_EQ(0, mkfifo(user.c_str(), 0600));
    tree.write("/machine.ini", std::string(2000000, '#'));
    EXPECT_THAT(ask(KEY),
                AllOf(HasSubstr("not a regular file"), HasSubstr("larger than 1048576 bytes")));
}

TEST_F(LinuxConfigurationTest, TextsThatAreNoKeyAreRefused)
{
    tree.write("/user.ini", "[db/csc]\nsalescode=XEF\n");
    for (const char* const key : {"", "/", "salescode", "/salescode", "db/csc/"})
        EXPECT_THAT(ask(key), HasSubstr(" is no key: it has no group or no name")) << key;
    for (const char* const key : {"../../etc/passwd", "db/csc/salescode\n", "db/csc/[x]", "]/x"})
        EXPECT_THAT(ask(key), StartsWith("error: ")) << key;
}

} // namespace
