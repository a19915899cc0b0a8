// SPDX-License-Identifier: Apache-2.0
#include "Serial.h"

#include <coresystem_port.h>
#include <gio/gio.h>

#include "devicefile/DeviceFile.h"

namespace cli {
namespace {

constexpr int MILLISECONDS = 1000;

// The fault of a call, in the device file that this process was started with; empty without one.
std::string faultOf(const char* call, const char* error)
{
    const std::string file = coresystem_port::deviceFile();
    if (file.empty())
        return {};
    const auto text = port::devicefile::readDeviceText(file);
    const auto device = text ? port::devicefile::parseDevice(text.value(), file) : text.error();
    const auto* const fault = device ? device.value().section("fault").find(call) : nullptr;
    return fault != nullptr ? " (" + fault->source + ": " + call + " fails with " + error + ")"
                            : "";
}

// The daemon's answer when it has no serial number; empty when it answers nothing.
std::string answerOfDaemon()
{
    GError* error = nullptr;
    GDBusConnection* const bus = g_bus_get_sync(G_BUS_TYPE_SYSTEM, nullptr, nullptr);
    if (bus == nullptr)
        return {};
    GVariant* const answer = g_dbus_connection_call_sync(
        bus, "org.tizen.system.deviced", "/Org/Tizen/System/DeviceD/Board",
        "org.tizen.system.deviced.Board", "GetSerial", nullptr, nullptr, G_DBUS_CALL_FLAGS_NONE,
        MILLISECONDS, nullptr, &error);
    std::string text;
    if (error != nullptr) {
        g_dbus_error_strip_remote_error(error);
        text = error->message;
    }
    g_clear_error(&error);
    if (answer != nullptr)
        g_variant_unref(answer);
    g_object_unref(bus);
    return text;
}

} // namespace

std::string whyNoSerial(int code)
{
    if (code == 1)
        return "no connection to the system bus" + faultOf("g_bus_get_sync", "no_bus");
    if (code == 3)
        return "the system bus does not answer in time";
    const std::string answer = answerOfDaemon();
    return "the device daemon does not answer with a serial number" +
           (answer.empty() ? faultOf("GetSerial", "not_a_string") : ": " + answer);
}

} // namespace cli
