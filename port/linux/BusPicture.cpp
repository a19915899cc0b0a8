// SPDX-License-Identifier: Apache-2.0
// Receives replies and signals, and makes of them the pictures of the services' objects.
#include <algorithm>
#include <cstring>

#include "BusCore.h"

namespace port::linux_backend {
namespace {

constexpr char SETTINGS_MARK[] = "settings"; // of an object whose settings were asked

bool isOneOf(const char* name, Names names)
{
    return std::any_of(names.begin(), names.end(),
                       [name](const char* one) { return std::strcmp(name, one) == 0; });
}

const char* stringOr(const char* text, const char* otherwise)
{
    return text != nullptr ? text : otherwise;
}

// Also those whose section is no longer told of.
void dropSettings(Interfaces& object)
{
    for (auto each = object.begin(); each != object.end();)
        each = each->first.rfind(SETTINGS_MARK, 0) == 0 ? object.erase(each) : std::next(each);
}

} // namespace

std::string settingsName(const std::string& section)
{
    return std::string(SETTINGS_MARK) + "." + section;
}

std::vector<std::string> pathsWithoutSettings(const ObjectService& service, const Tree& tree)
{
    std::vector<std::string> paths;
    if (service.settings != nullptr)
        for (const auto& [path, interfaces] : tree)
            if (interfaces.count(service.settings) != 0 && interfaces.count(SETTINGS_MARK) == 0)
                paths.push_back(path);
    return paths;
}

//
// Receiving
//

int Bus::Core::onMessage(sd_bus_message* message, void* core, sd_bus_error*)
{
    // An exception for want of memory must not pass through a C library. A message is lost
    // then: the pictures begin anew with another connection.
    try {
        return static_cast<Core*>(core)->take(message) ? 1 : 0;
    } catch (...) {
        static_cast<Core*>(core)->isBroken_ = true;
        return 0;
    }
}

// Whether it was a reply or a signal; what strangers ask is answered by sd-bus.
bool Bus::Core::take(sd_bus_message* message)
{
    std::uint64_t cookie = 0;
    if (sd_bus_message_get_reply_cookie(message, &cookie) >= 0)
        takeReply(message);
    else if (sd_bus_message_is_signal(message, nullptr, nullptr) > 0)
        takeSignal(message);
    else
        return false;
    return true;
}

void Bus::Core::takeReply(sd_bus_message* message)
{
    std::uint64_t cookie = 0;
    sd_bus_message_get_reply_cookie(message, &cookie);
    const auto found = calls_.find(cookie);
    if (found == calls_.end())
        return;
    const Call& call = found->second;
    const std::string sender = stringOr(sd_bus_message_get_sender(message), "");
    const bool isOfBus = sender == BUS_ITSELF.name;
    const bool isAboutBus = isForBus(call.kind) || call.peer->name == BUS_ITSELF.name;
    const bool isOfFormer = !isOfBus && !isAboutBus && sender != call.peer->owner;
    // Whoever else claims to answer is not believed, and the right reply still awaited.
    if (!isOfBus && (isAboutBus || (isOfFormer && sender != call.peer->formerOwner)))
        return;
    const Call taken = call;
    calls_.erase(found);
    if (isOfFormer) {
        if (const AwaitedReply& reply = taken.awaited) {
            reply->error = notAvailable(taken.peer->name + " was started again meanwhile");
            reply->isGone = reply->isOfFormer = reply->isDone = true;
        }
        return;
    }
    if (!isAboutBus)
        // It lives: what it left unanswered before says nothing any more.
        forgetUnheard(*taken.peer, taken.sent);
    finish(taken, message);
}

void Bus::Core::finish(const Call& call, sd_bus_message* message)
{
    Awaited unheard;
    Awaited& reply = call.awaited ? *call.awaited : unheard;
    if (sd_bus_message_is_method_error(message, nullptr) > 0)
        reply.error = errorOf(*call.peer, message, reply.isGone);
    else
        readReply(call, message, reply);
    reply.isDone = true;
    if (call.kind == Kind::All && call.peer->isHeard)
        call.peer->kept = call.awaited;
    if (call.kind == Kind::Managed)
        call.peer->problem = reply.error;
    if (call.kind == Kind::Match && reply.error)
        call.peer->isDeaf = true; // never to be relied on
    if (call.kind == Kind::Settings && reply.error)
        setSettings(*call.peer, call.path, {}, true);
}

Error Bus::Core::errorOf(const Peer& peer, sd_bus_message* message, bool& isGone) const
{
    const sd_bus_error& error = *sd_bus_message_get_error(message);
    const char* const name = stringOr(error.name, "");
    const std::string text = peer.name + ": " + stringOr(error.message, name);
    if (isOneOf(name, {SD_BUS_ERROR_SERVICE_UNKNOWN, SD_BUS_ERROR_NAME_HAS_NO_OWNER}))
        return absent(peer.name);
    if (isOneOf(name, {SD_BUS_ERROR_TIMEOUT, "org.freedesktop.DBus.Error.TimedOut"}))
        return silent(peer.name);
    if (isOneOf(name, {SD_BUS_ERROR_ACCESS_DENIED, SD_BUS_ERROR_AUTH_FAILED}))
        return denied(text);
    isGone = !isOneOf(name, {SD_BUS_ERROR_NO_REPLY, SD_BUS_ERROR_DISCONNECTED});
    return notAvailable(text);
}

// The signature of each kind of reply, and the method that it answers, for people to read.
Bus::Core::Shape Bus::Core::shapeOf(Kind kind)
{
    switch (kind) {
    case Kind::All:
    case Kind::AllOfObject:
        return {"a{sv}", "GetAll"};
    case Kind::Property:
        return {"v", "Get"};
    case Kind::Settings:
        return {"a{sa{sv}}", "GetSettings"};
    case Kind::Managed:
        return {"a{oa{sa{sv}}}", "GetManagedObjects"};
    default:
        return {nullptr, nullptr};
    }
}

void Bus::Core::readReply(const Call& call, sd_bus_message* message, Awaited& reply)
{
    const std::string sender = call.kind == Kind::Texts ? "the system bus" : call.peer->name;
    const Shape shape = shapeOf(call.kind);
    if (shape.signature != nullptr && sd_bus_message_has_signature(message, shape.signature) <= 0) {
        reply.error =
            notAvailable(sender + ": the reply to " + shape.method + " is of another type");
        return;
    }
    MessageReader reader(message);
    if (!takeContent(reader, call, reply))
        reply.error = notAvailable(
            sender + " " +
            (reader.problem().empty() ? "sent what cannot be read" : reader.problem()));
}

// Whether all of it could be read.
bool Bus::Core::takeContent(MessageReader& reader, const Call& call, Awaited& reply)
{
    switch (call.kind) {
    case Kind::Owner:
        takeFirstOwner(reader, *call.peer);
        return true;
    case Kind::Match:
    case Kind::Ping:
        return true;
    case Kind::Texts:
        return reader.texts(reply.texts);
    case Kind::All:
    case Kind::AllOfObject:
        return takeAll(reader, call, reply);
    case Kind::Property:
        return takeProperty(reader, call);
    case Kind::Settings:
        return takeSettings(reader, call);
    case Kind::Managed:
        return takeTree(reader, *call.peer);
    }
    return false;
}

void Bus::Core::takeFirstOwner(MessageReader& reader, Peer& peer)
{
    std::string owner;
    if (reader.text(owner))
        peer.owner = owner;
}

bool Bus::Core::takeAll(MessageReader& reader, const Call& call, Awaited& reply)
{
    PropertyMap all;
    if (!reader.properties(all))
        return false;
    if (call.kind == Kind::AllOfObject)
        setProperties(*call.peer, call.path, call.interface, PropertyMap(all), true);
    reply.properties = std::make_shared<const PropertyMap>(std::move(all));
    return true;
}

bool Bus::Core::takeProperty(MessageReader& reader, const Call& call)
{
    PropertyMap one;
    if (!reader.value(one[call.property]))
        return false;
    setProperties(*call.peer, call.path, call.interface, std::move(one), false);
    return true;
}

bool Bus::Core::takeSettings(MessageReader& reader, const Call& call)
{
    Interfaces sections;
    if (!reader.interfaces(sections, {"connection", "gsm", "cdma"}))
        return false;
    setSettings(*call.peer, call.path, sections, true);
    return true;
}

bool Bus::Core::takeTree(MessageReader& reader, Peer& peer)
{
    auto tree = std::make_shared<Tree>();
    if (!reader.objects(*tree, peer.objects->interfaces))
        return false;
    const bool isNew = peer.tree == nullptr;
    peer.tree = std::move(tree);
    if (isNew)
        noteChange();
    return true;
}

void Bus::Core::takeSignal(sd_bus_message* message)
{
    const std::string sender = stringOr(sd_bus_message_get_sender(message), "");
    if (sender == BUS_ITSELF.name) {
        MessageReader reader(message);
        std::string name, before, owner;
        if (sd_bus_message_is_signal(message, BUS_ITSELF.interface, "NameOwnerChanged") > 0 &&
            reader.text(name) && reader.text(before) && reader.text(owner))
            if (const auto peer = peers_.find(name); peer != peers_.end())
                takeOwner(peer->second, owner);
        return;
    }
    for (auto& [name, peer] : peers_) {
        if (peer.owner != sender || (peer.objects == nullptr && !peer.isHeard))
            continue;
        if (peer.objects == nullptr) {
            peer.kept.reset();
            noteChange();
            continue;
        }
        if (sd_bus_message_is_signal(message, PROPERTIES, "PropertiesChanged") > 0)
            takeProperties(peer, message);
        else if (sd_bus_message_is_signal(message, OBJECT_MANAGER, "InterfacesAdded") > 0)
            takeInterfaces(peer, message, true);
        else if (sd_bus_message_is_signal(message, OBJECT_MANAGER, "InterfacesRemoved") > 0)
            takeInterfaces(peer, message, false);
        else if (peer.objects->states != nullptr &&
                 sd_bus_message_is_signal(message, peer.objects->states, "StateChanged") > 0)
            takeState(peer, message);
        else if (peer.objects->settings != nullptr && peer.tree != nullptr &&
                 sd_bus_message_is_signal(message, peer.objects->settings,
                                          peer.objects->settingsSignal) > 0) {
            const auto object = peer.tree->find(sd_bus_message_get_path(message));
            if (object == peer.tree->end())
                continue;
            auto tree = std::make_shared<Tree>(*peer.tree);
            (*tree)[object->first].erase(SETTINGS_MARK);
            peer.tree = std::move(tree);
            isRefreshDue_ = true;
            kick();
        }
    }
}

void Bus::Core::takeOwner(Peer& peer, const std::string& owner)
{
    if (!peer.owner.empty())
        peer.formerOwner = peer.owner;
    peer.owner = owner;
    if (!owner.empty())
        peer.kept.reset();
    // Forget what the previous owner left unanswered: it says nothing about this one.
    forgetUnheard(peer, BusTime::max());
    dropPicture(peer);
    noteChange();
}

void Bus::Core::dropPicture(Peer& peer)
{
    peer.tree.reset();
    peer.problem.reset();
    isRefreshDue_ = true;
    kick();
}

// Changes some properties of an interface, or all of them. What was handed out stays as it is.
void Bus::Core::setProperties(Peer& peer, const std::string& path, const std::string& interface,
                              PropertyMap&& changes, bool areAll)
{
    if (peer.tree == nullptr || peer.tree->size() > MOST_OBJECTS)
        return dropPicture(peer);
    const auto object = peer.tree->find(path);
    const auto found =
        object != peer.tree->end() ? object->second.find(interface) : Interfaces::const_iterator();
    const bool isThere = object != peer.tree->end() && found != object->second.end();
    if (!isThere && !areAll)
        return;
    PropertyMap all = areAll ? PropertyMap() : *found->second;
    for (auto& [name, value] : changes)
        all[name] = std::move(value);
    if (all.size() > MOST_PROPERTIES)
        return dropPicture(peer);
    if (isThere && *found->second == all)
        return;
    auto tree = std::make_shared<Tree>(*peer.tree);
    (*tree)[path][interface] = std::make_shared<const PropertyMap>(std::move(all));
    peer.tree = std::move(tree);
    noteChange();
}

// Sets them for an object that still exists; unknown ones are asked again.
void Bus::Core::setSettings(Peer& peer, const std::string& path, const Interfaces& sections,
                            bool areKnown)
{
    if (peer.tree == nullptr || peer.tree->count(path) == 0)
        return;
    auto tree = std::make_shared<Tree>(*peer.tree);
    Interfaces& object = (*tree)[path];
    dropSettings(object);
    for (const auto& [name, properties] : sections)
        object[settingsName(name)] = properties;
    if (areKnown)
        object[SETTINGS_MARK] = std::make_shared<const PropertyMap>();
    peer.tree = std::move(tree);
    noteChange();
}

void Bus::Core::takeProperties(Peer& peer, sd_bus_message* message)
{
    MessageReader reader(message);
    std::string interface;
    PropertyMap changes;
    std::vector<std::string> withoutValue;
    if (peer.tree == nullptr || !reader.text(interface) ||
        !isOneOf(interface.c_str(), peer.objects->interfaces))
        return;
    if (!reader.properties(changes) || !reader.texts(withoutValue) || !withoutValue.empty())
        return dropPicture(peer);
    for (const char* const name : peer.objects->noise)
        changes.erase(name);
    if (!changes.empty())
        setProperties(peer, sd_bus_message_get_path(message), interface, std::move(changes), false);
}

// A state that does not last may be told only so, and not as a property.
void Bus::Core::takeState(Peer& peer, sd_bus_message* message)
{
    std::uint32_t state = 0;
    if (peer.tree == nullptr)
        return;
    sd_bus_message_rewind(message, 1);
    if (sd_bus_message_read_basic(message, SD_BUS_TYPE_UINT32, &state) <= 0)
        return dropPicture(peer);
    setProperties(peer, sd_bus_message_get_path(message), peer.objects->states,
                  {{"State", Value(state)}}, false);
}

void Bus::Core::takeInterfaces(Peer& peer, sd_bus_message* message, bool areThere)
{
    MessageReader reader(message);
    std::string path;
    Interfaces added;
    std::vector<std::string> removed;
    if (peer.tree == nullptr)
        return;
    if (!reader.text(path, SD_BUS_TYPE_OBJECT_PATH) ||
        !(areThere ? reader.interfaces(added, peer.objects->interfaces) : reader.texts(removed)) ||
        peer.tree->size() > MOST_OBJECTS)
        return dropPicture(peer);
    auto tree = std::make_shared<Tree>(*peer.tree);
    Interfaces& object = (*tree)[path];
    for (auto& [name, properties] : added)
        object[name] = properties;
    for (const std::string& name : removed)
        object.erase(name);
    if (peer.objects->settings != nullptr && object.count(peer.objects->settings) == 0)
        dropSettings(object);
    if (object.empty())
        tree->erase(path);
    peer.tree = std::move(tree);
    noteChange();
}

} // namespace port::linux_backend
