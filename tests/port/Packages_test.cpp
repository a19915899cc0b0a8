// SPDX-License-Identifier: Apache-2.0
// The package functions over a backend that answers what a test says.
#include <cstdlib>

#include <gmock/gmock.h>
#include <package_manager.h>

#include "coresystem_port.h"
#include "shim/HandleKinds.h"
#include "support/FakeBackend.h"

using coresystem_port::lastOrigin;
using coresystem_port::Question;
using port::InstalledPackages;

namespace {

using Version = FakeBackend::Version;

class PackagesTest : public testing::Test {
protected:
    ~PackagesTest() override
    {
        EXPECT_EQ(0U, InstalledPackages::live());
        free(version);
    }

    void answer(const Answer<Version>& version_)
    {
        backend.versionAnswer = [version_](const std::string&) { return version_; };
    }

    // Both functions that take a name fail alike.
    void expectFailure(int code, const Answer<Version>& failure, const std::string& reason)
    {
        answer(failure);
        package_info_h none = nullptr;
        EXPECT_EQ(code, package_info_create("app", &none));
        EXPECT_EQ(nullptr, none);
        EXPECT_EQ(code, package_manager_get_package_size_info("app", nullptr, nullptr));
        EXPECT_EQ(reason, lastOrigin(Question::PackageVersion).reason);
        EXPECT_FALSE(lastOrigin(Question::PackageVersion).available);
    }

    FakedBackend backend;
    package_info_h info = nullptr;
    char* version = nullptr;
};

TEST_F(PackagesTest, VersionIsTheOneOfTheHandlesPackageInACopyForEachCall)
{
    char* second = nullptr;
    ASSERT_EQ(0, package_info_create("app", &info));
    EXPECT_EQ("test", lastOrigin(Question::PackageVersion).source);
    answer(answered(Version("2.0"))); // an update does not change what the handle tells
    ASSERT_EQ(0, package_info_get_version(info, &version));
    ASSERT_EQ(0, package_info_get_version(info, &second));
    EXPECT_STREQ("1.0", version);
    EXPECT_STREQ("1.0", second);
    EXPECT_NE(version, second);
    free(second);
    EXPECT_EQ(1U, InstalledPackages::live());
    EXPECT_EQ(0, package_info_destroy(info));
}

TEST_F(PackagesTest, NamesGoThroughUnchanged)
{
    std::vector<std::string> names = {"", " app ", "a\nb", "../../etc/passwd",
                                      "$(touch x); `id` | cat"};
    names.emplace_back(10000000, 'x');
    std::vector<std::string> asked;
    backend.versionAnswer = [&asked](const std::string& name) {
        asked.push_back(name);
        return answered(Version());
    };
    for (const std::string& name : names)
        EXPECT_EQ(PACKAGE_MANAGER_ERROR_NO_SUCH_PACKAGE,
                  package_manager_get_package_size_info(name.c_str(), nullptr, nullptr));
    EXPECT_TRUE(asked == names); // printing them would take long
}

TEST_F(PackagesTest, FailuresHaveTheirCodes)
{
    expectFailure(PACKAGE_MANAGER_ERROR_NO_SUCH_PACKAGE, answered(Version()),
                  "test: not installed");
    expectFailure(PACKAGE_MANAGER_ERROR_IO_ERROR, port::notAvailable("gone"), "gone");
    expectFailure(PACKAGE_MANAGER_ERROR_IO_ERROR, port::notSupported("none"), "none");
    expectFailure(PACKAGE_MANAGER_ERROR_PERMISSION_DENIED, port::denied("no"), "no");
}

TEST_F(PackagesTest, NullArgumentsAreInvalid)
{
    EXPECT_EQ(-22, package_info_create(nullptr, &info));
    EXPECT_EQ(-22, package_info_create("app", nullptr));
    EXPECT_EQ(-22, package_info_destroy(nullptr));
    EXPECT_EQ(-22, package_info_get_version(nullptr, &version));
    EXPECT_EQ(-22, package_manager_get_package_size_info(nullptr, nullptr, nullptr));
    EXPECT_EQ(nullptr, version);
}

TEST_F(PackagesTest, HandleThatWasReleasedOrIsOfAnotherKindIsInvalid)
{
    ASSERT_EQ(0, package_info_create("app", &info));
    EXPECT_EQ(-22, package_info_get_version(info, nullptr));
    ASSERT_EQ(0, package_info_destroy(info));
    EXPECT_EQ(-22, package_info_destroy(info));
    EXPECT_EQ(-22, package_info_get_version(info, &version));
    EXPECT_EQ(nullptr, version);
    const connection_h connection = port::Connections::open({});
    EXPECT_EQ(-22, package_info_destroy(static_cast<package_info_h>(connection)));
    EXPECT_TRUE(port::Connections::close(connection));
}

TEST_F(PackagesTest, InstalledPackageIsKnownWithoutACallbackAndSizesAreNotMadeUp)
{
    EXPECT_EQ(0, package_manager_get_package_size_info("app", nullptr, nullptr));
    const auto never = [](const char*, const package_size_info_t*, void*) { ADD_FAILURE(); };
    EXPECT_EQ(PACKAGE_MANAGER_ERROR_SYSTEM_ERROR,
              package_manager_get_package_size_info("app", never, nullptr));
}

} // namespace
