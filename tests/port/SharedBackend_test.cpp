// SPDX-License-Identifier: Apache-2.0
// The backend that a process gets.
#include <filesystem>

#include <gmock/gmock.h>
#include <sys/statvfs.h>
#include <unistd.h>

#include "support/Program.h"
#include "support/TemporaryTree.h"

using testing::AllOf;
using testing::AnyOf;
using testing::HasSubstr;
using testing::Not;

namespace {

namespace fs = std::filesystem;

TEST(BackendChoiceTest, SetUserIdProcessIgnoresTheEnvironment)
{
    const TemporaryTree tree;
    struct statvfs folder = {};
    if (PROBE_IS_EMULATED != 0 || geteuid() != 0 || statvfs(tree.root().c_str(), &folder) != 0 ||
        (folder.f_flag & ST_NOSUID) != 0)
        GTEST_SKIP() << "needs a program of this machine, root and a temporary folder that allows "
                        "set-user-ID programs";
    const std::string probe = tree.path("/probe");
    fs::copy_file(ENVIRONMENT_PROBE, probe);
    const fs::path module = CIPHER_MODULE;
    const fs::path modules = tree.path("/" + module.parent_path().filename().string());
    fs::create_directory(modules);
    fs::copy_file(module, modules / module.filename());
    fs::permissions(probe, fs::perms::set_uid | fs::perms(0755));

    const std::string asNobody =
        "setpriv --reuid=65534 --clear-groups env ASAN_OPTIONS=detect_leaks=0"
        " CORESYSTEM_DEVICE=/nowhere.toml CORESYSTEM_LOG_DEBUG=1"
        " CORESYSTEM_LOG_TAG=Weather CORESYSTEM_LOG_KEY=/nowhere LC_ALL=xx_XX XDG_CONFIG_HOME=" +
        tree.root() + " XDG_DATA_HOME=" + tree.root() + " XDG_DATA_DIRS=" + tree.root() +
        " DBUS_SYSTEM_BUS_ADDRESS=unix:path=" + tree.path("/bus") + " ";
    tree.write("/coresystem/vconf.ini", "root:secret:1:\n");
    const std::string output = outputOf(asNobody + probe + " sources");
    EXPECT_THAT(output, HasSubstr("backend=linux\ndebug=0\ntag=0:\n"));
    EXPECT_THAT(output, HasSubstr("font size: GSettings org.gnome.desktop.interface "
                                  "text-scaling-factor: not read in a set-user-ID process\n"));
    EXPECT_THAT(output, HasSubstr("storage: file system of /\n"));
    EXPECT_THAT(output,
                Not(AnyOf(HasSubstr(tree.root()), HasSubstr("secret"), HasSubstr("LC_ALL"))))
        << "nothing of the caller's is named, so nothing of it was looked at";
    EXPECT_THAT(outputOf(asNobody + probe + " balance"), HasSubstr("configured=0\nproblem=\n"));
    fs::permissions(probe, fs::perms(0755)); // the same program as an ordinary one obeys
    EXPECT_THAT(outputOf(asNobody + "env -u CORESYSTEM_DEVICE " + probe + " sources"),
                AllOf(HasSubstr("debug=1\ntag=1:Weather\n"),
                      HasSubstr("sales code: " + tree.path("/coresystem/vconf.ini")),
                      HasSubstr("environment LC_ALL")));
}

} // namespace
