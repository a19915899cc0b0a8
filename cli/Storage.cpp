// SPDX-License-Identifier: Apache-2.0
// `coresystem storage`: whether enough of the internal storage is free.
#include <iomanip>
#include <limits>
#include <sstream>

#include <coresystem_port.h>

#include "Commands.h"
#include "Session.h"
#include "Terminal.h"
#include "Text.h"

namespace cli {
namespace {

std::string storageText(double megabytes, bool isFree, const std::string& source)
{
    std::ostringstream question;
    question << std::setprecision(std::numeric_limits<double>::digits10) << "more than "
             << megabytes << " MB free";
    return backendLine() + "\n\n" + aligned({{question.str(), isFree ? "yes" : "no", source}}, "");
}

std::string storageJson(double megabytes, bool isFree, const std::string& source)
{
    Json json = jsonAnswer();
    json["at_least_mb"] = megabytes;
    json["available"] = isFree;
    json["source"] = source;
    return jsonText(json);
}

ExitCode runStorage(const Invocation& invocation, double megabytes)
{
    const bool isFree = library().IsSystemMemoryAvailable(megabytes);
    const auto origin = coresystem_port::lastOrigin(coresystem_port::Question::Storage);
    if (reportDeviceFileProblem())
        return BAD_DEVICE_FILE;
    if (!origin.available) {
        complain("the storage cannot be read: " + printable(origin.reason) +
                 "; applications are told no");
        return NOT_AVAILABLE;
    }
    writeOut((invocation.json ? storageJson : storageText)(megabytes, isFree, origin.source));
    return isFree ? SUCCESS : FAILURE;
}

} // namespace
} // namespace cli

void cli::addStorageCommand(const Command& app, Invocation& invocation)
{
    const Command storage = app.add("storage", "Print whether enough internal storage is free");
    const auto megabytes = std::make_shared<double>(0);
    storage
        .option("--at-least", *megabytes,
                "How many megabytes (of 1048576 bytes); exactly as many are not enough")
        .called("MB")
        .required();
    storage.flag("--json", invocation.json, "Print one JSON object");
    storage.setFooter("Example: coresystem storage --at-least 500\n"
                      "Exit code 1: less is free; 3: nobody knows.");
    storage.onUse([&invocation, megabytes] {
        invocation.command = [&invocation, megabytes] {
            return runStorage(invocation, *megabytes);
        };
    });
}
