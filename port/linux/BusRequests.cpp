// SPDX-License-Identifier: Apache-2.0
// Asks services, and limits how long their answers are waited for.
#include <algorithm>
#include <cerrno>
#include <cstring>
#include <set>

#include "BusCore.h"
#include "BusPatience.h"

namespace port::linux_backend {

namespace {

using std::chrono::milliseconds;

// Calls to a service that are kept though nobody waits for them any more.
constexpr std::size_t MOST_UNHEARD = 16;

} // namespace

// A question of look() on its way.
struct Bus::Core::Search {
    const Look& question;
    Peer& peer;
    std::optional<Error> error;
    std::vector<AwaitedReply> replies;
    std::size_t deciding = 0; // the first of them whose failure matters
    std::set<std::string> asked;
    bool isBegun = false;
    int readings = 0; // of all objects
};

Peer& Bus::Core::peerOf(const char* name)
{
    Peer& peer = peers_[name];
    peer.name = name;
    return peer;
}

void Bus::Core::addMatch(Peer& peer, const std::string& rule)
{
    send(Kind::Match, peer, BUS_ITSELF, "AddMatch", {rule.c_str()}, {}, false);
}

void Bus::Core::attach(Peer& peer)
{
    if (peer.isAttached)
        return;
    peer.isAttached = true;
    addMatch(peer, std::string("type='signal',sender='") + BUS_ITSELF.name +
                       "',member='NameOwnerChanged',arg0='" + peer.name + "'");
    send(Kind::Owner, peer, BUS_ITSELF, "GetNameOwner", {peer.name.c_str()}, {}, false);
}

void Bus::Core::attachObjects(Peer& peer, const ObjectService& service)
{
    attach(peer);
    if (peer.objects != nullptr)
        return;
    peer.objects = &service;
    const std::string signal = "type='signal',sender='" + peer.name + "',";
    addMatch(peer, signal + "interface='" + OBJECT_MANAGER + "'");
    for (const char* const interface : service.interfaces)
        addMatch(peer, signal + "interface='" + PROPERTIES + "',member='PropertiesChanged',arg0='" +
                           interface + "'");
    if (service.settings != nullptr)
        addMatch(peer, signal + "interface='" + service.settings + "',member='" +
                           service.settingsSignal + "'");
    if (service.states != nullptr)
        addMatch(peer, signal + "interface='" + service.states + "',member='StateChanged'");
    startThread();
}

// Listens to a service that has one object, which only those who asked about it watch.
void Bus::Core::hear(Peer& peer, const BusObject& object)
{
    if (peer.isHeard)
        return;
    peer.isHeard = true;
    addMatch(peer, "type='signal',sender='" + peer.name + "',interface='" + PROPERTIES +
                       "',member='PropertiesChanged',arg0='" + object.interface + "'");
}

// Whether it let somebody wait in vain, and gave no sign of life since.
bool Bus::Core::isOverdue(const Peer& peer, BusTime now) const
{
    return std::any_of(calls_.begin(), calls_.end(), [&](const auto& each) {
        return each.second.peer == &peer && !isForBus(each.second.kind) &&
               now - each.second.sent >= milliseconds(CALL_TIMEOUT_MS);
    });
}

// Those that nobody awaits, sent until then.
void Bus::Core::forgetUnheard(const Peer& peer, BusTime until)
{
    for (auto call = calls_.begin(); call != calls_.end();)
        call = call->second.peer == &peer && !call->second.awaited && call->second.sent <= until &&
                       !isForBus(call->second.kind)
                   ? calls_.erase(call)
                   : std::next(call);
}

// Some are enough to know it by that it answers again.
void Bus::Core::keepFewUnheard(const Peer& peer)
{
    std::vector<BusTime> sent;
    for (const auto& [cookie, call] : calls_)
        if (call.peer == &peer && !call.awaited && !isForBus(call.kind))
            sent.push_back(call.sent);
    if (sent.size() < MOST_UNHEARD)
        return;
    std::sort(sent.begin(), sent.end());
    forgetUnheard(peer, sent[sent.size() - MOST_UNHEARD]);
}

BusTime Bus::Core::deadlineOf(const Peer& peer, BusTime now, BusTime end) const
{
    BusTime oldest = now;
    for (const auto& [cookie, call] : calls_)
        if (call.peer == &peer)
            oldest = std::min(oldest, call.sent);
    return std::min(end,
                    std::max(oldest + milliseconds(CALL_TIMEOUT_MS), now + milliseconds(GRACE_MS)));
}

void Bus::Core::awaitLife(Lock& lock, const std::vector<Peer*>& peers, BusTime end)
{
    const BusTime until = std::min(end, BusClock::now() + milliseconds(GRACE_MS));
    while (bus_ != nullptr && BusClock::now() < until &&
           std::any_of(peers.begin(), peers.end(),
                       [this](const Peer* peer) { return isOverdue(*peer, BusClock::now()); }))
        pump(lock, until);
}

//
// Asking
//

AwaitedReply Bus::Core::send(Kind kind, Peer& peer, const BusObject& object, const char* method,
                             const std::vector<const char*>& arguments, BusTime end, bool isAwaited)
{
    const BusTime now = BusClock::now();
    auto reply = std::make_shared<Awaited>();
    reply->until = deadlineOf(peer, now, end);
    const auto failed = [&reply](Error error) {
        reply->error = std::move(error);
        reply->isDone = true;
        return reply;
    };
    // One that does not answer is tried again from time to time, and not with every question.
    const bool isOver = !isForBus(kind) && isOverdue(peer, now);
    if (isOver && now - peer.lastSent < milliseconds(CALL_TIMEOUT_MS))
        return failed(silent(peer.name));
    if (isOver)
        keepFewUnheard(peer);
    sd_bus_message* made = nullptr;
    int result = sd_bus_message_new_method_call(bus_, &made, object.name, object.path,
                                                object.interface, method);
    const Message message(made);
    for (const char* const argument : arguments)
        if (result >= 0)
            result = sd_bus_message_append_basic(made, SD_BUS_TYPE_STRING, argument);
    if (result >= 0 && object.start == Start::Never)
        result = sd_bus_message_set_auto_start(made, 0);
    std::uint64_t cookie = 0;
    if (result >= 0)
        result = sd_bus_send(bus_, made, &cookie);
    if (result < 0) {
        isBroken_ = isBroken_ || result == -ECONNRESET || result == -EPIPE || result == -ENOTCONN;
        reply->isGone = true; // a path that is none
        return failed(notAvailable(peer.name + ": " + std::strerror(-result)));
    }
    peer.lastSent = now;
    calls_[cookie] = {
        kind, &peer, object.path, "", "", now, isAwaited && !isOver ? reply : nullptr};
    lastCookie_ = cookie;
    return isOver ? failed(silent(peer.name)) : reply;
}

AwaitedReply Bus::Core::askObjects(Peer& peer, BusTime end)
{
    const ObjectService& service = *peer.objects;
    return send(Kind::Managed, peer,
                {service.root.name, service.managerPath, OBJECT_MANAGER, service.root.start},
                "GetManagedObjects", {}, end);
}

AwaitedReply Bus::Core::askDeciding(Peer& peer, const Deciding& deciding, BusTime end)
{
    const BusObject object = {peer.name.c_str(), deciding.path.c_str(), PROPERTIES, Start::Never};
    const bool isOne = *deciding.property != '\0';
    auto reply = isOne ? send(Kind::Property, peer, object, "Get",
                              {deciding.interface, deciding.property}, end)
                       : send(Kind::AllOfObject, peer, object, "GetAll", {deciding.interface}, end);
    if (const auto call = calls_.find(lastCookie_); call != calls_.end()) {
        call->second.interface = deciding.interface;
        call->second.property = deciding.property;
    }
    return reply;
}

AwaitedReply Bus::Core::askSettings(Peer& peer, const std::string& path, BusTime end)
{
    return send(Kind::Settings, peer,
                {peer.name.c_str(), path.c_str(), peer.objects->settings, Start::Never},
                "GetSettings", {}, end);
}

// Lists what must be asked before the question can be answered; empty when it can.
std::vector<AwaitedReply> Bus::Core::askNext(Search& search, BusTime end)
{
    search.replies.clear();
    search.deciding = 0;
    if (search.error)
        return {};
    Peer& peer = search.peer;
    const bool isFirst = !search.isBegun;
    search.isBegun = true;
    if (peer.tree == nullptr || (isFirst && peer.isDeaf)) {
        search.asked.clear(); // of another picture
        if (++search.readings > 3)
            search.error = notAvailable(peer.name + " was started again meanwhile");
        else
            search.replies.push_back(askObjects(peer, end));
        return search.replies;
    }
    const ObjectService& service = search.question.service;
    for (const std::string& path : pathsWithoutSettings(service, *peer.tree))
        if (search.asked.insert(path).second)
            search.replies.push_back(askSettings(peer, path, end));
    search.deciding = search.replies.size();
    const bool wasRead = search.readings > 0;
    for (const Deciding& each :
         search.question.deciding ? search.question.deciding(*peer.tree) : std::vector<Deciding>())
        // Do not read again what was just read.
        if ((!wasRead || *each.property == '\0') && (isFirst || *each.property == '\0') &&
            search.asked.insert(each.path + "#" + each.property).second)
            search.replies.push_back(askDeciding(peer, each, end));
    if (isFirst && search.replies.size() == search.deciding)
        search.replies.push_back(
            service.property != nullptr
                ? askDeciding(peer, {service.root.path, service.root.interface, service.property},
                              end)
                : askObjects(peer, end));
    return search.replies;
}

// A path that is gone: all objects are read anew, and then once more what stood there.
void Bus::Core::judge(Search& search)
{
    for (std::size_t i = search.deciding; i < search.replies.size(); ++i) {
        const Awaited& reply = *search.replies[i];
        if (!reply.error)
            continue;
        if (!reply.isGone || (search.readings > 0 && !reply.isOfFormer)) {
            search.error = reply.error;
            return;
        }
        dropPicture(search.peer);
    }
}

std::vector<Result<Objects>> Bus::Core::look(const std::vector<Look>& questions)
{
    if (presentMoment != nullptr) {
        std::vector<Result<Objects>> now;
        for (const Look& question : questions) {
            const auto found = presentMoment->find(question.service.root.name);
            now.push_back(
                found != presentMoment->end()
                    ? found->second
                    : notAvailable(std::string(question.service.root.name) + " is not watched"));
        }
        return now;
    }
    const Patience patience;
    Lock lock(mutex_);
    return lookFor(lock, questions, patience.end());
}

std::vector<Result<Objects>> Bus::Core::lookFor(Lock& lock, const std::vector<Look>& questions,
                                                BusTime end)
{
    for (bool again = true;; again = false) {
        if (const auto problem = connect(lock, end))
            return {questions.size(), *problem};
        std::vector<Search> searches;
        std::vector<Peer*> peers;
        for (const Look& question : questions) {
            Peer& peer = peerOf(question.service.root.name);
            attachObjects(peer, question.service);
            searches.push_back({question, peer, {}, {}, 0, {}, false, 0});
            peers.push_back(&peer);
        }
        const unsigned generation = generation_;
        const auto isLost = [&] { return bus_ == nullptr || generation_ != generation; };
        awaitLife(lock, peers, end);
        while (!isLost()) {
            std::vector<AwaitedReply> replies;
            for (Search& search : searches)
                for (const AwaitedReply& reply : askNext(search, end))
                    replies.push_back(reply);
            if (replies.empty())
                break;
            await(lock, replies);
            if (!isLost())
                for (Search& search : searches)
                    judge(search);
        }
        // A bus that was restarted shows only now: ask the new one.
        if (isLost() && again && !isEnding_)
            continue;
        std::vector<Result<Objects>> found;
        found.reserve(searches.size());
        for (const Search& search : searches)
            found.push_back(isLost()       ? Result<Objects>(problem_)
                            : search.error ? Result<Objects>(*search.error)
                                           : Result<Objects>(search.peer.tree));
        return found;
    }
}

AwaitedReply Bus::Core::properties(const BusObject& object)
{
    const Patience patience;
    Lock lock(mutex_);
    // Whoever is told of changes keeps no service awake that ends when nobody asks it.
    if (const auto peer = peers_.find(object.name);
        std::this_thread::get_id() == thread_.get_id() && peer != peers_.end() &&
        peer->second.kept != nullptr)
        return peer->second.kept;
    auto reply = std::make_shared<Awaited>();
    for (bool again = true;; again = false) {
        if (const auto problem = connect(lock, patience.end())) {
            reply->error = problem;
            return reply;
        }
        const unsigned generation = generation_;
        Peer& peer = peerOf(object.name);
        attach(peer);
        if (!watchers_.empty())
            hear(peer, object);
        awaitLife(lock, {&peer}, patience.end());
        reply->error = problem_;
        if (generation == generation_) {
            reply = send(Kind::All, peer, {object.name, object.path, PROPERTIES, object.start},
                         "GetAll", {object.interface}, patience.end());
            await(lock, {reply});
        }
        if (generation == generation_ || !again)
            return reply;
    }
}

std::vector<Result<std::string>> Bus::Core::statesOf(const std::vector<BusObject>& services)
{
    const Patience patience;
    Lock lock(mutex_);
    if (const auto problem = connect(lock, patience.end()))
        return {services.size(), *problem};
    const BusTime end = patience.end();
    Peer& bus = peerOf(BUS_ITSELF.name);
    std::vector<AwaitedReply> replies;
    for (const char* const list : {"ListNames", "ListActivatableNames"})
        replies.push_back(send(Kind::Texts, bus, BUS_ITSELF, list, {}, end));
    std::vector<Peer*> peers;
    for (const BusObject& service : services) {
        peers.push_back(&peerOf(service.name));
        attach(*peers.back());
    }
    awaitLife(lock, peers, end);
    for (std::size_t i = 0; bus_ != nullptr && i < services.size(); ++i)
        replies.push_back(send(Kind::Ping, *peers[i],
                               {services[i].name, "/", "org.freedesktop.DBus.Peer", Start::Never},
                               "Ping", {}, end));
    await(lock, replies);
    const auto isListed = [&replies](std::size_t list, const char* name) {
        const auto& texts = replies[list]->texts;
        return std::find(texts.begin(), texts.end(), name) != texts.end();
    };
    std::vector<Result<std::string>> states;
    for (std::size_t i = 0; i < services.size(); ++i) {
        const char* const name = services[i].name;
        if (bus_ == nullptr || replies[0]->error || replies[1]->error)
            states.push_back(bus_ == nullptr ? problem_
                                             : *replies[replies[0]->error ? 0 : 1]->error);
        else if (isListed(0, name) && replies[i + 2]->error && !replies[i + 2]->isGone)
            states.push_back(notAvailable("does not answer"));
        else if (isListed(0, name))
            states.push_back(std::string("running"));
        else if (!isListed(1, name))
            states.push_back(notAvailable("not on the system bus"));
        else if (services[i].start == Start::Never)
            states.push_back(notAvailable("installed, but not running"));
        else
            states.push_back(std::string("starts on demand"));
    }
    return states;
}

} // namespace port::linux_backend
