// SPDX-License-Identifier: Apache-2.0
#include "ChangeEvents.h"

#include <algorithm>
#include <atomic>
#include <utility>

#include <unistd.h>

#include "../../devicefile/Descriptor.h"
#include "Registration.h"

namespace port {
namespace {

using Value = std::optional<int>;

template <typename T>
Value valueOf(const Result<Sourced<T>>& answer)
{
    return answer ? Value(static_cast<int>(answer.value().value)) : std::nullopt;
}

Value wifiDevice(Backend& backend)
{
    const auto state = backend.network().wifi();
    return state ? Value(state.value().value != LinkState::Deactivated) : std::nullopt;
}

// Off and disconnected are one to whoever is told.
Value wifiStatus(Backend& backend)
{
    const auto state = backend.network().wifi();
    return state ? Value(state.value().value == LinkState::Connected) : std::nullopt;
}

template <auto read>
Value radio(Backend& backend)
{
    return valueOf((backend.network().*read)());
}

template <Question question>
Value fact(Backend& backend)
{
    return valueOf(backend.get<question>());
}

constexpr struct {
    Change change;
    Value (*read)(Backend&);
} CHANGES[] = {
    {Change::WifiDevice, wifiDevice},
    {Change::WifiConnection, radio<&Network::wifiConnection>},
    {Change::WifiStatus, wifiStatus},
    {Change::PacketData, fact<Question::PacketData>},
    {Change::FlightMode, fact<Question::FlightMode>},
    {Change::DataRoaming, fact<Question::DataRoaming>},
};

std::size_t indexOf(Change change)
{
    return static_cast<std::size_t>(change);
}

} // namespace

ChangeEvents::Slot& ChangeEvents::slotOf(Change change)
{
    return slots_[indexOf(change)];
}

bool ChangeEvents::isWatched()
{
    const bool isNew = watch_ == nullptr;
    if (isNew)
        watch_ = backend_.network().watch([this] { tell(); });
    if (isNew && watch_ != nullptr)
        watch_->tellSettled([this] { observe(); });
    return watch_ != nullptr;
}

bool ChangeEvents::isIdle() const
{
    return observers_.empty() && std::none_of(slots_.begin(), slots_.end(), [](const Slot& slot) {
               return slot.registration != nullptr;
           });
}

bool ChangeEvents::set(Change change, Callback callback)
{
    if (!areDescriptorsLeft(1)) // GLib's main context wants one
        return false;
    auto registration = std::make_shared<Registration>(std::move(callback));
    {
        const std::lock_guard<std::mutex> lifecycle(lifecycle_);
        if (!isWatched())
            return false;
        const std::lock_guard<std::mutex> reading(reading_);
        Slot& slot = slotOf(change);
        if (const Value now = CHANGES[indexOf(change)].read(backend_))
            slot.value = now;
        std::swap(slot.registration, registration);
    }
    if (registration != nullptr)
        registration->close();
    return true;
}

template <typename Remove>
void ChangeEvents::removeOne(const Remove& remove)
{
    const std::lock_guard<std::mutex> lifecycle(lifecycle_);
    std::unique_ptr<Watch> needless; // ends after the lock that its calls take
    const std::lock_guard<std::mutex> reading(reading_);
    remove();
    if (isIdle())
        needless.swap(watch_);
}

void ChangeEvents::unset(Change change)
{
    Slot removed;
    removeOne([&] { std::swap(slotOf(change), removed); });
    if (removed.registration != nullptr)
        removed.registration->close();
}

std::optional<ChangeEvents::Observer> ChangeEvents::observe(std::function<void()> look)
{
    const std::lock_guard<std::mutex> lifecycle(lifecycle_);
    if (!isWatched())
        return std::nullopt;
    const std::lock_guard<std::mutex> reading(reading_);
    return observers_.insert(observers_.end(), std::move(look));
}

void ChangeEvents::forget(Observer observer)
{
    removeOne([&] { observers_.erase(observer); });
}

void ChangeEvents::tell()
{
    const std::lock_guard<std::mutex> reading(reading_);
    for (const auto& row : CHANGES) {
        Slot& slot = slotOf(row.change);
        if (slot.registration == nullptr)
            continue;
        const Value now = row.read(backend_);
        if (!now || now == slot.value)
            continue;
        slot.value = now;
        slot.registration->post(*now);
    }
}

void ChangeEvents::observe()
{
    const std::lock_guard<std::mutex> reading(reading_);
    for (const auto& look : observers_)
        look();
}

ChangeEvents& changeEvents()
{
    // Never destroyed: the watch may still call while the process ends.
    struct Owned {
        const pid_t process = getpid();
        ChangeEvents events{backend()};
    };
    static std::atomic<Owned*> all{nullptr};
    Owned* now = all;
    while (now == nullptr || now->process != getpid()) {
        auto fresh = std::make_unique<Owned>();
        if (all.compare_exchange_strong(now, fresh.get()))
            now = fresh.release();
    }
    return now->events;
}

} // namespace port

struct coresystem_port::Changes::Observed {
    port::ChangeEvents& events;
    std::optional<port::ChangeEvents::Observer> observer;
};

coresystem_port::Changes::Changes(std::function<void()> changed)
    : observed_(new Observed{port::changeEvents(), {}})
{
    observed_->observer = observed_->events.observe(std::move(changed));
}

coresystem_port::Changes::~Changes()
{
    if (observed_->observer && &observed_->events == &port::changeEvents())
        observed_->events.forget(*observed_->observer);
}

bool coresystem_port::Changes::areWatched() const
{
    return observed_->observer.has_value();
}
