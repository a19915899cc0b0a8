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

TEST_F(LinuxConfigurationTest, FileWithoutTheKeyIsNamedAndPassedOver)
{
    const std::string absent = ": No such file or directory";
    EXPECT_EQ("error: " + user + absent + "; " + machine + absent, ask(KEY));
    const char* const noKey = "it has no such key";
    const char* const broken = "it is no file of groups and keys";
    for (const auto& [text, reason] :
         {std::pair("[db/csc]\nsalescode=\n", "it is empty"),
          {"", noKey},
          {"[db/csc]\n", noKey},
          {"[db/csc]\nother=x\n", noKey},
          {"[other]\nsalescode=x\n", noKey},
          {"salescode=x\n", noKey},
          {"garbage", broken},
          {"[db/csc\nsalescode=x\n", broken},
          {"[db/csc]\nsalescode=\xff\n", "it has no readable text for the key"}}) {
        tree.write("/user.ini", text);
        EXPECT_EQ("error: " + user + ": " + reason + "; " + machine + absent, ask(KEY)) << text;
        tree.write("/machine.ini", "[db/csc]\nsalescode=DBT\n");
        EXPECT_EQ("DBT <" + machine + ">", ask(KEY)) << text;
        tree.remove("/machine.ini");
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
