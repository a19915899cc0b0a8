// SPDX-License-Identifier: Apache-2.0
// How this run of the command meets the library: which backend answers, where log lines go.
#ifndef CLI_SESSION_H
#define CLI_SESSION_H

#include <string>

#include <CoreSystem.h>
#include <nlohmann/json.hpp>

namespace cli {

using Json = nlohmann::ordered_json;

/// The library's instance; throws when there is none.
CoreSystem& library();

/// Picks the device file of --device; must come before the library is first used.
void chooseDevice(const std::string& deviceFile);

/// Log lines go to standard error when the user wants to see them, otherwise nowhere.
void chooseLogSink(bool verbose);

/// While it lives nothing is logged, not even in debug mode.
class Silence {
public:
    Silence();
    ~Silence();
    Silence(const Silence&) = delete;
    Silence& operator=(const Silence&) = delete;

private:
    const int debugMode_;
    const bool wasLogging_;
};

/// "backend: simulator (device file phone.toml)"
std::string backendLine();

/// A source or a reason without the name of the device file, which backendLine() says: of a line of
/// it "line 12". As it is with --wide.
std::string shortened(const std::string& text);

/// Tells the user what is wrong with the device file; false when nothing is.
bool reportDeviceFileProblem();

/// An object that begins with what every JSON answer begins with.
Json jsonAnswer();

/// The text of a JSON answer; invalid UTF-8 is replaced.
std::string jsonText(const Json& json);

} // namespace cli

#endif
