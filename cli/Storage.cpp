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
    return backendLine() + "\n\n" +
           aligned({{question.str(), isFree ? "yes" : "no", shortened(source)}}, "");
}

std::string storageJson(double megabytes, bool isFree, const std::string& source)
{
    Json json = jsonAnswer();
    json["at_least_mb"] = megabytes;
    json["available"] = isFree;
    json["source"] = source;
    return jsonText(json);
}

// Takes every number from 0; a stream reads neither NaN nor the infinite.
bool parseMegabytes(const std::string& text, double& megabytes)
{
    std::istringstream number(text);
    number.imbue(std::locale::classic());
    return number >> megabytes && number.eof() && megabytes >= 0;
}

std::string problemOf(const std::string& text)
{
    double megabytes = 0;
    return parseMegabytes(text, megabytes)
               ? ""
               : quoted(text) + " is no size: write megabytes as a number from 0";
}

ExitCode runStorage(const Invocation& invocation, double megabytes)
{
    const coresystem_port::Origins origins;
    const bool isFree = library().IsSystemMemoryAvailable(megabytes);
    const auto origin = origins.of(coresystem_port::Question::Storage);
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
    const Command storage = app.add("storage", "Check free storage");
    const auto size = std::make_shared<std::string>();
    storage.option("--at-least", *size, "Megabytes (1048576 bytes) of which more must be free")
        .called("MB")
        .checkedBy(problemOf)
        .required();
    storage.flag("--json", invocation.json, "Print JSON");
    storage.setFooter("Example: coresystem storage --at-least 500\n"
                      "Exit code 1: less is free; 3: not known.");
    storage.onUse([&invocation, size] {
        invocation.command = [&invocation, size] {
            double megabytes = 0;
            parseMegabytes(*size, megabytes);
            return runStorage(invocation, megabytes);
        };
    });
}
