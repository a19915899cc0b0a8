// SPDX-License-Identifier: Apache-2.0
#include "Session.h"

#include <cstdlib>
#include <new>

#include <CoreLogger.h>
#include <coresystem_port.h>

#include "Commands.h"
#include "Terminal.h"
#include "Text.h"

namespace {

using coresystem_port::LogSink;

bool logging = false;

void setLogging(bool on)
{
    logging = on;
    coresystem_port::setLogSink(on ? LogSink::StandardError : LogSink::None);
}

} // namespace

CoreSystem& cli::library()
{
    CoreSystem* const instance = CoreSystem::GetInstance();
    if (instance == nullptr)
        throw std::bad_alloc();
    return *instance;
}

void cli::chooseDevice(const std::string& deviceFile)
{
    if (setenv("CORESYSTEM_DEVICE", deviceFile.c_str(), 1) != 0)
        throw std::bad_alloc();
}

void cli::chooseLogSink(bool verbose)
{
    setLogging(verbose || CoreLogger::GetInstance()->GetDebugMode() == 1);
}

cli::Silence::Silence()
    : debugMode_(CoreLogger::GetInstance()->GetDebugMode()), wasLogging_(logging)
{
    CoreLogger::GetInstance()->SetDebugMode(0);
    setLogging(false);
}

cli::Silence::~Silence()
{
    setLogging(wasLogging_);
    CoreLogger::GetInstance()->SetDebugMode(debugMode_);
}

std::string cli::backendLine()
{
    const std::string file = coresystem_port::deviceFile();
    std::string place = "this machine's services";
    if (!file.empty())
        place = "device file " + printable(file) +
                (coresystem_port::deviceFileProblem().empty() ? "" : ", unusable");
    return "backend: " + coresystem_port::backendName() + " (" + place + ")";
}

std::string cli::shortened(const std::string& text)
{
    const std::string file = coresystem_port::deviceFile();
    if (file.empty() || isFullWidth())
        return text;
    std::string rest = text;
    std::string shown;
    for (std::size_t at = 0; (at = rest.find(file)) != std::string::npos;) {
        shown += rest.substr(0, at);
        rest.erase(0, at + file.size());
        if (rest.size() > 1 && rest[0] == ':' && rest[1] >= '0' && rest[1] <= '9')
            shown += "line ", rest.erase(0, 1);
        else if (rest.rfind(": ", 0) == 0)
            rest.erase(0, 2);
        else
            shown += "device file";
    }
    return shown + rest;
}

bool cli::reportDeviceFileProblem()
{
    const std::string problem = coresystem_port::deviceFileProblem();
    if (!problem.empty())
        writeErrorLine(printable(problem));
    return !problem.empty();
}

cli::Json cli::jsonAnswer()
{
    Json json = {{"schema", 1}, {"backend", coresystem_port::backendName()}};
    if (const std::string file = coresystem_port::deviceFile(); !file.empty())
        json["device_file"] = file;
    return json;
}

std::string cli::jsonText(const Json& json)
{
    return escapedInJson(json.dump(2, ' ', false, Json::error_handler_t::replace)) + "\n";
}
