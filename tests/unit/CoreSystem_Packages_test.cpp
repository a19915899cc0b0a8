// SPDX-License-Identifier: Apache-2.0
// The version of a package, and whether it is installed.
#include "support/PlatformTest.h"

using namespace fake;
using testing::IsEmpty;

namespace {

const int NO_SUCH_PACKAGE = -18153359;

const int PACKAGE_FAILURES[] = {NO_SUCH_PACKAGE, NO_SUCH_PACKAGE + 1, NO_SUCH_PACKAGE - 1, -22, 1};

// The call texts of one package.
struct Package {
    explicit Package(const std::string& packageName) : name(packageName) {}

    std::string name;
    std::string create = "package_info_create(" + name + ")";
    std::string getVersion = "package_info_get_version(package " + name + ")";
    std::string destroy = "package_info_destroy(package " + name + ")";
    std::string size = "package_manager_get_package_size_info(" + name + ")";
};

const Package APP("org.example.app");
const Texts OPEN = {"package org.example.app"};
const std::string VERSION = "GetPackageVersion";
const std::string INSTALLED = "IsPackageInstalled";

// The answers of a package whose version can be read.
void install(const std::any& version, int codeOfRelease = 0)
{
    platform().answer(APP.create, 0);
    platform().answer(APP.getVersion, 0, version);
    platform().answer(APP.destroy, codeOfRelease);
}

// Whether the answer is the version, as a copy beside the platform's own string, which is kept.
void expectVersion(const std::string& expected)
{
    char preset = 'p';
    char* version = &preset;
    EXPECT_EQ(coreSystem().GetPackageVersion("org.example.app", &version), 0);
    EXPECT_TRUE(version == expected);
    EXPECT_EQ(ledger().origin(version), "copy: " + expected);
    std::free(version);
    EXPECT_EQ(ledger().freeAll(), Texts{"platform: " + expected});
    EXPECT_THAT(platform().liveHandles(), IsEmpty());
}

void expectFailure(const char* name, int code, const Texts& open = {})
{
    char preset = 'p';
    char* version = &preset;
    EXPECT_EQ(coreSystem().GetPackageVersion(name, &version), code);
    EXPECT_EQ(version, code != 0 ? &preset : nullptr);
    EXPECT_EQ(preset, 'p');
    EXPECT_EQ(platform().liveHandles(), open);
}

std::string failureLine(const std::string& function, int code)
{
    return CORE_SYSTEM.error(VERSION, function + " failed [" + std::to_string(code) + "] <- " +
                                          function + " failed [%d]");
}

Texts answeredTrace(const std::string& version)
{
    return {CORE_SYSTEM.debug(VERSION, "CoreSystem::GetPackageVersion"), APP.create, APP.getVersion,
            APP.destroy, CORE_SYSTEM.debug(VERSION, "packageVersion : " + version)};
}

std::vector<LoggedCall> versionCalls()
{
    const std::string entry = CORE_SYSTEM.debug(VERSION, "CoreSystem::GetPackageVersion");
    std::vector<LoggedCall> calls;
    const auto add = [&](const std::string& name, const Texts& trace, const auto& run) {
        calls.push_back({VERSION + name, run, trace});
    };
    add("Answered", answeredTrace("1.2.3"), [] {
        install(std::string("1.2.3"));
        expectVersion("1.2.3");
    });
    add("AnsweredAndReleaseFailed", answeredTrace("1.2.3"), [] {
        install(std::string("1.2.3"), -5);
        expectVersion("1.2.3");
    });
    add("AnsweredNull", answeredTrace("(null)"), [] {
        install({});
        expectFailure("org.example.app", 0);
    });
    add("OfNull", {entry, "package_info_create(null)", failureLine("package_info_create", -22)},
        [] {
            platform().answer("package_info_create(null)", -22);
            expectFailure(nullptr, -22);
        });
    for (const int code : PACKAGE_FAILURES) {
        const std::string number = std::to_string(static_cast<unsigned int>(code));
        add("OfUnknown" + number, {entry, APP.create, failureLine("package_info_create", code)},
            [=] {
                platform().answer(APP.create, code);
                expectFailure("org.example.app", code);
            });
        // The handle stays open: meant.
        add("Unreadable" + number,
            {entry, APP.create, APP.getVersion, failureLine("package_info_get_version", code)},
            [=] {
                platform().answer(APP.create, 0);
                platform().answer(APP.getVersion, code);
                expectFailure("org.example.app", code, OPEN);
            });
    }
    return calls;
}

const auto isInstalled = &CoreSystemInternals::isPackageInstalled;

std::string noSuchPackageLine(const std::string& name)
{
    return CORE_SYSTEM.error(INSTALLED, "No Such Package [" + name + "] <- No Such Package [%s]");
}

std::vector<LoggedCall> installedCalls()
{
    std::vector<LoggedCall> calls;
    const auto add = [&](const std::string& name, int code, const std::string& line) {
        calls.push_back({INSTALLED + name,
                         [=] {
                             platform().answer(APP.size, code);
                             EXPECT_EQ(isInstalled("org.example.app"), code == 0);
                         },
                         {APP.size, line}});
    };
    add("Yes", 0, CORE_SYSTEM.debug(INSTALLED, "Package [org.example.app] is installed"));
    const std::string other = "Other Error Case.. [package_manager_error_e] code is ";
    for (const int code : PACKAGE_FAILURES)
        add("Failed" + std::to_string(static_cast<unsigned int>(code)), code,
            code == NO_SUCH_PACKAGE ? noSuchPackageLine("org.example.app")
                                    : CORE_SYSTEM.error(INSTALLED, other + std::to_string(code) +
                                                                       " <- " + other + "%d"));
    const std::string empty = "PackageName is empty. IsPackageInstalled finish.";
    for (const char* name : {static_cast<const char*>(nullptr), ""})
        calls.push_back({INSTALLED + (name == nullptr ? "Null" : "Empty"),
                         [=] { EXPECT_FALSE(isInstalled(name)); },
                         {CORE_SYSTEM.error(INSTALLED, empty)}});
    return calls;
}

LOGGED_CALLS(PackageVersions, versionCalls());
LOGGED_CALLS(InstalledPackages, installedCalls());

class PackagesTest : public PlatformTest {};

TEST_F(PackagesTest, OddVersionsPassThroughUnchanged)
{
    for (const std::string& odd : ODD_TEXTS)
        for (const int mode : {0, 1}) {
            platform().debugMode = mode;
            install(odd);
            expectVersion(odd);
        }
}

TEST_F(PackagesTest, FailedCopyGivesNull)
{
    platform().debugMode = 1;
    install(std::string("1.2.3"));
    const FailingAllocation failure(Allocation::STRDUP);
    expectFailure("org.example.app", 0);
    EXPECT_TRUE(failure.happened());
    EXPECT_EQ(platform().trace(), answeredTrace("(null)"));
    ledger().freeAll();
}

TEST_F(PackagesTest, HandleIsReleasedBeforeTheVersionIsStored)
{
    install(std::string("1.2.3"));
    char preset = 'p';
    char* slot = &preset;
    bool released = false;
    platform().onEvent = [&](const Event& event) {
        if (event.text == APP.destroy) {
            released = true;
            EXPECT_EQ(slot, &preset);
        }
    };
    EXPECT_EQ(system.GetPackageVersion("org.example.app", &slot), 0);
    EXPECT_TRUE(released);
    ledger().freeAll();
}

TEST_F(PackagesTest, VersionOfFailedReadIsNeitherCopiedNorFreed)
{
    install({});
    platform().answer(APP.getVersion, -5, std::string("1.2.3"));
    expectFailure("org.example.app", -5, OPEN);
    EXPECT_EQ(ledger().freeAll(), Texts{"platform: 1.2.3"});
}

TEST_F(PackagesTest, OddNamesReachThePlatformUnchanged)
{
    platform().debugMode = 1;
    // Nothing is read into a name: what it says is the platform's affair.
    for (const std::string& name :
         {std::string(" org.example.app "), std::string("../../etc/passwd"), std::string("%s%n%d"),
          std::string("\xff\n"), std::string(" "), std::string(10 << 20, 'p')}) {
        const Package package(name);
        platform().answer(package.create, NO_SUCH_PACKAGE);
        expectFailure(name.c_str(), NO_SUCH_PACKAGE);
        EXPECT_TRUE(platform().trace().at(1) == package.create);

        platform().forgetEvents();
        platform().answer(package.size, 0);
        EXPECT_TRUE(isInstalled(name.c_str()));
        platform().answer(package.size, NO_SUCH_PACKAGE);
        EXPECT_FALSE(isInstalled(name.c_str()));
        // A debug line is cut, an error line is not.
        const std::string shown = "Package [" + name + "] is installed";
        EXPECT_TRUE(platform().trace() ==
                    (Texts{package.size, CORE_SYSTEM.debug(INSTALLED, shown.substr(0, 598)),
                           package.size, noSuchPackageLine(name)}))
            << name.substr(0, 100);
        platform().forgetEvents();
    }
    platform().answer("package_info_create()", -22);
    expectFailure("", -22);
}

} // namespace
