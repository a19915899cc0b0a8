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

Result<std::string> serialOf(Backend& backend)
{
    const Result<Fact> serial = backend.get<Question::DeviceSerial>();
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

void CallLimit::apply(GDBusConnection* connection)
{
    g_dbus_connection_add_filter(connection, &CallLimit::onMessage, this, nullptr);
}

// Counts each outgoing reply as the end of an incoming call, whoever of this process sends it.
GDBusMessage* CallLimit::onMessage(GDBusConnection* connection, GDBusMessage* message,
                                   gboolean isIncoming, gpointer self)
{
    auto& limit = *static_cast<CallLimit*>(self);
    const bool isCall = g_dbus_message_get_message_type(message) == G_DBUS_MESSAGE_TYPE_METHOD_CALL;
    const char* const other = isIncoming != FALSE ? g_dbus_message_get_sender(message)
                                                  : g_dbus_message_get_destination(message);
    if (other == nullptr || isCall != (isIncoming != FALSE))
        return message;
    if (!isCall) {
        limit.giveBack(other);
        return message;
    }
    const Owned<GDBusMessage> call(message);
    const bool wantsAnswer =
        (g_dbus_message_get_flags(message) & G_DBUS_MESSAGE_FLAGS_NO_REPLY_EXPECTED) == 0;
    if (!wantsAnswer) // nobody hears it
        return nullptr;
    if (limit.take(other))
        return g_object_ref(message);
    const Owned<GDBusMessage> refusal(g_dbus_message_new_method_error_literal(
        message, "org.freedesktop.DBus.Error.LimitsExceeded", "too many calls under way"));
    g_dbus_connection_send_message(connection, refusal.get(), G_DBUS_SEND_MESSAGE_FLAGS_NONE,
                                   nullptr, nullptr);
    return nullptr;
}

// Counts a refused call too: its refusal gives it back.
bool CallLimit::take(const std::string& caller)
{
    const std::lock_guard<std::mutex> lock(mutex_);
    ++all_;
    return ++underWay_[caller] <= CALLS_OF_ONE && all_ <= CALLS_OF_ALL;
}

void CallLimit::giveBack(const std::string& caller)
{
    const std::lock_guard<std::mutex> lock(mutex_);
    const auto found = underWay_.find(caller);
    if (found == underWay_.end()) // no call, as the answer that the bus gives to itself
        return;
    --all_;
    if (--found->second == 0)
        underWay_.erase(found);
}

bool Board::show(GDBusConnection* connection)
{
    limit_.apply(connection);
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
    const CallFault fault = backend_.faults().meet("GetSerial").value_or(CallFault());
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
    const Result<std::string> serial = serialOf(backend_);
    if (serial)
        g_dbus_method_invocation_return_value(call, g_variant_new("(s)", serial.value().c_str()));
    else
        g_dbus_method_invocation_return_dbus_error(call, UNAVAILABLE,
                                                   serial.error().reason.c_str());
}

} // namespace port::deviced
