// SPDX-License-Identifier: Apache-2.0
// The connection: made, driven by whoever waits, and lost.
#include "BusCore.h"

#include <algorithm>
#include <cerrno>
#include <cstring>

#include <poll.h>

namespace port::linux_backend {
namespace {

using std::chrono::milliseconds;

constexpr milliseconds GIVE_UP{5000}; // on a bus that never says a word
constexpr int MOST_MESSAGES = 64;     // that are taken without a look at the time

} // namespace

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

bool saysAbsent(const Error& error, const BusObject& service)
{
    return error.reason == absent(service.name).reason;
}

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

} // namespace port::linux_backend
