// SPDX-License-Identifier: Apache-2.0
// `coresystem package`: the versions of installed packages.
#include <cstdlib>

#include <coresystem_port.h>
#include <package_info.h>

#include "Commands.h"
#include "Session.h"
#include "Terminal.h"
#include "Text.h"

namespace cli {
namespace {

using coresystem_port::Question;

struct Package {
    std::string name;
    Json version; // null when there is none
    bool isKnownMissing;
    std::string source; // of the version, or why there is none
};

Package ask(const std::string& name)
{
    const coresystem_port::Origins origins;
    char* slot = nullptr;
    const int code = library().GetPackageVersion(name.c_str(), &slot);
    const Json version = slot != nullptr ? Json(slot) : Json();
    std::free(slot);
    const auto origin = origins.of(Question::PackageVersion);
    return {name, version, code == PACKAGE_MANAGER_ERROR_NO_SUCH_PACKAGE,
            version.is_null() ? origin.reason : origin.source};
}

std::vector<std::string> rowOf(const Package& package)
{
    if (package.version.is_string())
        return {package.name, package.version.get<std::string>(), shortened(package.source)};
    return {package.name, package.isKnownMissing ? "not installed" : "not available",
            "(" + shortened(package.source) + ")"};
}

std::string packagesText(const std::vector<Package>& packages)
{
    Rows rows;
    for (const Package& package : packages)
        rows.push_back(rowOf(package));
    return backendLine() + "\n\n" + aligned(rows, "");
}

std::string packagesJson(const std::vector<Package>& packages)
{
    Json json = jsonAnswer();
    for (const char* const part : {"packages", "sources", "reasons"})
        json[part] = Json::object();
    for (const Package& package : packages) {
        json["packages"][package.name] = package.version;
        json[package.version.is_null() ? "reasons" : "sources"][package.name] = package.source;
    }
    return jsonText(json);
}

ExitCode runPackage(const Invocation& invocation, const std::vector<std::string>& names)
{
    std::vector<Package> packages;
    bool isComplete = true;
    for (const std::string& name : names) {
        packages.push_back(ask(name));
        isComplete = isComplete && !packages.back().version.is_null();
    }
    if (reportDeviceFileProblem())
        return BAD_DEVICE_FILE;
    writeOut(invocation.json ? packagesJson(packages) : packagesText(packages));
    return isComplete ? SUCCESS : NOT_AVAILABLE;
}

} // namespace
} // namespace cli

void cli::addPackageCommand(const Command& app, Invocation& invocation)
{
    const Command package = app.add("package", "Show package versions");
    const auto names = std::make_shared<std::vector<std::string>>();
    package.option("NAME", *names, "Packages by their exact names").required();
    package.flag("--json", invocation.json, "Print JSON");
    package.setFooter("Example: coresystem package dpkg bash\n"
                      "Exit code 3: a package is not installed, or that is not known.");
    package.onUse([&invocation, names] {
        invocation.command = [&invocation, names] { return runPackage(invocation, *names); };
    });
}
