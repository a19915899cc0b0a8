// SPDX-License-Identifier: Apache-2.0
// The thread that listens between questions, and those who are told of changes.
#include <algorithm>
#include <system_error>

#include <poll.h>
#include <sys/eventfd.h>
#include <unistd.h>

#include "../common/BlockedSignals.h"
#include "BusCore.h"

namespace port::linux_backend {
namespace {

using std::chrono::milliseconds;

constexpr milliseconds RETRY{1000}; // to find a bus
constexpr milliseconds NAP{2};      // of the thread while others drive the connection
constexpr std::size_t MOST_MOMENTS = 512;

} // namespace

thread_local const Bus::Core::Moment* Bus::Core::presentMoment = nullptr;

struct Bus::Core::Watcher {
    std::vector<const ObjectService*> services;
    std::function<void()> changed;
    std::function<void()> settled;
    bool isCalled = false;
    bool isOver = false;
};

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
            moment.emplace(service->root.name, known(*service));
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
    const bool isAny = !moments_.empty();
    while (!moments_.empty() && !isEnding_) {
        const Moment moment = std::move(moments_.front());
        moments_.pop_front();
        presentMoment = &moment;
        callAll(lock, &Watcher::changed);
        presentMoment = nullptr;
    }
    if (isAny && !isEnding_)
        callAll(lock, &Watcher::settled);
}

void Bus::Core::callAll(Lock& lock, std::function<void()> Watcher::*call)
{
    const auto watchers = watchers_;
    for (const auto& watcher : watchers) {
        const auto called = (*watcher).*call; // it may be set meanwhile
        if (watcher->isOver || !called)
            continue;
        watcher->isCalled = true;
        lock.unlock();
        called();
        lock.lock();
        watcher->isCalled = false;
        changed_.notify_all();
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
    void tellSettled(std::function<void()> settled) override
    {
        const Lock lock(core_.mutex_);
        watcher_->settled = std::move(settled);
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
