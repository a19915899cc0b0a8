// SPDX-License-Identifier: Apache-2.0
// Where a device is found by its name.
#include <cstdlib>
#include <filesystem>

#include <gmock/gmock.h>

#include "devicefile/DeviceSearch.h"
#include "support/Child.h"
#include "support/TemporaryTree.h"

using port::devicefile::findDevice;
using testing::EndsWith;
using testing::HasSubstr;

namespace {

namespace fs = std::filesystem;

// A user's own devices, and the folder that the user is in. A "tablet" is shipped.
class DeviceSearchTest : public testing::Test {
protected:
    void own(const std::string& name) const
    {
        tree.write("/config/coresystem/devices/" + name, "schema = 1\n");
    }
    void here(const std::string& name) const
    {
        tree.write("/here/" + name, "schema = 1\n");
    }

    // The answer there: the path, or the path and where else it was looked for.
    std::string found(const std::string& name) const
    {
        return inChild([&] {
            fs::create_directories(tree.path("/here"));
            fs::current_path(tree.path("/here"));
            setenv("XDG_CONFIG_HOME", tree.path("/config").c_str(), 1);
            const auto device = findDevice(name);
            return device.path + device.elsewhere;
        });
    }

    std::string ownPath(const std::string& name) const
    {
        return tree.path("/config/coresystem/devices/" + name);
    }

    const TemporaryTree tree;
};

TEST_F(DeviceSearchTest, SlashMeansAPath)
{
    own("phone");
    EXPECT_EQ("./phone", found("./phone"));
    EXPECT_EQ("/nowhere/phone", found("/nowhere/phone"));
}

TEST_F(DeviceSearchTest, NameIsLookedForWithAndWithoutItsEnding)
{
    own("phone.toml");
    EXPECT_EQ(ownPath("phone.toml"), found("phone"));
    EXPECT_EQ(ownPath("phone.toml"), found("phone.toml"));
    own("phone");
    EXPECT_EQ(ownPath("phone"), found("phone"));
}

TEST_F(DeviceSearchTest, NameOfAFileMeansTheOneHereFirst)
{
    here("tablet.toml");
    here("tablet");
    EXPECT_EQ("tablet.toml", found("tablet.toml"));
    EXPECT_THAT(found("tablet"), EndsWith("/share/coresystem/devices/tablet.toml"));
}

TEST_F(DeviceSearchTest, AnyFileHereIsTheLastResort)
{
    here("odd");
    EXPECT_EQ("odd", found("odd"));
    own("odd.toml");
    EXPECT_EQ(ownPath("odd.toml"), found("odd"));
    fs::create_directories(tree.path("/here/folder"));
    EXPECT_THAT(found("folder"), HasSubstr(", here or in "));
}

TEST_F(DeviceSearchTest, MissingDeviceNamesTheNearestOne)
{
    EXPECT_THAT(found("tablte.toml"), EndsWith("; did you mean \"tablet\"?"));
    EXPECT_THAT(found("qqqqqqqq"), testing::Not(HasSubstr("did you mean")));
}

} // namespace
