// SPDX-License-Identifier: Apache-2.0
#include "support/ScriptedService.h"

#include <stdexcept>
#include <thread>
#include <utility>

#include "support/PrivateBus.h"
#include "support/Wait.h"

namespace {

const char BUS_NAME[] = "org.freedesktop.DBus"; // of its interface too
const char BUS_PATH[] = "/org/freedesktop/DBus";
constexpr guint32 PRIMARY_OWNER = 1;
constexpr guint32 MAY_BE_REPLACED = 1;
constexpr guint32 REPLACE = 2;

void ownName(GDBusConnection* connection, const std::string& name)
{
    GVariant* const reply =
        g_dbus_connection_call_sync(connection, BUS_NAME, BUS_PATH, BUS_NAME, "RequestName",
                                    g_variant_new("(su)", name.c_str(), MAY_BE_REPLACED | REPLACE),
                                    nullptr, G_DBUS_CALL_FLAGS_NONE, PATIENCE_MS, nullptr, nullptr);
    guint32 result = 0;
    if (reply != nullptr)
        g_variant_get(reply, "(u)", &result);
    if (reply != nullptr)
        g_variant_unref(reply);
    if (result != PRIMARY_OWNER)
        throw std::runtime_error("cannot own " + name);
}

const char GET_ALL[] = "GetAll";
const char OBJECTS[] = "GetManagedObjects";
const char OBJECT_MANAGER[] = "org.freedesktop.DBus.ObjectManager";

// GLib hands the state to the connection's thread through a lock that the thread sanitizer does not
// see, and telling that apart would cost the time of the one who asks. This one it sees.
std::mutex& handOver()
{
    static auto& mutex = *new std::mutex;
    return mutex;
}

std::string keyOf(const std::string& method, const std::string& path)
{
    return path.empty() ? method : method + " " + path;
}

std::shared_ptr<GVariant> parsed(const std::string& body)
{
    GVariant* const value = g_variant_parse(nullptr, body.c_str(), nullptr, nullptr, nullptr);
    if (value == nullptr)
        throw std::runtime_error("no GVariant text: " + body);
    return std::shared_ptr<GVariant>(g_variant_ref_sink(value), g_variant_unref);
}

std::shared_ptr<GVariant> share(GVariant* value)
{
    return value != nullptr ? std::shared_ptr<GVariant>(value, g_variant_unref) : nullptr;
}

std::shared_ptr<GVariant> lookUp(const std::shared_ptr<GVariant>& table, const char* key)
{
    return table != nullptr ? share(g_variant_lookup_value(table.get(), key, nullptr)) : nullptr;
}

// By path, the interfaces; of the last where one stands there twice.
std::map<std::string, std::shared_ptr<GVariant>> objectsIn(const std::shared_ptr<GVariant>& body)
{
    std::map<std::string, std::shared_ptr<GVariant>> objects;
    if (body == nullptr || !g_variant_is_of_type(body.get(), G_VARIANT_TYPE("(a{oa{sa{sv}}})")))
        return objects;
    const auto all = share(g_variant_get_child_value(body.get(), 0));
    for (std::size_t i = 0; i < g_variant_n_children(all.get()); ++i) {
        const auto entry = share(g_variant_get_child_value(all.get(), i));
        const auto path = share(g_variant_get_child_value(entry.get(), 0));
        objects[g_variant_get_string(path.get(), nullptr)] =
            share(g_variant_get_child_value(entry.get(), 1));
    }
    return objects;
}

void sendAndRelease(GDBusConnection* connection, GDBusMessage* answer)
{
    g_dbus_connection_send_message(connection, answer, G_DBUS_SEND_MESSAGE_FLAGS_NONE, nullptr,
                                   nullptr);
    g_object_unref(answer);
}

void sendLate(GDBusConnection* connection, GDBusMessage* answer, std::chrono::milliseconds delay)
{
    std::this_thread::sleep_for(delay);
    sendAndRelease(connection, answer);
    g_object_unref(connection);
}

GDBusMessage* replyWith(GDBusMessage* question, GVariant* body)
{
    GDBusMessage* const message = g_dbus_message_new_method_reply(question);
    g_dbus_message_set_body(message, body);
    return message;
}

} // namespace

ScriptedService::ScriptedService(const std::string& address, const std::string& name)
    : name_(name), connection_(connectToBus(address)),
      filter_(g_dbus_connection_add_filter(connection_, &ScriptedService::onMessage,
                                           handedOn(state_), &ScriptedService::releaseState))
{
    answer("(@a{sv} {},)");
    ownName(connection_, name);
}

ScriptedService::~ScriptedService()
{
    {
        // The objects that a script refers to may end before the connection's thread does.
        const std::lock_guard<std::mutex> lock(state_->mutex);
        for (auto& [key, script] : state_->scripts)
            script = [](GDBusMessage*) -> GDBusMessage* { return nullptr; };
        for (GDBusMessage* const answer : state_->heldBack)
            g_object_unref(answer);
    }
    g_dbus_connection_remove_filter(connection_, filter_);
    g_dbus_connection_close_sync(connection_, nullptr, nullptr);
    g_object_unref(connection_);
}

bool ScriptedService::State::answer(GDBusMessage* question, std::vector<GDBusMessage*>& due)
{
    const std::string method = g_dbus_message_get_member(question);
    const std::lock_guard<std::mutex> lock(mutex);
    auto script = scripts.find(keyOf(method, g_dbus_message_get_path(question)));
    if (script == scripts.end())
        script = scripts.find(method);
    const bool isGet = script == scripts.end() && method == "Get" && scripts.count(OBJECTS) != 0;
    if (script == scripts.end() && !isGet)
        return false;
    ++timesAsked;
    if (GDBusMessage* const answer = isGet ? get(question) : script->second(question))
        heldBack.push_back(answer);
    if (heldBack.size() >= together)
        due.swap(heldBack);
    return true;
}

// A property of what the service has; where it has no objects, what it answers to whoever asks for
// them.
GDBusMessage* ScriptedService::State::get(GDBusMessage* question)
{
    if (objects == nullptr)
        return scripts[OBJECTS](question);
    const char* interface = nullptr;
    const char* property = nullptr;
    g_variant_get(g_dbus_message_get_body(question), "(&s&s)", &interface, &property);
    const auto all = objectsIn(objects);
    const auto object = all.find(g_dbus_message_get_path(question));
    const auto value =
        object != all.end() ? lookUp(lookUp(object->second, interface), property) : nullptr;
    if (value == nullptr)
        return g_dbus_message_new_method_error_literal(
            question, "org.freedesktop.DBus.Error.UnknownObject", "no such object");
    return replyWith(question, g_variant_new("(v)", value.get()));
}

// Runs on the connection's own thread, so a test may block in a call meanwhile.
GDBusMessage* ScriptedService::onMessage(GDBusConnection* connection, GDBusMessage* message,
                                         gboolean incoming, gpointer state)
{
    if (!incoming || g_dbus_message_get_message_type(message) != G_DBUS_MESSAGE_TYPE_METHOD_CALL)
        return message;
    std::vector<GDBusMessage*> due;
    const auto taken = takenFrom(state);
    if (!taken->answer(message, due))
        return message;
    const auto delay = taken->timeToAnswer();
    for (GDBusMessage* const answer : due)
        if (delay > delay.zero())
            std::thread(sendLate, g_object_ref(connection), answer, delay).detach();
        else
            sendAndRelease(connection, answer);
    g_object_unref(message);
    return nullptr;
}

gpointer ScriptedService::handedOn(const std::shared_ptr<State>& state)
{
    const std::lock_guard<std::mutex> lock(handOver());
    return new std::shared_ptr<State>(state);
}

std::shared_ptr<ScriptedService::State> ScriptedService::takenFrom(gpointer state)
{
    const std::lock_guard<std::mutex> lock(handOver());
    return *static_cast<std::shared_ptr<State>*>(state);
}

void ScriptedService::releaseState(gpointer state)
{
    const std::lock_guard<std::mutex> lock(handOver());
    delete static_cast<std::shared_ptr<State>*>(state);
}

void ScriptedService::follow(const std::string& method, Script script, const std::string& path)
{
    bool isOther = false;
    {
        const std::lock_guard<std::mutex> lock(state_->mutex);
        state_->scripts[keyOf(method, path)] = std::move(script);
        if (method == OBJECTS)
            isOther = std::exchange(state_->objects, nullptr) != nullptr;
    }
    if (isOther)
        startAgain();
}

// Whoever knew what it had before learns that this is over.
void ScriptedService::startAgain()
{
    GVariant* const released =
        g_dbus_connection_call_sync(connection_, BUS_NAME, BUS_PATH, BUS_NAME, "ReleaseName",
                                    g_variant_new("(s)", name_.c_str()), nullptr,
                                    G_DBUS_CALL_FLAGS_NONE, PATIENCE_MS, nullptr, nullptr);
    if (released != nullptr)
        g_variant_unref(released);
    ownName(connection_, name_);
}

void ScriptedService::send(const std::string& path, const char* interface, const char* signal,
                           GVariant* body)
{
    g_dbus_connection_emit_signal(connection_, nullptr, path.c_str(), interface, signal, body,
                                  nullptr);
}

// As object managers do: changed properties by themselves where only these changed.
void ScriptedService::tellChange(const std::shared_ptr<GVariant>& before,
                                 const std::shared_ptr<GVariant>& now)
{
    const auto was = objectsIn(before);
    const auto is = objectsIn(now);
    for (const auto& [path, interfaces] : was) {
        const auto there = is.find(path);
        GVariantBuilder gone;
        g_variant_builder_init(&gone, G_VARIANT_TYPE("as"));
        for (std::size_t i = 0; i < g_variant_n_children(interfaces.get()); ++i) {
            const auto entry = share(g_variant_get_child_value(interfaces.get(), i));
            const auto name = share(g_variant_get_child_value(entry.get(), 0));
            const char* const text = g_variant_get_string(name.get(), nullptr);
            const auto old = share(g_variant_get_child_value(entry.get(), 1));
            const auto fresh = there != is.end() ? lookUp(there->second, text) : nullptr;
            if (fresh == nullptr)
                g_variant_builder_add(&gone, "s", text);
            else if (!g_variant_equal(old.get(), fresh.get()) &&
                     g_variant_n_children(old.get()) == g_variant_n_children(fresh.get()))
                send(path, "org.freedesktop.DBus.Properties", "PropertiesChanged",
                     g_variant_new("(s@a{sv}@as)", text, fresh.get(),
                                   g_variant_new_strv(nullptr, 0)));
        }
        send(path, OBJECT_MANAGER, "InterfacesRemoved",
             g_variant_new("(o@as)", path.c_str(), g_variant_builder_end(&gone)));
    }
    for (const auto& [path, interfaces] : is)
        if (was.count(path) == 0 || !g_variant_equal(was.at(path).get(), interfaces.get()))
            send(path, OBJECT_MANAGER, "InterfacesAdded",
                 g_variant_new("(o@a{sa{sv}})", path.c_str(), interfaces.get()));
    g_dbus_connection_flush_sync(connection_, nullptr, nullptr);
}

GDBusMessage* ScriptedService::reply(GDBusMessage* question, const std::string& body)
{
    return replyWith(question, parsed(body).get());
}

void ScriptedService::answerOnlyTogether(std::size_t count)
{
    const std::lock_guard<std::mutex> lock(state_->mutex);
    state_->together = count;
}

void ScriptedService::releaseName()
{
    g_dbus_connection_call(connection_, BUS_NAME, BUS_PATH, BUS_NAME, "ReleaseName",
                           g_variant_new("(s)", name_.c_str()), nullptr, G_DBUS_CALL_FLAGS_NONE,
                           PATIENCE_MS, nullptr, nullptr, nullptr);
}

void ScriptedService::answerLate(std::chrono::milliseconds delay)
{
    const std::lock_guard<std::mutex> lock(state_->mutex);
    state_->delay = delay;
}

std::chrono::milliseconds ScriptedService::State::timeToAnswer()
{
    const std::lock_guard<std::mutex> lock(mutex);
    return delay;
}

int ScriptedService::timesAsked() const
{
    const std::lock_guard<std::mutex> lock(state_->mutex);
    return state_->timesAsked;
}

void ScriptedService::answer(const std::string& body)
{
    answerTo(GET_ALL, body);
}

void ScriptedService::answerTo(const std::string& method, const std::string& body,
                               const std::string& path)
{
    const Script script = [body](GDBusMessage* question) { return reply(question, body); };
    const auto now = method == OBJECTS && path.empty() ? parsed(body) : nullptr;
    if (now == nullptr || !g_variant_is_of_type(now.get(), G_VARIANT_TYPE("(a{oa{sa{sv}}})")))
        return follow(method, script, path);
    std::shared_ptr<GVariant> before;
    {
        const std::lock_guard<std::mutex> lock(state_->mutex);
        before = std::exchange(state_->objects, now);
        state_->scripts[OBJECTS] = script;
    }
    if (before != nullptr)
        tellChange(before, now);
    else
        startAgain();
}

void ScriptedService::emit(const std::string& path, const std::string& interface,
                           const std::string& signal, const std::string& body)
{
    g_dbus_connection_emit_signal(connection_, nullptr, path.c_str(), interface.c_str(),
                                  signal.c_str(), parsed(body).get(), nullptr);
    g_dbus_connection_flush_sync(connection_, nullptr, nullptr);
}

void ScriptedService::fail(const std::string& errorName, const std::string& message,
                           const std::string& method)
{
    follow(method, [errorName, message](GDBusMessage* question) {
        return g_dbus_message_new_method_error_literal(question, errorName.c_str(),
                                                       message.c_str());
    });
}

void ScriptedService::keepSilent(const std::string& method)
{
    whenAsked([] {}, method);
}

void ScriptedService::whenAsked(std::function<void()> act, const std::string& method)
{
    follow(method, [act](GDBusMessage*) -> GDBusMessage* {
        act();
        return nullptr;
    });
}

void ScriptedService::leaveWhenAsked(const std::string& method)
{
    whenAsked([this] { g_dbus_connection_close(connection_, nullptr, nullptr, nullptr); }, method);
}
