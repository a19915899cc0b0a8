// SPDX-License-Identifier: Apache-2.0
// The version of a package, and whether it is installed.
#include "support/PlatformTest.h"

using namespace fake;
using testing::ElementsAre;
using testing::IsEmpty;
using testing::StrEq;

namespace {

const int NO_SUCH_PACKAGE = -18153359;

// Codes that the platform documents, and some that it does not.
const int PACKAGE_FAILURES[] = {-22,       -12, -5, -13, NO_SUCH_PACKAGE, NO_SUCH_PACKAGE + 1,
                                -18153358, -1,  1,  4,   INT32_MAX,       INT32_MIN};

// Nothing is read into a name: what it says is the platform's affair.
std::vector<std::string> oddNames()
{
    return {"org.example.app",
            " org.example.app ",
            "two words",
            "../../etc/passwd",
            "a\nb",
            "$(touch /tmp/x)",
            "; true",
            "%s%n%d",
            "\xff\xc3\xa9",
            std::string(1, ' '),
            std::string(10 << 20, 'p')};
}

// The call texts of one package.
struct Package {
    explicit Package(const std::string& packageName) : name(packageName) {}

    std::string name;
    std::string create = "package_info_create(" + name + ")";
    std::string getVersion = "package_info_get_version(package " + name + ")";
    std::string destroy = "package_info_destroy(package " + name + ")";
    std::string size = "package_manager_get_package_size_info(" + name + ")";
};

// A string of the platform's that nobody else may free.
class KeptString {
public:
    explicit KeptString(const std::string& text) : text_(ledger().handOut(text)) {}
    ~KeptString()
    {
        EXPECT_EQ(ledger().origin(text_).substr(0, 10), "platform: ");
        std::free(text_);
    }
    KeptString(const KeptString&) = delete;
    KeptString& operator=(const KeptString&) = delete;

    char* text() const
    {
        return text_;
    }

private:
    char* const text_;
};

// The answers of a package whose version can be read.
void install(const Package& package, char* version)
{
    platform().answer(package.create, 0);
    platform().answer(package.getVersion, 0, version);
    platform().answer(package.destroy, 0);
}

// The slot's content after a question that begins with `preset` in it.
char* versionOf(const char* name, int expectedCode, char* preset = nullptr)
{
    char* slot = preset;
    EXPECT_EQ(coreSystem().GetPackageVersion(name, &slot), expectedCode);
    return slot;
}

void expectUntouchedSlot(const char* name, int expectedCode)
{
    char preset = 'p';
    EXPECT_EQ(versionOf(name, expectedCode, &preset), &preset);
    EXPECT_EQ(preset, 'p');
}

const Package APP("org.example.app");
const std::string VERSION = "GetPackageVersion";
const std::string INSTALLED = "IsPackageInstalled";
const std::string VERSION_ENTRY = CORE_SYSTEM.debug(VERSION, "CoreSystem::GetPackageVersion");

std::string versionLine(const std::string& version)
{
    return CORE_SYSTEM.debug(VERSION, "packageVersion : " + version);
}

Texts answeredTrace(const std::string& version)
{
    return {VERSION_ENTRY, APP.create, APP.getVersion, APP.destroy, versionLine(version)};
}

std::string failureLine(const std::string& function, int code)
{
    return CORE_SYSTEM.error(VERSION, function + " failed [" + std::to_string(code) + "] <- " +
                                          function + " failed [%d]");
}

const std::vector<LoggedCall> VERSION_CALLS = {
    {"GetPackageVersionAnswered",
     [] {
         const KeptString version("1.2.3");
         install(APP, version.text());
         std::free(versionOf("org.example.app", 0));
     },
     answeredTrace("1.2.3")},
    {"GetPackageVersionAnsweredNull",
     [] {
         install(APP, nullptr);
         char preset = 'p';
         EXPECT_EQ(versionOf("org.example.app", 0, &preset), nullptr);
     },
     answeredTrace("(null)")},
    {"GetPackageVersionOfUnknownPackage",
     [] {
         platform().answer(APP.create, NO_SUCH_PACKAGE);
         expectUntouchedSlot("org.example.app", NO_SUCH_PACKAGE);
     },
     {VERSION_ENTRY, APP.create, failureLine("package_info_create", NO_SUCH_PACKAGE)}},
    {"GetPackageVersionUnreadable",
     [] {
         platform().answer(APP.create, 0);
         platform().answer(APP.getVersion, -5);
         expectUntouchedSlot("org.example.app", -5);
     },
     {VERSION_ENTRY, APP.create, APP.getVersion, failureLine("package_info_get_version", -5)}},
    {"GetPackageVersionOfNull",
     [] {
         platform().answer("package_info_create(null)", -22);
         expectUntouchedSlot(nullptr, -22);
     },
     {VERSION_ENTRY, "package_info_create(null)", failureLine("package_info_create", -22)}},
};

bool isInstalled(const char* name)
{
    return CoreSystemInternals::isPackageInstalled(name);
}

LoggedCall refusedCall(const std::string& name, const char* packageName)
{
    return {name,
            [packageName] { EXPECT_FALSE(isInstalled(packageName)); },
            {CORE_SYSTEM.error(INSTALLED, "PackageName is empty. IsPackageInstalled finish.")}};
}

LoggedCall installedCall(const std::string& name, int code, const std::string& line)
{
    return {name,
            [code] {
                platform().answer(APP.size, code);
                EXPECT_EQ(isInstalled("org.example.app"), code == 0);
            },
            {APP.size, line}};
}

std::string noSuchPackageLine(const std::string& name)
{
    return CORE_SYSTEM.error(INSTALLED, "No Such Package [" + name + "] <- No Such Package [%s]");
}

std::string otherErrorLine(int code)
{
    const std::string text = "Other Error Case.. [package_manager_error_e] code is ";
    return CORE_SYSTEM.error(INSTALLED, text + std::to_string(code) + " <- " + text + "%d");
}

const std::vector<LoggedCall> INSTALLED_CALLS = {
    refusedCall("IsPackageInstalledNull", nullptr),
    refusedCall("IsPackageInstalledEmpty", ""),
    installedCall("IsPackageInstalledYes", 0,
                  CORE_SYSTEM.debug(INSTALLED, "Package [org.example.app] is installed")),
    installedCall("IsPackageInstalledNo", NO_SUCH_PACKAGE, noSuchPackageLine("org.example.app")),
    installedCall("IsPackageInstalledFailed", -22, otherErrorLine(-22)),
};

INSTANTIATE_TEST_SUITE_P(PackageVersions, LoggedCallTest, testing::ValuesIn(VERSION_CALLS),
                         rowName<LoggedCall>);
INSTANTIATE_TEST_SUITE_P(InstalledPackages, LoggedCallTest, testing::ValuesIn(INSTALLED_CALLS),
                         rowName<LoggedCall>);

class PackagesTest : public PlatformTest {};

TEST_F(PackagesTest, VersionIsCopyBesideThePlatformsOwnString)
{
    const KeptString kept("1.2.3");
    install(APP, kept.text());
    char* const version = versionOf("org.example.app", 0);
    ASSERT_THAT(version, StrEq("1.2.3"));
    EXPECT_EQ(ledger().origin(version), "copy: 1.2.3");
    EXPECT_THAT(ledger().live(), ElementsAre("copy: 1.2.3", "platform: 1.2.3"));
    EXPECT_THAT(platform().liveHandles(), IsEmpty());
    std::free(version);
    EXPECT_THAT(ledger().live(), ElementsAre("platform: 1.2.3"));
}

TEST_F(PackagesTest, OddVersionsPassThroughUnchanged)
{
    for (const std::string& odd :
         {std::string(), std::string("%s%n"), std::string("\xff\n"), std::string(10 << 20, '9')})
        for (const int mode : {0, 1}) {
            platform().debugMode = mode;
            const KeptString kept(odd);
            install(APP, kept.text());
            char* const version = versionOf("org.example.app", 0);
            EXPECT_TRUE(version == odd);
            std::free(version);
        }
}

TEST_F(PackagesTest, FailedCopyGivesNull)
{
    platform().debugMode = 1;
    const KeptString kept("1.2.3");
    install(APP, kept.text());
    const FailingAllocation failure(Allocation::STRDUP);
    char preset = 'p';
    EXPECT_EQ(versionOf("org.example.app", 0, &preset), nullptr);
    EXPECT_TRUE(failure.happened());
    EXPECT_EQ(platform().trace(), answeredTrace("(null)"));
    EXPECT_THAT(platform().liveHandles(), IsEmpty());
}

TEST_F(PackagesTest, HandleIsReleasedBeforeTheVersionIsStored)
{
    const KeptString kept("1.2.3");
    install(APP, kept.text());
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
    EXPECT_THAT(slot, StrEq("1.2.3"));
    std::free(slot);
}

TEST_F(PackagesTest, FailedReleaseOfTheHandleIsIgnored)
{
    const KeptString kept("1.2.3");
    install(APP, kept.text());
    platform().answer(APP.destroy, -5);
    char* const version = versionOf("org.example.app", 0);
    EXPECT_THAT(version, StrEq("1.2.3"));
    std::free(version);
}

TEST_F(PackagesTest, EveryCodeOfUnknownPackageIsReturned)
{
    for (const int code : PACKAGE_FAILURES) {
        platform().forgetEvents();
        platform().answer(APP.create, code);
        expectUntouchedSlot("org.example.app", code);
        EXPECT_EQ(platform().trace(),
                  (Texts{APP.create, failureLine("package_info_create", code)}));
        EXPECT_THAT(platform().liveHandles(), IsEmpty());
    }
}

TEST_F(PackagesTest, HandleIsKeptWhenTheVersionCannotBeRead)
{
    Texts kept;
    for (const int code : PACKAGE_FAILURES) {
        platform().forgetEvents();
        platform().answer(APP.create, 0);
        platform().answer(APP.getVersion, code);
        expectUntouchedSlot("org.example.app", code);
        EXPECT_EQ(platform().trace(), (Texts{APP.create, APP.getVersion,
                                             failureLine("package_info_get_version", code)}));
        kept.push_back("package org.example.app");
        EXPECT_EQ(platform().liveHandles(), kept);
    }
}

TEST_F(PackagesTest, VersionOfFailedReadIsNeitherCopiedNorFreed)
{
    const KeptString kept("1.2.3");
    platform().answer(APP.create, 0);
    platform().answer(APP.getVersion, -5, kept.text());
    expectUntouchedSlot("org.example.app", -5);
    EXPECT_THAT(ledger().live(), ElementsAre("platform: 1.2.3"));
}

TEST_F(PackagesTest, OddNamesReachThePlatformUnchanged)
{
    for (std::string name : oddNames()) {
        const Package package(name);
        platform().forgetEvents();
        platform().answer(package.create, NO_SUCH_PACKAGE);
        expectUntouchedSlot(name.c_str(), NO_SUCH_PACKAGE);
        EXPECT_TRUE(platform().trace().at(0) == package.create);
    }
    platform().answer("package_info_create()", -22);
    expectUntouchedSlot("", -22);
}

TEST_F(PackagesTest, OnlyResultZeroIsInstalled)
{
    for (const int code : PACKAGE_FAILURES) {
        platform().forgetEvents();
        platform().answer(APP.size, code);
        EXPECT_FALSE(isInstalled("org.example.app"));
        EXPECT_EQ(platform().trace(),
                  (Texts{APP.size, code == NO_SUCH_PACKAGE ? noSuchPackageLine("org.example.app")
                                                           : otherErrorLine(code)}));
    }
    platform().answer(APP.size, 0);
    EXPECT_TRUE(isInstalled("org.example.app"));
}

TEST_F(PackagesTest, OddNamesAreAskedForAsTheyAre)
{
    platform().debugMode = 1;
    for (const std::string& name : oddNames()) {
        const Package package(name);
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
    }
}

TEST_F(PackagesTest, ErrorFormatsAreConstants)
{
    platform().answer("package_manager_get_package_size_info(%s%n)", NO_SUCH_PACKAGE);
    EXPECT_FALSE(isInstalled("%s%n"));
    const LogLine line = platform().lines().at(0);
    EXPECT_EQ(line.format, "%s: %s(%d) > No Such Package [%s]");
    EXPECT_EQ(line.text, "No Such Package [%s%n]");
}

} // namespace
