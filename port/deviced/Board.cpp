// SPDX-License-Identifier: Apache-2.0
#include "Board.h"

#include <memory>

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

// A call that waits for its answer.
struct Late {
    Board* board;
    GDBusMethodInvocation* call;
    CallFault fault;
};

// Past GLib, which would not let a value of another type than the described one out.
void tellNumber(GDBusMethodInvocation* call)
{
    const Owned<GDBusMessage> reply(
        g_dbus_message_new_method_reply(g_dbus_method_invocation_get_message(call)));
    g_dbus_message_set_body(reply.get(), g_variant_new("(u)", 0U));
    g_dbus_connection_send_message(g_dbus_method_invocation_get_connection(call), reply.get(),
                                   G_DBUS_SEND_MESSAGE_FLAGS_NONE, nullptr, nullptr);
    g_object_unref(call);
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
    static_cast<Board*>(self)->meetSerial(call);
}

void Board::meetSerial(GDBusMethodInvocation* call)
{
    const CallFault fault = faults_.meet("GetSerial").value_or(CallFault());
    if (fault.delay.count() == 0)
        answerSerial(call, fault);
    else // the other callers are answered meanwhile
        g_timeout_add(static_cast<guint>(fault.delay.count()), &Board::onDelayEnd,
                      new Late{this, call, fault});
}

gboolean Board::onDelayEnd(gpointer late)
{
    const std::unique_ptr<Late> waited(static_cast<Late*>(late));
    waited->board->answerSerial(waited->call, waited->fault);
    return G_SOURCE_REMOVE;
}

void Board::answerSerial(GDBusMethodInvocation* call, const CallFault& fault)
{
    switch (fault.answer) {
    case CallFault::Answer::BusError:
        g_dbus_method_invocation_return_dbus_error(call, fault.busError.c_str(),
                                                   fault.reason.c_str());
        break;
    case CallFault::Answer::NotAString:
        tellNumber(call);
        break;
    default:
        tellSerial(call);
    }
}

void Board::tellSerial(GDBusMethodInvocation* call)
{
    const Result<std::string> serial = serialOf(deviceInfo_);
    if (serial)
        g_dbus_method_invocation_return_value(call, g_variant_new("(s)", serial.value().c_str()));
    else
        g_dbus_method_invocation_return_dbus_error(call, UNAVAILABLE,
                                                   serial.error().reason.c_str());
}

} // namespace port::deviced
