// SPDX-License-Identifier: Apache-2.0
#include "FakeBus.h"

#include <algorithm>
#include <memory>

#include <gtest/gtest.h>

#include "FakePlatform.h"

using namespace fake;

extern "C" {
gboolean __real_g_dbus_message_to_gerror(GDBusMessage* message, GError** error);
void __real_g_error_free(GError* error);
}

namespace {

template <class... Arguments>
void recordCall(const char* function, const Arguments&... arguments)
{
    const AllocationPause pause;
    platform().record(Event::Kind::CALL, callText(function, arguments...));
}

// The text of a pointer that may be null.
std::string nameOf(const void* pointer, const std::string& name)
{
    return pointer != nullptr ? name : "no " + name;
}

std::string describe(GDBusMessage* call)
{
    EXPECT_EQ(g_dbus_message_get_message_type(call), G_DBUS_MESSAGE_TYPE_METHOD_CALL);
    EXPECT_EQ(g_dbus_message_get_flags(call), G_DBUS_MESSAGE_FLAGS_NONE);
    EXPECT_EQ(g_dbus_message_get_sender(call), nullptr);
    std::string text;
    for (const char* const part :
         {g_dbus_message_get_destination(call), g_dbus_message_get_path(call),
          g_dbus_message_get_interface(call), g_dbus_message_get_member(call)})
        text += std::string(part != nullptr ? part : "nothing") + " ";
    return text + nameOf(g_dbus_message_get_body(call), "body");
}

// Fails the test when GLib finds its arguments wrong.
void onGLibMessage(const char* domain, GLogLevelFlags level, const char* message, void*)
{
    ADD_FAILURE() << (domain != nullptr ? domain : "") << " level " << level << ": " << message;
}

} // namespace

FakeBus& fake::bus()
{
    static FakeBus& instance = *new FakeBus;
    return instance;
}

FakeBus::FakeBus()
{
    g_log_set_default_handler(&onGLibMessage, nullptr);
}

void FakeBus::reset()
{
    const AllocationPause pause;
    releaseAll();
    makeReply_ = nullptr;
    callError_.reset();
    hasConnection_ = true;
    connectionError_.reset();
    producesErrors = true;
}

void FakeBus::refuseConnection(const std::optional<Error>& error)
{
    hasConnection_ = false;
    connectionError_ = error;
}

void FakeBus::answerNothing(const std::optional<Error>& error)
{
    makeReply_ = nullptr;
    callError_ = error;
}

void FakeBus::answer(GVariant* body, GDBusMessageType type, const char* errorName)
{
    const auto kept = body != nullptr
                          ? std::shared_ptr<GVariant>(g_variant_ref_sink(body), &g_variant_unref)
                          : nullptr;
    makeReply_ = [kept, type, errorName] {
        GDBusMessage* const reply = g_dbus_message_new();
        g_dbus_message_set_message_type(reply, type);
        if (errorName != nullptr)
            g_dbus_message_set_error_name(reply, errorName);
        if (kept != nullptr)
            g_dbus_message_set_body(reply, kept.get());
        return reply;
    };
}

void FakeBus::answerText(const std::string& serial)
{
    answer(g_variant_new("(s)", serial.c_str()));
}

std::vector<std::string> FakeBus::held() const
{
    std::vector<std::string> names(errors_.size(), "error");
    for (const auto& [object, name] : watched_)
        names.insert(names.end(), object->ref_count - 1, name);
    std::sort(names.begin(), names.end());
    return names;
}

GDBusConnection* FakeBus::connect(GError** error)
{
    if (!hasConnection_) {
        if (connectionError_)
            giveError(*connectionError_, error);
        return nullptr;
    }
    if (connection_ == nullptr) { // its reference is the library's first
        connection_ = G_DBUS_CONNECTION(g_object_new(G_TYPE_DBUS_CONNECTION, nullptr));
        watch("connection", connection_);
        return connection_;
    }
    return G_DBUS_CONNECTION(g_object_ref(connection_));
}

GDBusMessage* FakeBus::send(GDBusMessage* call, GError** error)
{
    watch("call", call);
    if (!makeReply_) {
        if (callError_)
            giveError(*callError_, error);
        return nullptr;
    }
    GDBusMessage* const reply = makeReply_();
    watch("reply", reply);
    return reply;
}

void FakeBus::giveError(const Error& error, GError** slot)
{
    *slot = g_error_new_literal(error.domain, error.code, error.message.c_str());
    watchError(*slot);
}

void FakeBus::watchError(const GError* error)
{
    errors_.insert(error);
}

void FakeBus::forgetError(const GError* error)
{
    EXPECT_EQ(errors_.erase(error), 1u) << "an error was freed that is not held";
}

// Keeps a reference of the fake's own, which only a release too many can take away.
void FakeBus::watch(const char* name, void* object)
{
    GObject* const watched = G_OBJECT(g_object_ref(object));
    g_object_weak_ref(watched, &onLost, this);
    watched_[watched] = name;
}

void FakeBus::onLost(void* bus, GObject* object)
{
    auto& watched = static_cast<FakeBus*>(bus)->watched_;
    ADD_FAILURE() << "the " << watched[object] << " was released too often";
    watched.erase(object);
}

void FakeBus::releaseAll()
{
    for (const auto& [object, name] : watched_) {
        g_object_weak_unref(object, &onLost, this);
        for (guint references = object->ref_count; references > 0; --references)
            g_object_unref(object);
    }
    watched_.clear();
    connection_ = nullptr;
    for (const GError* const error : errors_)
        __real_g_error_free(const_cast<GError*>(error));
    errors_.clear();
}

// Reached from the program's own calls (the linker's --wrap).
extern "C" {

void __wrap_g_type_init()
{
    recordCall("g_type_init");
}

GDBusConnection* __wrap_g_bus_get_sync(GBusType type, GCancellable* cancellable, GError** error)
{
    const AllocationPause pause;
    recordCall("g_bus_get_sync", type == G_BUS_TYPE_SYSTEM ? "system" : "another bus",
               nameOf(cancellable, "cancellable"));
    return bus().connect(error);
}

GDBusMessage* __wrap_g_dbus_connection_send_message_with_reply_sync(
    GDBusConnection* connection, GDBusMessage* message, GDBusSendMessageFlags flags, gint timeout,
    volatile guint32* serial, GCancellable* cancellable, GError** error)
{
    const AllocationPause pause;
    recordCall("send", nameOf(connection, "connection"), describe(message),
               "flags " + std::to_string(flags), "timeout " + std::to_string(timeout),
               nameOf(const_cast<guint32*>(serial), "serial"), nameOf(cancellable, "cancellable"));
    return bus().send(message, error);
}

gboolean __wrap_g_dbus_connection_flush_sync(GDBusConnection* connection, GCancellable* cancellable,
                                             GError** error)
{
    recordCall("flush", nameOf(connection, "connection"), nameOf(cancellable, "cancellable"),
               nameOf(error, "error"));
    return FALSE; // nobody looks at it
}

gboolean __wrap_g_dbus_message_to_gerror(GDBusMessage* message, GError** error)
{
    const AllocationPause pause;
    recordCall("g_dbus_message_to_gerror");
    if (!bus().producesErrors)
        return FALSE;
    const gboolean isError = __real_g_dbus_message_to_gerror(message, error);
    bus().watchError(*error);
    return isError;
}

// Visible, as the linker takes the bus library's own use for one of this: it never gets here.
__attribute__((visibility("default"))) void __wrap_g_error_free(GError* error)
{
    bus().forgetError(error);
    __real_g_error_free(error);
}

} // extern "C"
