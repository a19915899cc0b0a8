// SPDX-License-Identifier: Apache-2.0
#include "Bus.h"

#include <algorithm>
#include <string_view>

#include <unistd.h>

namespace port::linux_backend {
namespace {

constexpr BusObject BUS_ITSELF = {"org.freedesktop.DBus", "/org/freedesktop/DBus",
                                  "org.freedesktop.DBus", Start::Never};

std::string messageOf(GError& error)
{
    g_dbus_error_strip_remote_error(&error);
    return error.message;
}

// Connecting has no time-out of its own: a timer on a private main context cancels it.
class TimedConnect {
public:
    explicit TimedConnect(const char* address)
        : context_(g_main_context_new()), cancellable_(g_cancellable_new()),
          timer_(g_timeout_source_new(Bus::CONNECT_TIMEOUT_MS))
    {
        g_main_context_push_thread_default(context_.get());
        g_source_set_callback(timer_.get(), &TimedConnect::onTimeout, this, nullptr);
        g_source_attach(timer_.get(), context_.get());
        g_dbus_connection_new_for_address(
            address,
            static_cast<GDBusConnectionFlags>(G_DBUS_CONNECTION_FLAGS_AUTHENTICATION_CLIENT |
                                              G_DBUS_CONNECTION_FLAGS_MESSAGE_BUS_CONNECTION),
            nullptr, cancellable_.get(), &TimedConnect::onReady, this);
        while (!done_)
            g_main_context_iteration(context_.get(), TRUE);
    }
    ~TimedConnect()
    {
        g_main_context_pop_thread_default(context_.get());
    }
    TimedConnect(const TimedConnect&) = delete;
    TimedConnect& operator=(const TimedConnect&) = delete;

    Result<Connection> result()
    {
        if (connection_ == nullptr)
            return notAvailable(timedOut_ ? "the system bus does not answer"
                                          : "no system bus: " + messageOf(*error_));
        g_dbus_connection_set_exit_on_close(connection_, FALSE);
        return Connection(connection_, GLibRelease());
    }

private:
    static gboolean onTimeout(gpointer self)
    {
        auto& connect = *static_cast<TimedConnect*>(self);
        connect.timedOut_ = true;
        g_cancellable_cancel(connect.cancellable_.get());
        return G_SOURCE_REMOVE;
    }

    static void onReady(GObject*, GAsyncResult* result, gpointer self)
    {
        auto& connect = *static_cast<TimedConnect*>(self);
        connect.connection_ = g_dbus_connection_new_for_address_finish(result, Out(connect.error_));
        connect.done_ = true;
    }

    Owned<GMainContext> context_;
    Owned<GCancellable> cancellable_;
    Owned<GSource> timer_;
    Owned<GError> error_;
    GDBusConnection* connection_ = nullptr;
    bool timedOut_ = false;
    bool done_ = false;
};

Result<Connection> connect()
{
    Owned<GError> error;
    const Owned<char> address(
        g_dbus_address_get_for_bus_sync(G_BUS_TYPE_SYSTEM, nullptr, Out(error)));
    if (!address)
        return notAvailable("no system bus: " + messageOf(*error));
    return TimedConnect(address.get()).result();
}

Error callError(const char* name, GError& error)
{
    const std::string service(name);
    if (g_error_matches(&error, G_DBUS_ERROR, G_DBUS_ERROR_SERVICE_UNKNOWN) ||
        g_error_matches(&error, G_DBUS_ERROR, G_DBUS_ERROR_NAME_HAS_NO_OWNER))
        return notAvailable(service + " is not on the system bus");
    if (g_error_matches(&error, G_IO_ERROR, G_IO_ERROR_TIMED_OUT))
        return notAvailable(service + " did not answer in time");
    return notAvailable(service + ": " + messageOf(error));
}

// "hostname1" of "org.freedesktop.hostname1".
std::string shortName(const BusObject& object)
{
    const std::string_view name(object.name);
    return std::string(name.substr(name.rfind('.') + 1));
}

Result<std::string> textOf(const Variant& properties, const char* name)
{
    const Owned<GVariant> value(g_variant_lookup_value(properties.get(), name, nullptr));
    if (!value)
        return notAvailable(std::string(name) + " is missing");
    if (!g_variant_is_of_type(value.get(), G_VARIANT_TYPE_STRING))
        return notAvailable(std::string(name) + " is no text");
    const std::string text = g_variant_get_string(value.get(), nullptr);
    if (text.empty())
        return notAvailable(std::string(name) + " is empty");
    return text;
}

} // namespace

bool Bus::isOwnedByThisProcess()
{
    pid_t owner = 0;
    return owner_.compare_exchange_strong(owner, getpid()) || owner == getpid();
}

Result<Connection> Bus::connection()
{
    if (!isOwnedByThisProcess())
        return notAvailable("the process was forked after it had asked the system bus");
    const unsigned attemptsBefore = attempts_;
    const std::lock_guard<std::mutex> lock(mutex_);
    if (connection_ && !g_dbus_connection_is_closed(connection_.get()))
        return connection_;
    // Threads that waited while another one tried in vain must not wait again, one after the other.
    if (attempts_ != attemptsBefore)
        return problem_;
    const Result<Connection> fresh = connect();
    connection_ = fresh ? fresh.value() : nullptr;
    problem_ = fresh ? notAvailable("the system bus went away") : fresh.error();
    ++attempts_;
    return fresh;
}

Result<Variant> Bus::call(const BusObject& object, const char* method, GVariant* arguments,
                          const char* replyType)
{
    const Variant sunkArguments(g_variant_ref_sink(arguments), GLibRelease());
    const GDBusCallFlags flags =
        object.start == Start::Never ? G_DBUS_CALL_FLAGS_NO_AUTO_START : G_DBUS_CALL_FLAGS_NONE;
    for (bool again = true;; again = false) {
        const Result<Connection> bus = connection();
        if (!bus)
            return bus.error();
        Owned<GError> error;
        GVariant* const reply = g_dbus_connection_call_sync(
            bus.value().get(), object.name, object.path, object.interface, method,
            sunkArguments.get(), G_VARIANT_TYPE(replyType), flags, CALL_TIMEOUT_MS, nullptr,
            Out(error));
        if (reply != nullptr)
            return Variant(reply, GLibRelease());
        // A bus that was restarted shows only now: ask the new one.
        if (!again || !g_dbus_connection_is_closed(bus.value().get()))
            return callError(object.name, *error);
    }
}

Result<Variant> Bus::properties(const BusObject& object)
{
    const BusObject target = {object.name, object.path, "org.freedesktop.DBus.Properties",
                              object.start};
    const Result<Variant> reply =
        call(target, "GetAll", g_variant_new("(s)", object.interface), "(a{sv})");
    if (!reply)
        return reply;
    return Variant(g_variant_get_child_value(reply.value().get(), 0), GLibRelease());
}

Result<Fact> Bus::textProperty(const BusObject& object, std::initializer_list<const char*> names)
{
    const Result<Variant> all = properties(object);
    if (!all)
        return all.error();
    std::string problems;
    for (const char* const name : names) {
        const Result<std::string> text = textOf(all.value(), name);
        if (text)
            return Fact{text.value(), shortName(object) + " " + name};
        problems += (problems.empty() ? ": " : ", ") + text.error().reason;
    }
    return notAvailable(shortName(object) + problems);
}

Result<std::vector<std::string>> Bus::names(const char* method)
{
    const Result<Variant> reply = call(BUS_ITSELF, method, g_variant_new("()"), "(as)");
    if (!reply)
        return reply.error();
    std::vector<std::string> found;
    const Owned<GVariant> list(g_variant_get_child_value(reply.value().get(), 0));
    for (std::size_t i = 0; i < g_variant_n_children(list.get()); ++i) {
        const Owned<GVariant> name(g_variant_get_child_value(list.get(), i));
        found.push_back(g_variant_get_string(name.get(), nullptr));
    }
    return found;
}

Result<std::string> Bus::stateOf(const std::string& name)
{
    const char* const states[][2] = {{"ListNames", "running"},
                                     {"ListActivatableNames", "starts on demand"}};
    for (const auto& [method, state] : states) {
        const Result<std::vector<std::string>> listed = names(method);
        if (!listed)
            return listed.error();
        if (std::count(listed.value().begin(), listed.value().end(), name) != 0)
            return std::string(state);
    }
    return notAvailable("not on the system bus");
}

} // namespace port::linux_backend
