// SPDX-License-Identifier: Apache-2.0
#include "Board.h"

namespace port::deviced {
namespace {

constexpr char PATH[] = "/Org/Tizen/System/DeviceD/Board";
constexpr char UNAVAILABLE[] = "org.tizen.system.deviced.Error.NotAvailable";
constexpr char DESCRIPTION[] = R"(<node>
  <interface name="org.tizen.system.deviced.Board">
    <method name="GetSerial">
      <arg name="serial" type="s" direction="out"/>
    </method>
  </interface>
</node>)";

Result<std::string> serialOf(DeviceInfo& deviceInfo)
{
    const Result<Fact> serial = deviceInfo.serial();
    if (!serial)
        return serial.error();
    if (g_utf8_validate(serial.value().value.c_str(), -1, nullptr) == FALSE)
        return notAvailable(serial.value().source + " holds a text that the bus does not carry");
    return serial.value().value;
}

} // namespace

bool Board::show(GDBusConnection* connection)
{
    static const GDBusInterfaceVTable table = {&Board::onCall, nullptr, nullptr, {}};
    GDBusNodeInfo* const node = g_dbus_node_info_new_for_xml(DESCRIPTION, nullptr);
    const guint id = g_dbus_connection_register_object(connection, PATH, node->interfaces[0],
                                                       &table, this, nullptr, nullptr);
    g_dbus_node_info_unref(node);
    return id != 0;
}

// GLib lets only the calls through that the description tells of.
void Board::onCall(GDBusConnection*, const char*, const char*, const char*, const char*, GVariant*,
                   GDBusMethodInvocation* call, gpointer self)
{
    static_cast<Board*>(self)->answerSerial(call);
}

void Board::answerSerial(GDBusMethodInvocation* call)
{
    const Result<std::string> serial = serialOf(deviceInfo_);
    if (serial)
        g_dbus_method_invocation_return_value(call, g_variant_new("(s)", serial.value().c_str()));
    else
        g_dbus_method_invocation_return_dbus_error(call, UNAVAILABLE,
                                                   serial.error().reason.c_str());
}

} // namespace port::deviced
