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

// A main context of this thread's own, in which GLib's answers arrive.
class PrivateContext {
public:
    PrivateContext() : context_(g_main_context_new())
    {
        g_main_context_push_thread_default(context_.get());
    }
    ~PrivateContext()
    {
        g_main_context_pop_thread_default(context_.get());
    }
    PrivateContext(const PrivateContext&) = delete;
    PrivateContext& operator=(const PrivateContext&) = delete;

    void attach(GSource* source) const
    {
        g_source_attach(source, context_.get());
    }
    template <typename Predicate>
    void runUntil(Predicate done) const
    {
        while (!done())
            g_main_context_iteration(context_.get(), TRUE);
    }

private:
    Owned<GMainContext> context_;
};

// Connecting has no time-out of its own: a timer on a private main context cancels it.
class TimedConnect {
public:
    explicit TimedConnect(const char* address)
        : cancellable_(g_cancellable_new()), timer_(g_timeout_source_new(Bus::CONNECT_TIMEOUT_MS))
    {
        g_source_set_callback(timer_.get(), &TimedConnect::onTimeout, this, nullptr);
        context_.attach(timer_.get());
        g_dbus_connection_new_for_address(address, BUS_CLIENT, nullptr, cancellable_.get(),
                                          &TimedConnect::onReady, this);
        context_.runUntil([this] { return done_; });
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

    PrivateContext context_;
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
    if (g_error_matches(&error, G_DBUS_ERROR, G_DBUS_ERROR_ACCESS_DENIED) ||
        g_error_matches(&error, G_DBUS_ERROR, G_DBUS_ERROR_AUTH_FAILED))
        return denied(service + ": " + messageOf(error));
    return notAvailable(service + ": " + messageOf(error));
}

Owned<GDBusMessage> messageOf(const Question& question)
{
    const BusObject& object = question.object;
    Owned<GDBusMessage> message(g_dbus_message_new_method_call(object.name, object.path,
                                                               object.interface, question.method));
    if (question.arguments)
        g_dbus_message_set_body(message.get(), question.arguments.get());
    if (object.start == Start::Never)
        g_dbus_message_set_flags(message.get(), G_DBUS_MESSAGE_FLAGS_NO_AUTO_START);
    return message;
}

// Sends several questions and waits until each is answered, or its time is over.
class Exchange {
public:
    Exchange(GDBusConnection* bus, const std::vector<Question>& questions, int timeoutMs)
        : questions_(questions), calls_(questions.size())
    {
        for (std::size_t i = 0; i < calls_.size(); ++i)
            g_dbus_connection_send_message_with_reply(
                bus, messageOf(questions[i]).get(), G_DBUS_SEND_MESSAGE_FLAGS_NONE, timeoutMs,
                nullptr, nullptr, &Exchange::onReply, &calls_[i]);
        context_.runUntil([this] {
            return std::all_of(calls_.begin(), calls_.end(),
                               [](const Call& call) { return call.reply || call.error; });
        });
    }

    std::vector<Result<Reply>> replies()
    {
        std::vector<Result<Reply>> all;
        for (std::size_t i = 0; i < calls_.size(); ++i)
            all.push_back(replyTo(questions_[i], calls_[i]));
        return all;
    }

private:
    struct Call {
        Owned<GDBusMessage> reply;
        Owned<GError> error;
    };

    static void onReply(GObject* bus, GAsyncResult* result, gpointer target)
    {
        auto& call = *static_cast<Call*>(target);
        call.reply.reset(g_dbus_connection_send_message_with_reply_finish(
            reinterpret_cast<GDBusConnection*>(bus), result, Out(call.error)));
    }

    static Result<Reply> replyTo(const Question& question, Call& call)
    {
        if (call.reply)
            g_dbus_message_to_gerror(call.reply.get(), Out(call.error));
        if (call.error)
            return callError(question.object.name, *call.error);
        GVariant* const body = g_dbus_message_get_body(call.reply.get());
        if (body == nullptr || !g_variant_is_of_type(body, G_VARIANT_TYPE(question.replyType)))
            return notAvailable(std::string(question.object.name) + ": the reply to " +
                                question.method + " is of another type");
        const char* const sender = g_dbus_message_get_sender(call.reply.get());
        return Reply{share(g_variant_ref(body)), sender != nullptr ? sender : ""};
    }

    const PrivateContext context_;
    const std::vector<Question>& questions_;
    std::vector<Call> calls_;
};

int millisecondsUntil(gint64 end)
{
    return static_cast<int>(std::max<gint64>(0, end - g_get_monotonic_time()) / 1000);
}

bool hasFailure(const std::vector<Result<Reply>>& replies)
{
    return std::any_of(replies.begin(), replies.end(),
                       [](const Result<Reply>& reply) { return !reply; });
}

// "hostname1" of "org.freedesktop.hostname1".
std::string shortName(const BusObject& object)
{
    const std::string_view name(object.name);
    return std::string(name.substr(name.rfind('.') + 1));
}

Question namesOfBus(const char* method)
{
    return {BUS_ITSELF, method, nullptr, "(as)"};
}

bool isListed(const Reply& names, const char* name)
{
    const Variant list = share(g_variant_get_child_value(names.body.get(), 0));
    for (std::size_t i = 0; i < g_variant_n_children(list.get()); ++i) {
        const Variant item = share(g_variant_get_child_value(list.get(), i));
        if (std::string_view(name) == g_variant_get_string(item.get(), nullptr))
            return true;
    }
    return false;
}

// Looks into the names that are on the bus, and those that could be.
Result<std::string> stateIn(const std::vector<Result<Reply>>& lists, const BusObject& service)
{
    for (const Result<Reply>& list : lists)
        if (!list)
            return list.error();
    if (isListed(lists[0].value(), service.name))
        return std::string("running");
    if (!isListed(lists[1].value(), service.name))
        return notAvailable("not on the system bus");
    if (service.start == Start::Never)
        return notAvailable("installed, but not running");
    return std::string("starts on demand");
}

} // namespace

Question propertiesOf(const BusObject& object)
{
    const BusObject target = {object.name, object.path, "org.freedesktop.DBus.Properties",
                              object.start};
    return {target, "GetAll", share(g_variant_ref_sink(g_variant_new("(s)", object.interface))),
            "(a{sv})"};
}

Question objectsBelow(const BusObject& manager)
{
    const BusObject target = {manager.name, manager.path, "org.freedesktop.DBus.ObjectManager",
                              manager.start};
    return {target, "GetManagedObjects", nullptr, "(a{oa{sa{sv}}})"};
}

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

std::vector<Result<Reply>> Bus::ask(const std::vector<Question>& questions, int timeoutMs)
{
    const gint64 end = g_get_monotonic_time() + timeoutMs * G_GINT64_CONSTANT(1000);
    for (bool again = true;; again = false) {
        const Result<Connection> bus = connection();
        if (!bus)
            return {questions.size(), bus.error()};
        std::vector<Result<Reply>> replies =
            Exchange(bus.value().get(), questions, millisecondsUntil(end)).replies();
        // A bus that was restarted shows only now: ask the new one.
        if (!again || !hasFailure(replies) || !g_dbus_connection_is_closed(bus.value().get()))
            return replies;
    }
}

Result<Reply> Bus::ask(const Question& question)
{
    return ask(std::vector<Question>{question}).front();
}

Result<Properties> Bus::properties(const BusObject& object)
{
    const Result<Reply> reply = ask(propertiesOf(object));
    if (!reply)
        return reply.error();
    return propertiesIn(reply.value().body);
}

Result<Fact> Bus::textProperty(const BusObject& object, std::initializer_list<const char*> names)
{
    const Result<Properties> all = properties(object);
    if (!all)
        return all.error();
    std::string problems;
    for (const char* const name : names) {
        const Result<std::string> text = all.value().text(name);
        if (text)
            return Fact{text.value(), shortName(object) + " " + name};
        problems += (problems.empty() ? ": " : ", ") + text.error().reason;
    }
    return notAvailable(shortName(object) + problems);
}

std::vector<Result<std::string>> Bus::statesOf(const std::vector<BusObject>& services)
{
    const std::vector<Result<Reply>> lists =
        ask({namesOfBus("ListNames"), namesOfBus("ListActivatableNames")});
    std::vector<Result<std::string>> states;
    states.reserve(services.size());
    for (const BusObject& service : services)
        states.push_back(stateIn(lists, service));
    return states;
}

} // namespace port::linux_backend
