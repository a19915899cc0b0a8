// SPDX-License-Identifier: Apache-2.0
#include "BusCore.h"

#include <algorithm>
#include <cerrno>
#include <cstring>
#include <set>
#include <system_error>

#include <poll.h>
#include <sys/eventfd.h>

#include "../common/BlockedSignals.h"

namespace port::linux_backend {
namespace {

using std::chrono::milliseconds;

constexpr BusObject BUS_ITSELF = {"org.freedesktop.DBus", "/org/freedesktop/DBus",
                                  "org.freedesktop.DBus", Start::Never};
constexpr char PROPERTIES[] = "org.freedesktop.DBus.Properties";
constexpr char OBJECT_MANAGER[] = "org.freedesktop.DBus.ObjectManager";
constexpr char SETTINGS_MARK[] = "settings"; // of an object whose settings were asked

constexpr milliseconds RETRY{1000};   // to find a bus
constexpr milliseconds GIVE_UP{5000}; // on a bus that never says a word
constexpr milliseconds NAP{2};        // of the thread while others drive the connection
constexpr int MOST_MESSAGES = 64;     // that are taken without a look at the time
constexpr std::size_t MOST_MOMENTS = 512;

// What is left of a thread's time for its question. Calls that follow each other at once belong to
// one question; calls that took no time cost none.
class Patience {
public:
    Patience() : begin_(BusClock::now())
    {
        if (begin_ - last().end > PAUSE ||
            (last().spent >= LIMIT && begin_ - last().exhausted > PAUSE))
            last().spent = milliseconds(0);
    }
    ~Patience()
    {
        last().end = BusClock::now();
        const bool wasExhausted = last().spent >= LIMIT;
        if (last().end - begin_ > QUICK)
            last().spent += last().end - begin_;
        if (!wasExhausted && last().spent >= LIMIT - milliseconds(10))
            last().spent = LIMIT;
        if (!wasExhausted)
            last().exhausted = last().end;
    }
    Patience(const Patience&) = delete;
    Patience& operator=(const Patience&) = delete;

    BusTime end() const
    {
        return begin_ + (LIMIT - std::min<BusClock::duration>(LIMIT, last().spent));
    }

private:
    struct Last {
        BusClock::duration spent{0};
        BusTime end;
        BusTime exhausted;
    };
    static constexpr BusClock::duration LIMIT = milliseconds(Bus::QUESTION_TIMEOUT_MS);
    static constexpr BusClock::duration PAUSE = milliseconds(20);
    static constexpr BusClock::duration QUICK = milliseconds(10);

    static Last& last()
    {
        thread_local Last mine;
        return mine;
    }

    const BusTime begin_;
};

// Of the thread that tells of changes: what was so at the change that it tells of now.
thread_local const std::map<const ObjectService*, Result<Objects>>* presentMoment = nullptr;

int millisecondsUntil(BusTime end)
{
    const auto left = std::chrono::ceil<milliseconds>(end - BusClock::now()).count();
    return static_cast<int>(std::max<decltype(left)>(0, left));
}

Error silent(const std::string& name)
{
    return notAvailable(name + " did not answer in time");
}

Error absent(const std::string& name)
{
    return notAvailable(name + " is not on the system bus");
}

bool isOneOf(const char* name, Names names)
{
    return std::any_of(names.begin(), names.end(),
                       [name](const char* one) { return std::strcmp(name, one) == 0; });
}

const char* stringOr(const char* text, const char* otherwise)
{
    return text != nullptr ? text : otherwise;
}

// The objects that have settings which were not read since they changed.
std::vector<std::string> pathsWithoutSettings(const ObjectService& service, const Tree& tree)
{
    std::vector<std::string> paths;
    if (service.settings != nullptr)
        for (const auto& [path, interfaces] : tree)
            if (interfaces.count(service.settings) != 0 && interfaces.count(SETTINGS_MARK) == 0)
                paths.push_back(path);
    return paths;
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

struct Bus::Core::Watcher {
    std::vector<const ObjectService*> services;
    std::function<void()> changed;
    bool isCalled = false;
    bool isOver = false;
};

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

Bus::Core::Core(std::initializer_list<const char*> services) : services_(services) {}

Bus::Core::~Core()
{
    {
        const Lock lock(mutex_);
        isEnding_ = true;
    }
    changed_.notify_all();
    kick();
    if (thread_.joinable())
        thread_.join();
    close("");
}

//
// The connection
//

std::optional<Error> Bus::Core::open()
{
    connecting_ = BusClock::now();
    const int result = sd_bus_open_system(&bus_);
    const int filter =
        result < 0 ? result : sd_bus_add_filter(bus_, nullptr, &Core::onMessage, this);
    if (filter >= 0)
        return std::nullopt;
    close(std::strerror(-filter));
    return problem_;
}

void Bus::Core::close(const std::string& reason)
{
    if (!isReady_)
        ++failures_;
    isReady_ = false;
    isBroken_ = false;
    sd_bus_close_unref(bus_);
    bus_ = nullptr;
    problem_ = notAvailable("no system bus: " + reason);
    for (auto& [cookie, call] : calls_)
        if (call.awaited) {
            call.awaited->error = problem_;
            call.awaited->isDone = true;
        }
    calls_.clear();
    ++generation_;
    for (auto& [name, peer] : peers_) {
        peer = Peer();
        peer.name = name;
    }
    noteChange();
}

// Every service that is known to be needed is tried at once, so that whoever asks one of several
// that do not answer waits for all of them together.
void Bus::Core::becomeReady()
{
    isReady_ = true;
    for (const char* const name : services_) {
        Peer& peer = peerOf(name);
        attach(peer);
        send(Kind::Ping, peer, {name, "/", "org.freedesktop.DBus.Peer", Start::Never}, "Ping", {},
             {}, false);
    }
    isRefreshDue_ = true;
    kick();
}

std::optional<Error> Bus::Core::connect(Lock& lock, BusTime end)
{
    const BusTime begin = BusClock::now();
    unsigned failuresBefore = failures_;
    bool isFormers = bus_ != nullptr; // begun before: that it fails says nothing of the bus now
    while (!isReady_) {
        if (isFormers && failures_ != failuresBefore) {
            isFormers = false;
            failuresBefore = failures_;
        }
        // Whoever waited while another one tried in vain does not wait again.
        if (failures_ != failuresBefore || isEnding_)
            return problem_;
        if (bus_ == nullptr)
            if (auto problem = open())
                return problem;
        const BusTime until = std::min(end, std::max(connecting_ + milliseconds(CONNECT_TIMEOUT_MS),
                                                     begin + milliseconds(GRACE_MS)));
        if (BusClock::now() >= until) {
            if (!isPumping_ && BusClock::now() - connecting_ > GIVE_UP)
                close("");
            return notAvailable("the system bus does not answer");
        }
        pump(lock, until);
    }
    return std::nullopt;
}

// Takes what is there; false when nothing was.
bool Bus::Core::process()
{
    for (int i = 0; bus_ != nullptr && i < MOST_MESSAGES; ++i) {
        const int result = sd_bus_process(bus_, nullptr);
        if (result < 0)
            close(std::strerror(-result));
        else if (!isReady_ && sd_bus_is_ready(bus_) > 0)
            becomeReady();
        if (result <= 0)
            return i > 0;
    }
    return true;
}

// Drives the connection, or waits for the one who does, until something happened.
void Bus::Core::pump(Lock& lock, BusTime until)
{
    if (isPumping_ || bus_ == nullptr) {
        changed_.wait_until(lock, until);
        return;
    }
    isPumping_ = true;
    lastAsked_ = BusClock::now();
    if (!process() && bus_ != nullptr) {
        pollfd socket = {sd_bus_get_fd(bus_), static_cast<short>(sd_bus_get_events(bus_)), 0};
        lock.unlock();
        poll(&socket, 1, millisecondsUntil(until));
        lock.lock();
        process();
        lastAsked_ = BusClock::now();
    }
    isPumping_ = false;
    changed_.notify_all();
}

void Bus::Core::await(Lock& lock, const std::vector<AwaitedReply>& replies)
{
    if (isBroken_ && !isPumping_)
        close("it went away");
    while (true) {
        const BusTime now = BusClock::now();
        std::optional<BusTime> until;
        for (const AwaitedReply& reply : replies)
            if (!reply->isDone && now < reply->until && !isEnding_)
                until = std::min(until.value_or(reply->until), reply->until);
        if (!until)
            break;
        pump(lock, *until);
    }
    // Their calls stay, so that it is known when the service answers again.
    for (auto& [cookie, call] : calls_)
        if (call.awaited && !call.awaited->isDone &&
            std::find(replies.begin(), replies.end(), call.awaited) != replies.end()) {
            call.awaited->error = silent(call.peer->name);
            call.awaited->isDone = true;
            call.awaited.reset();
            if (call.kind == Kind::Settings) // what they were is not what they are
                setSettings(*call.peer, call.path, {}, false);
        }
}

//
// Services
//

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
    startThread();
}

// Whether it let somebody wait in vain, and gave no sign of life since.
bool Bus::Core::isOverdue(const Peer& peer, BusTime now) const
{
    return std::any_of(calls_.begin(), calls_.end(), [&](const auto& each) {
        return each.second.peer == &peer && each.second.kind != Kind::Owner &&
               each.second.kind != Kind::Match &&
               now - each.second.sent >= milliseconds(CALL_TIMEOUT_MS);
    });
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
    const bool isOver = kind != Kind::Owner && kind != Kind::Match && isOverdue(peer, now);
    if (isOver && now - peer.lastSent < milliseconds(CALL_TIMEOUT_MS))
        return failed(silent(peer.name));
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

// What must be asked before the question can be answered; nothing when it can.
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
        // What was just read is not read again.
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
            const auto found = presentMoment->find(&question.service);
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
    auto reply = std::make_shared<Awaited>();
    for (bool again = true;; again = false) {
        if (const auto problem = connect(lock, patience.end())) {
            reply->error = problem;
            return reply;
        }
        const unsigned generation = generation_;
        Peer& peer = peerOf(object.name);
        attach(peer);
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

//
// What arrives
//

int Bus::Core::onMessage(sd_bus_message* message, void* core, sd_bus_error*)
{
    // What this throws for want of memory must not pass through a C library. A message is lost
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
    const bool isAboutBus =
        call.kind == Kind::Owner || call.kind == Kind::Match || call.peer->name == BUS_ITSELF.name;
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
        for (auto other = calls_.begin(); other != calls_.end();)
            other = other->second.peer == taken.peer && !other->second.awaited &&
                            other->second.sent <= taken.sent && other->second.kind != Kind::Owner &&
                            other->second.kind != Kind::Match
                        ? calls_.erase(other)
                        : std::next(other);
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

namespace {

// The method of a question, for people.
const char* methodOf(const char* signature)
{
    return std::strcmp(signature, "a{oa{sa{sv}}}") == 0 ? "GetManagedObjects"
           : std::strcmp(signature, "a{sa{sv}}") == 0   ? "GetSettings"
           : std::strcmp(signature, "v") == 0           ? "Get"
                                                        : "GetAll";
}

} // namespace

void Bus::Core::readReply(const Call& call, sd_bus_message* message, Awaited& reply)
{
    MessageReader reader(message);
    Peer& peer = *call.peer;
    const auto isA = [&](const char* signature) {
        const bool good = sd_bus_message_has_signature(message, signature) > 0;
        if (!good)
            reply.error = notAvailable(peer.name + ": the reply to " + methodOf(signature) +
                                       " is of another type");
        return good;
    };
    const auto tooMuch = [&] {
        reply.error = notAvailable(
            peer.name + " " +
            (reader.problem().empty() ? "sent what cannot be read" : reader.problem()));
    };
    switch (call.kind) {
    case Kind::Owner: {
        std::string owner;
        if (reader.text(owner))
            peer.owner = owner;
        break;
    }
    case Kind::Match:
    case Kind::Ping:
        break;
    case Kind::Texts:
        if (!reader.texts(reply.texts))
            reply.error = notAvailable("the system bus sent what cannot be read");
        break;
    case Kind::All:
    case Kind::AllOfObject: {
        PropertyMap all;
        if (!isA("a{sv}"))
            break;
        if (!reader.properties(all))
            return tooMuch();
        if (call.kind == Kind::AllOfObject)
            setProperties(peer, call.path, call.interface, all, true);
        reply.properties = std::make_shared<const PropertyMap>(std::move(all));
        break;
    }
    case Kind::Property: {
        PropertyMap one;
        if (!isA("v"))
            break;
        if (!reader.value(one[call.property]))
            return tooMuch();
        setProperties(peer, call.path, call.interface, std::move(one), false);
        break;
    }
    case Kind::Settings: {
        Interfaces sections;
        if (!isA("a{sa{sv}}"))
            break;
        if (!reader.interfaces(sections, {"connection", "gsm", "cdma"}))
            return tooMuch();
        setSettings(peer, call.path, sections, true);
        break;
    }
    case Kind::Managed: {
        auto tree = std::make_shared<Tree>();
        if (!isA("a{oa{sa{sv}}}"))
            break;
        if (!reader.objects(*tree, peer.objects->interfaces))
            return tooMuch();
        const bool isNew = peer.tree == nullptr;
        peer.tree = std::move(tree);
        if (isNew)
            noteChange();
        break;
    }
    }
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
        if (peer.owner != sender || peer.objects == nullptr)
            continue;
        if (sd_bus_message_is_signal(message, PROPERTIES, "PropertiesChanged") > 0)
            takeProperties(peer, message);
        else if (sd_bus_message_is_signal(message, OBJECT_MANAGER, "InterfacesAdded") > 0)
            takeInterfaces(peer, message, true);
        else if (sd_bus_message_is_signal(message, OBJECT_MANAGER, "InterfacesRemoved") > 0)
            takeInterfaces(peer, message, false);
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
    // What the one before left unanswered says nothing of this one.
    for (auto call = calls_.begin(); call != calls_.end();)
        call = call->second.peer == &peer && !call->second.awaited &&
                       call->second.kind != Kind::Owner && call->second.kind != Kind::Match
                   ? calls_.erase(call)
                   : std::next(call);
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
                              PropertyMap changes, bool areAll)
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

// Of an object that is still there; unknown ones are asked again.
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
    setProperties(peer, sd_bus_message_get_path(message), interface, std::move(changes), false);
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

//
// Telling of changes
//

Result<Objects> Bus::Core::known(const ObjectService& service)
{
    if (bus_ == nullptr)
        return problem_;
    const Peer& peer = peerOf(service.root.name);
    if (peer.tree != nullptr)
        return peer.tree;
    if (peer.owner.empty())
        return absent(peer.name);
    return peer.problem ? *peer.problem : silent(peer.name);
}

void Bus::Core::noteChange()
{
    if (watchers_.empty())
        return;
    Moment moment;
    for (const auto& watcher : watchers_)
        for (const ObjectService* const service : watcher->services) {
            const auto peer = peers_.find(service->root.name);
            // As long as one of them is being read, nothing is known of the whole.
            if (isReady_ && peer != peers_.end() && !peer->second.owner.empty() &&
                peer->second.tree == nullptr && !peer->second.problem && !isTelling_)
                return;
            moment.emplace(service, known(*service));
        }
    if (moments_.size() >= MOST_MOMENTS)
        moments_.pop_front();
    moments_.push_back(std::move(moment));
    kick();
}

void Bus::Core::kick() const
{
    if (kick_.number() >= 0)
        eventfd_write(kick_.number(), 1);
}

// Where there is no thread for it, pictures are kept by those who ask.
bool Bus::Core::startThread()
{
    if (hasThread_)
        return true;
    if (kick_.number() < 0)
        kick_ = Descriptor(eventfd(0, EFD_CLOEXEC | EFD_NONBLOCK));
    if (kick_.number() < 0)
        return false;
    try {
        const BlockedSignals blocked;
        thread_ = std::thread([this] { run(); });
        hasThread_ = true;
    } catch (const std::system_error&) {
        // There are as many as may be.
    }
    return hasThread_;
}

void Bus::Core::run()
{
    Lock lock(mutex_);
    while (!isEnding_) {
        if (!watchers_.empty() && bus_ == nullptr && BusClock::now() >= nextTry_)
            isRefreshDue_ = true;
        if (!watchers_.empty() && isRefreshDue_)
            refresh(lock);
        tell(lock);
        if (watchers_.empty())
            kernel_.close();
        if (!isEnding_ && moments_.empty())
            listenOnce(lock);
    }
}

// Reads what the watched services did not tell yet.
void Bus::Core::refresh(Lock& lock)
{
    isRefreshDue_ = false;
    nextTry_ = BusClock::now() + RETRY;
    std::vector<Look> looks;
    for (const auto& watcher : watchers_)
        for (const ObjectService* const service : watcher->services)
            looks.push_back({*service, nullptr});
    lookFor(lock, looks, BusClock::now() + milliseconds(QUESTION_TIMEOUT_MS));
    isTelling_ = true;
    noteChange();
    isTelling_ = false;
}

void Bus::Core::tell(Lock& lock)
{
    while (!moments_.empty() && !isEnding_) {
        const Moment moment = std::move(moments_.front());
        moments_.pop_front();
        const auto watchers = watchers_;
        for (const auto& watcher : watchers) {
            if (watcher->isOver)
                continue;
            watcher->isCalled = true;
            presentMoment = &moment;
            lock.unlock();
            watcher->changed();
            lock.lock();
            presentMoment = nullptr;
            watcher->isCalled = false;
            changed_.notify_all();
        }
    }
}

void Bus::Core::listenOnce(Lock& lock)
{
    const BusTime now = BusClock::now();
    const bool isFree = !isPumping_ && now - lastAsked_ >= NAP;
    std::vector<pollfd> sockets = {{kick_.number(), POLLIN, 0}};
    const std::size_t kernelBegins = sockets.size();
    if (!watchers_.empty())
        for (const int socket : kernel_.sockets())
            sockets.push_back({socket, POLLIN, 0});
    const std::size_t kernelEnds = sockets.size();
    if (isFree && bus_ != nullptr)
        sockets.push_back({sd_bus_get_fd(bus_), static_cast<short>(sd_bus_get_events(bus_)), 0});
    int timeout = -1;
    if (!isFree && bus_ != nullptr)
        timeout = static_cast<int>(NAP.count());
    else if (bus_ == nullptr && !watchers_.empty())
        timeout = std::max(1, millisecondsUntil(nextTry_));
    lock.unlock();
    poll(sockets.data(), sockets.size(), timeout);
    eventfd_t ignored = 0;
    eventfd_read(kick_.number(), &ignored);
    bool hasKernelTold = false;
    for (std::size_t i = kernelBegins; i < kernelEnds; ++i)
        if (sockets[i].revents != 0)
            hasKernelTold = kernel_.read(sockets[i].fd) || hasKernelTold;
    lock.lock();
    if (hasKernelTold)
        noteChange();
    if (isFree && !isPumping_ && bus_ != nullptr) {
        isPumping_ = true;
        process();
        isPumping_ = false;
        changed_.notify_all();
    }
}

class Bus::Core::WatchHandle : public Watch {
public:
    WatchHandle(Core& core, std::shared_ptr<Watcher> watcher)
        : core_(core), watcher_(std::move(watcher)), process_(getpid())
    {
    }
    // Waits for a call that runs, unless it is this thread's.
    ~WatchHandle() override
    {
        if (process_ != getpid())
            return;
        Lock lock(core_.mutex_);
        watcher_->isOver = true;
        core_.watchers_.remove(watcher_);
        if (core_.watchers_.empty())
            core_.moments_.clear();
        core_.kick();
        if (std::this_thread::get_id() != core_.thread_.get_id())
            core_.changed_.wait(lock, [this] { return !watcher_->isCalled; });
    }

private:
    Core& core_;
    const std::shared_ptr<Watcher> watcher_;
    const pid_t process_;
};

std::unique_ptr<Watch> Bus::Core::watch(std::vector<const ObjectService*> services,
                                        std::function<void()> changed)
{
    const Lock lock(mutex_);
    if (!startThread())
        return nullptr;
    auto watcher = std::make_shared<Watcher>();
    watcher->services = std::move(services);
    watcher->changed = std::move(changed);
    watchers_.push_back(watcher);
    kernel_.open();
    isRefreshDue_ = true;
    kick();
    return std::make_unique<WatchHandle>(*this, watcher);
}

} // namespace port::linux_backend
