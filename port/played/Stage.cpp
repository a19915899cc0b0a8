// SPDX-License-Identifier: Apache-2.0
#include "Stage.h"

#include <algorithm>
#include <stdexcept>
#include <string_view>
#include <utility>

namespace port::played {
namespace {

constexpr char PROPERTIES[] = "org.freedesktop.DBus.Properties";
constexpr char OBJECT_MANAGER[] = "org.freedesktop.DBus.ObjectManager";
constexpr char UNKNOWN_OBJECT[] = "org.freedesktop.DBus.Error.UnknownObject";

GDBusInterfaceInfo* objectManager()
{
    static GDBusNodeInfo* const node = g_dbus_node_info_new_for_xml(
        "<node><interface name='org.freedesktop.DBus.ObjectManager'>"
        "<method name='GetManagedObjects'><arg type='a{oa{sa{sv}}}' direction='out'/></method>"
        "<signal name='InterfacesAdded'><arg type='o'/><arg type='a{sa{sv}}'/></signal>"
        "<signal name='InterfacesRemoved'><arg type='o'/><arg type='as'/></signal>"
        "</interface></node>",
        nullptr);
    return node->interfaces[0];
}

[[noreturn]] void fail(const std::string& what, const Owned<GError>& error)
{
    throw std::runtime_error(what + (error ? std::string(": ") + error->message : ""));
}

const Object* findObject(const World& world, const std::string& path)
{
    const auto found = std::find_if(world.begin(), world.end(),
                                    [&](const Object& object) { return object.path == path; });
    return found != world.end() ? &*found : nullptr;
}

GVariant* dictionary(const Values& values)
{
    GVariantBuilder all;
    g_variant_builder_init(&all, G_VARIANT_TYPE_VARDICT);
    for (const auto& [name, value] : values)
        g_variant_builder_add(&all, "{sv}", name.c_str(), value.get());
    return g_variant_builder_end(&all);
}

GVariant* dictionary(const std::vector<Face>& faces)
{
    GVariantBuilder all;
    g_variant_builder_init(&all, G_VARIANT_TYPE("a{sa{sv}}"));
    for (const Face& each : faces)
        g_variant_builder_add(&all, "{s@a{sv}}", each.interface.c_str(), dictionary(each.all()));
    return g_variant_builder_end(&all);
}

std::string_view serialised(GVariant* value)
{
    return {static_cast<const char*>(g_variant_get_data(value)), g_variant_get_size(value)};
}

// Compares two values of one type, both made here: each then has but one serialised form. GLib
// itself compares some of them as they are printed.
bool isSame(GVariant* left, GVariant* right)
{
    return left == right || serialised(left) == serialised(right);
}

Values differences(const Face& before, const Face& after)
{
    Values changed;
    for (const Values* const known : {&before.known, &after.known})
        for (const auto& [name, value] : *known)
            if (GVariant* const now = after.value(name); !isSame(before.value(name), now))
                changed[name] = share(g_variant_ref(now));
    return changed;
}

std::vector<std::string> pathsIn(GVariant* list)
{
    gsize count = 0;
    const char** const paths = g_variant_get_objv(list, &count);
    std::vector<std::string> all(paths, paths + count);
    g_free(paths);
    return all;
}

std::vector<std::string> without(std::vector<std::string> all, const std::vector<std::string>& some)
{
    all.erase(std::remove_if(all.begin(), all.end(),
                             [&](const std::string& one) {
                                 return std::find(some.begin(), some.end(), one) != some.end();
                             }),
              all.end());
    return all;
}

} // namespace

// A call that waits for its answer.
struct Stage::Late {
    Stage* stage;
    GDBusMethodInvocation* call;
    Owned<GSource> timer;
};

Stage::Stage(const Role& service, std::string address, Director director)
    : service_(service), address_(std::move(address)), director_(std::move(director)),
      context_(g_main_context_ref_thread_default())
{
}

Stage::~Stage()
{
    leave();
}

void Stage::show(const Scene& scene)
{
    scene_ = &scene;
    const auto behaviour = scene.facts.behaviours.find(service_.name);
    if (behaviour != scene.facts.behaviours.end() && !(behaviour->second == behaviour_))
        misbehave(behaviour->second);
    if (isGone_)
        return;
    if (behaviour_.kind == Behaviour::Kind::Absent ||
        (service_.isThere != nullptr && !service_.isThere(scene.facts)))
        return leave();
    World before = std::move(world_);
    world_ = service_.worldOf(scene);
    const Answers answersBefore = std::exchange(answers_, answers());
    if (bus_ == nullptr)
        return enter();
    tell(before);
    tellAnswers(answersBefore);
}

void Stage::misbehave(const Behaviour& behaviour)
{
    behaviour_ = behaviour;
    calls_ = 0;
    comeback_.reset();
    *isSilent_ = behaviour.kind == Behaviour::Kind::Silent;
    isGone_ = false;
    if (behaviour.kind == Behaviour::Kind::Crashing && behaviour.call == 0)
        crash();
}

void Stage::enter()
{
    Owned<GError> error;
    const auto flags =
        static_cast<GDBusConnectionFlags>(G_DBUS_CONNECTION_FLAGS_AUTHENTICATION_CLIENT |
                                          G_DBUS_CONNECTION_FLAGS_MESSAGE_BUS_CONNECTION);
    bus_.reset(g_dbus_connection_new_for_address_sync(address_.c_str(), flags, nullptr, nullptr,
                                                      Out(error)));
    if (bus_ == nullptr)
        fail("no bus", error);
    filter_ = g_dbus_connection_add_filter(bus_.get(), &Stage::onMessage, new Silence(isSilent_),
                                           &Stage::releaseSilence);
    if (service_.manager != nullptr)
        add(service_.manager, OBJECT_MANAGER, objectManager());
    for (const Object& object : world_)
        add(object);
    constexpr guint32 DO_NOT_QUEUE = 4;
    constexpr guint32 IS_OWNER = 1;
    const Owned<GVariant> reply(g_dbus_connection_call_sync(
        bus_.get(), "org.freedesktop.DBus", "/org/freedesktop/DBus", "org.freedesktop.DBus",
        "RequestName", g_variant_new("(su)", service_.busName, DO_NOT_QUEUE), G_VARIANT_TYPE("(u)"),
        G_DBUS_CALL_FLAGS_NONE, -1, nullptr, Out(error)));
    guint32 answer = 0;
    if (reply)
        g_variant_get(reply.get(), "(u)", &answer);
    if (answer != IS_OWNER)
        fail(std::string(service_.busName) + " is not to be had", error);
}

void Stage::leave()
{
    for (Late* const late : late_) {
        g_object_unref(late->call);
        delete late;
    }
    late_.clear();
    if (bus_ == nullptr)
        return;
    for (const Shown& each : shown_)
        g_dbus_connection_unregister_object(bus_.get(), each.id);
    shown_.clear();
    g_dbus_connection_remove_filter(bus_.get(), filter_); // here, where its release may run at once
    g_dbus_connection_flush_sync(bus_.get(), nullptr, nullptr);
    g_dbus_connection_close_sync(bus_.get(), nullptr, nullptr);
    bus_.reset();
    world_.clear();
}

void Stage::crash()
{
    leave();
    isGone_ = true;
    if (behaviour_.delayMs == 0)
        return;
    comeback_.reset(g_timeout_source_new(static_cast<guint>(behaviour_.delayMs)));
    g_source_set_callback(comeback_.get(), &Stage::onReturn, this, nullptr);
    g_source_attach(comeback_.get(), context_.get());
}

gboolean Stage::onReturn(gpointer self)
{
    auto& stage = *static_cast<Stage*>(self);
    stage.isGone_ = false;
    try {
        stage.show(*stage.scene_);
    } catch (const std::exception&) {
        stage.leave(); // the bus has gone meanwhile
    }
    return G_SOURCE_REMOVE;
}

void Stage::add(const std::string& path, const std::string& interface, GDBusInterfaceInfo* info)
{
    // Without its own functions for properties it lets these through as calls.
    static const GDBusInterfaceVTable table = {&Stage::onCall, nullptr, nullptr, {}};
    const guint id = g_dbus_connection_register_object(bus_.get(), path.c_str(), info, &table, this,
                                                       nullptr, nullptr);
    shown_.push_back({path, interface, id});
}

void Stage::add(const Object& object)
{
    for (const Face& each : object.faces)
        add(object.path, each.interface, interfaceOf(each.interface).info);
}

void Stage::remove(const std::string& path, const std::string& interface)
{
    const auto found = std::find_if(shown_.begin(), shown_.end(), [&](const Shown& each) {
        return each.path == path && each.interface == interface;
    });
    g_dbus_connection_unregister_object(bus_.get(), found->id);
    shown_.erase(found);
}

void Stage::emit(const std::string& path, const char* interface, const char* signal,
                 GVariant* arguments)
{
    g_dbus_connection_emit_signal(bus_.get(), nullptr, path.c_str(), interface, signal, arguments,
                                  nullptr);
}

void Stage::emitAdded(const Object& object, const std::vector<Face>& faces)
{
    if (service_.manager != nullptr && object.isListed)
        emit(service_.manager, OBJECT_MANAGER, "InterfacesAdded",
             g_variant_new("(o@a{sa{sv}})", object.path.c_str(), dictionary(faces)));
}

void Stage::emitRemoved(const Object& object, const std::vector<std::string>& interfaces)
{
    if (service_.manager != nullptr && object.isListed)
        emit(service_.manager, OBJECT_MANAGER, "InterfacesRemoved",
             g_variant_new("(o@as)", object.path.c_str(), texts(interfaces).get()));
}

void Stage::tell(const World& before)
{
    if (service_.removesFirst)
        tellRemoved(before);
    tellAdded(before);
    for (const Object& object : world_)
        if (const Object* const old = findObject(before, object.path))
            tellChanged(*old, object);
    if (!service_.removesFirst)
        tellRemoved(before);
}

const Act* Stage::find(const std::vector<Act>& table, const std::string& interface,
                       const std::string& member)
{
    const auto row = std::find_if(table.begin(), table.end(), [&](const Act& each) {
        return interface == each.interface && member == each.member;
    });
    return row != table.end() ? &*row : nullptr;
}

Stage::Answers Stage::answers() const
{
    Answers all;
    for (const AnswerTale& tale : service_.answers)
        for (const Object& object : world_)
            if (object.find(tale.interface) != nullptr)
                all[{object.path, &tale}] =
                    find(service_.methods, tale.interface, tale.method)
                        ->act({*scene_, world_, object.path, tale.interface, tale.method, nullptr})
                        .reply;
    return all;
}

void Stage::tellAnswers(const Answers& before)
{
    for (const auto& [which, answer] : answers_) {
        const auto old = before.find(which);
        if (old != before.end() && !isSame(old->second.get(), answer.get()))
            emit(which.first, which.second->interface, which.second->signal, nullptr);
    }
}

void Stage::tellAdded(const World& before)
{
    for (const Object& object : world_) {
        const Object* const old = findObject(before, object.path);
        std::vector<Face> added;
        for (const Face& each : object.faces)
            if (old == nullptr || old->find(each.interface) == nullptr)
                added.push_back(each);
        for (const Face& each : added)
            add(object.path, each.interface, interfaceOf(each.interface).info);
        if (!added.empty())
            emitAdded(object, added);
    }
}

void Stage::tellRemoved(const World& before)
{
    for (const Object& object : before) {
        const Object* const now = findObject(world_, object.path);
        std::vector<std::string> removed;
        for (const Face& each : object.faces)
            if (now == nullptr || now->find(each.interface) == nullptr)
                removed.push_back(each.interface);
        for (const std::string& interface : removed)
            remove(object.path, interface);
        if (!removed.empty())
            emitRemoved(object, removed);
    }
}

void Stage::tellChanged(const Object& before, const Object& after)
{
    for (const Face& each : after.faces)
        if (const Face* const old = before.find(each.interface))
            tellChanged(after.path, *old, each);
}

void Stage::tellChanged(const std::string& path, const Face& before, const Face& after)
{
    const Values changed = differences(before, after);
    if (changed.empty())
        return;
    const auto tellTales = [&](bool isBefore) {
        for (const Tale& tale : service_.tales)
            if (after.interface == tale.interface && isBefore == tale.isBefore &&
                changed.count(tale.property) != 0)
                emit(path, tale.interface, tale.signal,
                     tale.arguments(before.value(tale.property), after.value(tale.property)));
    };
    tellTales(true);
    emit(path, PROPERTIES, "PropertiesChanged",
         g_variant_new("(s@a{sv}@as)", after.interface.c_str(), dictionary(changed),
                       texts({}).get()));
    tellTales(false);
    tellLists(path, before, after);
}

void Stage::tellLists(const std::string& path, const Face& before, const Face& after)
{
    for (const ListTale& tale : service_.lists) {
        if (after.interface != tale.interface)
            continue;
        const auto old = pathsIn(before.value(tale.property));
        const auto now = pathsIn(after.value(tale.property));
        for (const std::string& each : without(now, old))
            emit(path, tale.interface, tale.added, g_variant_new("(o)", each.c_str()));
        for (const std::string& each : without(old, now))
            emit(path, tale.interface, tale.removed, g_variant_new("(o)", each.c_str()));
    }
}

// On the thread that receives: whoever is silent does not even introduce himself.
GDBusMessage* Stage::onMessage(GDBusConnection*, GDBusMessage* message, gboolean isIncoming,
                               gpointer silence)
{
    if (isIncoming == FALSE || !**static_cast<Silence*>(silence) ||
        g_dbus_message_get_message_type(message) != G_DBUS_MESSAGE_TYPE_METHOD_CALL)
        return message;
    g_object_unref(message);
    return nullptr;
}

void Stage::releaseSilence(gpointer silence)
{
    delete static_cast<Silence*>(silence);
}

// Whether the service lives on after it.
bool Stage::countCall()
{
    ++calls_;
    if (behaviour_.kind != Behaviour::Kind::Crashing || calls_ != behaviour_.call)
        return true;
    crash();
    return false;
}

void Stage::onCall(GDBusConnection*, const char*, const char*, const char*, const char*, GVariant*,
                   GDBusMethodInvocation* call, gpointer self)
{
    auto& stage = *static_cast<Stage*>(self);
    if (!stage.countCall())
        return g_object_unref(call);
    if (stage.behaviour_.kind != Behaviour::Kind::Slow)
        return stage.handle(call);
    auto* const late = new Late{
        &stage, call,
        Owned<GSource>(g_timeout_source_new(static_cast<guint>(stage.behaviour_.delayMs)))};
    g_source_set_callback(late->timer.get(), &Stage::onDelayEnd, late, nullptr);
    g_source_attach(late->timer.get(), stage.context_.get());
    stage.late_.push_back(late);
}

gboolean Stage::onDelayEnd(gpointer waited)
{
    auto* const late = static_cast<Late*>(waited);
    auto& all = late->stage->late_;
    all.erase(std::find(all.begin(), all.end(), late));
    late->stage->handle(late->call);
    delete late;
    return G_SOURCE_REMOVE;
}

const Face* Stage::find(const std::string& path, const std::string& interface) const
{
    const Object* const object = findObject(world_, path);
    return object != nullptr ? object->find(interface) : nullptr;
}

void Stage::handle(GDBusMethodInvocation* call)
{
    const std::string interface = g_dbus_method_invocation_get_interface_name(call);
    const std::string member = g_dbus_method_invocation_get_method_name(call);
    const std::string path = g_dbus_method_invocation_get_object_path(call);
    GVariant* const arguments = g_dbus_method_invocation_get_parameters(call);
    if (interface == PROPERTIES)
        return answerProperty(call, member, arguments);
    if (interface == OBJECT_MANAGER)
        return answerObjects(call);
    act(call, service_.methods, {*scene_, world_, path, interface, member, arguments});
}

void Stage::answerProperty(GDBusMethodInvocation* call, const std::string& member,
                           GVariant* arguments)
{
    const std::string path = g_dbus_method_invocation_get_object_path(call);
    const char* interface = nullptr;
    g_variant_get_child(arguments, 0, "&s", &interface);
    const Face* const shown = find(path, interface);
    if (shown == nullptr) { // it went away while the call waited, or has no properties
        if (member == "GetAll")
            return g_dbus_method_invocation_return_value(
                call, g_variant_new("(@a{sv})", dictionary(Values())));
        return g_dbus_method_invocation_return_dbus_error(call, UNKNOWN_OBJECT, path.c_str());
    }
    if (member == "GetAll")
        return g_dbus_method_invocation_return_value(
            call, g_variant_new("(@a{sv})", dictionary(shown->all())));
    const char* name = nullptr;
    g_variant_get_child(arguments, 1, "&s", &name);
    if (member == "Get")
        return g_dbus_method_invocation_return_value(call,
                                                     g_variant_new("(v)", shown->value(name)));
    Owned<GVariant> value;
    g_variant_get_child(arguments, 2, "v", static_cast<GVariant**>(Out(value)));
    act(call, service_.setters, {*scene_, world_, path, interface, name, value.get()});
}

void Stage::answerObjects(GDBusMethodInvocation* call) const
{
    GVariantBuilder all;
    g_variant_builder_init(&all, G_VARIANT_TYPE("a{oa{sa{sv}}}"));
    for (const Object& object : world_)
        if (object.isListed)
            g_variant_builder_add(&all, "{o@a{sa{sv}}}", object.path.c_str(),
                                  dictionary(object.faces));
    g_dbus_method_invocation_return_value(call, g_variant_new("(a{oa{sa{sv}}})", &all));
}

void Stage::act(GDBusMethodInvocation* call, const std::vector<Act>& table, const Request& request)
{
    if (find(request.path, request.interface) == nullptr)
        return g_dbus_method_invocation_return_dbus_error(call, UNKNOWN_OBJECT,
                                                          request.path.c_str());
    const Act* const row = find(table, request.interface, request.member);
    const Outcome outcome = row != nullptr ? row->act(request) : service_.refuse(request);
    const std::string problem =
        outcome.changes.empty() ? std::string() : director_(outcome.changes);
    if (!problem.empty())
        g_dbus_method_invocation_return_dbus_error(call, "org.freedesktop.DBus.Error.Failed",
                                                   problem.c_str());
    else if (!outcome.error.empty())
        g_dbus_method_invocation_return_dbus_error(call, outcome.error.c_str(),
                                                   outcome.text.c_str());
    else
        g_dbus_method_invocation_return_value(call, outcome.reply.get());
}

} // namespace port::played
