// SPDX-License-Identifier: Apache-2.0
#include "support/ScriptedService.h"

#include <stdexcept>
#include <thread>
#include <utility>

using port::share;
using port::Variant;

namespace {

constexpr guint32 PRIMARY_OWNER = 1;
constexpr guint32 MAY_BE_REPLACED = 1;
constexpr guint32 REPLACE = 2;

void ownName(const BusClient& client, const std::string& name)
{
    const auto reply = client.askBus(
        "RequestName", g_variant_new("(su)", name.c_str(), MAY_BE_REPLACED | REPLACE));
    guint32 result = 0;
    if (reply)
        g_variant_get(reply.get(), "(u)", &result);
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

Variant parsed(const std::string& body)
{
    GVariant* const value = g_variant_parse(nullptr, body.c_str(), nullptr, nullptr, nullptr);
    if (value == nullptr)
        throw std::runtime_error("no GVariant text: " + body);
    return share(g_variant_ref_sink(value));
}

Variant child(const Variant& of, std::size_t index)
{
    return share(g_variant_get_child_value(of.get(), index));
}

Variant lookUp(const Variant& table, const char* key)
{
    return table != nullptr ? share(g_variant_lookup_value(table.get(), key, nullptr)) : nullptr;
}

// By path, the interfaces; of the last where one stands there twice.
std::map<std::string, Variant> objectsIn(const Variant& body)
{
    std::map<std::string, Variant> objects;
    if (body == nullptr || !g_variant_is_of_type(body.get(), G_VARIANT_TYPE("(a{oa{sa{sv}}})")))
        return objects;
    const auto all = child(body, 0);
    for (std::size_t i = 0; i < g_variant_n_children(all.get()); ++i) {
        const auto entry = child(all, i);
        objects[g_variant_get_string(child(entry, 0).get(), nullptr)] = child(entry, 1);
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
    : name_(name), client_(address),
      filter_(g_dbus_connection_add_filter(client_.connection(), &ScriptedService::onMessage,
                                           handedOn(state_), &ScriptedService::releaseState))
{
    answer("(@a{sv} {},)");
    ownName(client_, name);
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
    g_dbus_connection_remove_filter(client_.connection(), filter_);
}

bool ScriptedService::State::answer(GDBusMessage* question, std::vector<GDBusMessage*>& due,
                                    std::chrono::milliseconds& after)
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
    after = delay;
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
    std::chrono::milliseconds delay{0};
    if (!takenFrom(state)->answer(message, due, delay))
        return message;
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
    client_.askBus("ReleaseName", g_variant_new("(s)", name_.c_str()));
    ownName(client_, name_);
}

void ScriptedService::send(const std::string& path, const char* interface, const char* signal,
                           GVariant* body)
{
    g_dbus_connection_emit_signal(client_.connection(), nullptr, path.c_str(), interface, signal,
                                  body, nullptr);
}

// As object managers do: changed properties by themselves where only these changed.
void ScriptedService::tellChange(const Variant& before, const Variant& now)
{
    const auto was = objectsIn(before);
    const auto is = objectsIn(now);
    for (const auto& [path, interfaces] : was) {
        const auto there = is.find(path);
        GVariantBuilder gone;
        g_variant_builder_init(&gone, G_VARIANT_TYPE("as"));
        for (std::size_t i = 0; i < g_variant_n_children(interfaces.get()); ++i) {
            const auto entry = child(interfaces, i);
            const auto name = child(entry, 0);
            const char* const text = g_variant_get_string(name.get(), nullptr);
            const auto old = child(entry, 1);
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
    g_dbus_connection_flush_sync(client_.connection(), nullptr, nullptr);
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
    g_dbus_connection_call(client_.connection(), "org.freedesktop.DBus", "/org/freedesktop/DBus",
                           "org.freedesktop.DBus", "ReleaseName",
                           g_variant_new("(s)", name_.c_str()), nullptr, G_DBUS_CALL_FLAGS_NONE,
                           PATIENCE_MS, nullptr, nullptr, nullptr);
}

void ScriptedService::answerLate(std::chrono::milliseconds delay)
{
    const std::lock_guard<std::mutex> lock(state_->mutex);
    state_->delay = delay;
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
    Variant before;
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
    send(path, interface.c_str(), signal.c_str(), parsed(body).get());
    g_dbus_connection_flush_sync(client_.connection(), nullptr, nullptr);
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
    whenAsked([this] { g_dbus_connection_close(client_.connection(), nullptr, nullptr, nullptr); },
              method);
}
