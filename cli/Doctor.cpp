// SPDX-License-Identifier: Apache-2.0
// `coresystem doctor`: what the answers rest on, and what is missing.
#include <algorithm>
#include <utility>

#include <AESCrypto.h>
#include <CoreLogger.h>
#include <coresystem_port.h>

#include "Commands.h"
#include "Session.h"
#include "Terminal.h"
#include "Text.h"

namespace cli {
namespace {

using coresystem_port::Service;

struct LogState {
    std::string sink = coresystem_port::automaticLogSink();
    bool debugMode = CoreLogger::GetInstance()->GetDebugMode() == 1;
    std::string tag = CoreLogger::GetInstance()->GetLogTag();
    bool keyConfigured = AESCrypto::GetInstance()->HasConfiguredKey();
    std::string keyProblem = AESCrypto::GetInstance()->GetProblem();
    std::string keyWarning = AESCrypto::GetInstance()->GetWarning();
};

std::string servicesText(const std::vector<Service>& services)
{
    Rows rows;
    for (const Service& service : services)
        rows.push_back({service.found ? "found" : "missing", service.name, service.serves});
    return heading("Services") + "\n" + aligned(rows);
}

// Each reason once, with all that is missing for it and what that means.
std::string missingText(const std::vector<Service>& services)
{
    std::vector<std::pair<std::string, Rows>> reasons;
    for (const Service& service : services) {
        if (service.found)
            continue;
        auto same = std::find_if(reasons.begin(), reasons.end(),
                                 [&](const auto& each) { return each.first == service.state; });
        if (same == reasons.end())
            same = reasons.insert(same, {service.state, {}});
        same->second.push_back({service.name, service.consequence});
    }
    std::string text;
    for (const auto& [reason, rows] : reasons)
        text += wrapped(reason, 2) + aligned(rows, "    ");
    return text.empty() ? "" : "\n" + heading("Missing") + "\n" + text;
}

std::string keyText(const LogState& log)
{
    if (!log.keyProblem.empty())
        return "unusable: " + log.keyProblem;
    if (!log.keyConfigured)
        return "not configured: nobody can read debug lines (CORESYSTEM_LOG_KEY names a key file)";
    return "configured and usable" + (log.keyWarning.empty() ? "" : "; " + log.keyWarning);
}

std::string logText(const LogState& log)
{
    return heading("Log of applications") + "\n" +
           aligned({{"lines go to", log.sink},
                    {"debug mode",
                     log.debugMode ? "on" : "off (CORESYSTEM_LOG_DEBUG=1 switches it on)"},
                    {"tag",
                     log.tag.empty() ? "the library's own (CORESYSTEM_LOG_TAG sets one)" : log.tag},
                    {"key", keyText(log)}});
}

Json servicesJson(const std::vector<Service>& services)
{
    Json list = Json::array();
    for (const Service& service : services)
        list.push_back({{"name", service.name},
                        {"found", service.found},
                        {"state", service.state},
                        {"serves", service.serves},
                        {"consequence", service.consequence}});
    return list;
}

Json textOrNull(const std::string& text)
{
    return text.empty() ? Json(nullptr) : Json(text);
}

std::string doctorJson(const std::vector<Service>& services, const LogState& log)
{
    Json json = jsonAnswer();
    json["services"] = servicesJson(services);
    json["log"] = {{"sink", log.sink},
                   {"debug_mode", log.debugMode},
                   {"tag", textOrNull(log.tag)},
                   {"key_configured", log.keyConfigured},
                   {"key_usable", log.keyProblem.empty()},
                   {"key_problem", textOrNull(log.keyProblem)}};
    return jsonText(json);
}

ExitCode runDoctor(const Invocation& invocation)
{
    const std::vector<Service> services = coresystem_port::findServices();
    const LogState log;
    const bool deviceFileBad = reportDeviceFileProblem();
    writeOut(invocation.json ? doctorJson(services, log)
                             : backendLine() + "\n\n" + servicesText(services) +
                                   missingText(services) + "\n" + logText(log));
    if (deviceFileBad)
        return BAD_DEVICE_FILE;
    return log.keyProblem.empty() ? SUCCESS : FAILURE;
}

} // namespace
} // namespace cli

void cli::addDoctorCommand(const Command& app, Invocation& invocation)
{
    const Command doctor = app.add("doctor", "Check the services");
    doctor.flag("--json", invocation.json, "Print JSON");
    doctor.setFooter("Exit code 1: the log key is unusable. A missing service is no failure.");
    doctor.onUse(
        [&invocation] { invocation.command = [&invocation] { return runDoctor(invocation); }; });
}
