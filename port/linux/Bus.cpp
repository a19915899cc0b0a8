// SPDX-License-Identifier: Apache-2.0
#include "Bus.h"

#include <string_view>

#include <unistd.h>

#include "BusCore.h"

namespace port::linux_backend {
namespace {

Error forked()
{
    return notAvailable("the process was forked after it had asked the system bus");
}

// "hostname1" of "org.freedesktop.hostname1".
std::string shortName(const BusObject& object)
{
    const std::string_view name(object.name);
    return std::string(name.substr(name.rfind('.') + 1));
}

} // namespace

Bus::Bus(std::initializer_list<const char*> services) : core_(std::make_unique<Core>(services)) {}

// In a forked process the thread of the one before is not there to be waited for.
Bus::~Bus()
{
    if (!isOfThisProcess())
        static_cast<void>(core_.release());
}

bool Bus::isOfThisProcess()
{
    pid_t owner = 0;
    return owner_.compare_exchange_strong(owner, getpid()) || owner == getpid();
}

std::vector<Result<Objects>> Bus::look(const std::vector<Look>& questions)
{
    if (!isOfThisProcess())
        return {questions.size(), forked()};
    return core_->look(questions);
}

Result<Objects> Bus::look(const Look& question)
{
    return look(std::vector<Look>{question}).front();
}

Result<Properties> Bus::properties(const BusObject& object)
{
    if (!isOfThisProcess())
        return forked();
    const AwaitedReply reply = core_->properties(object);
    if (reply->error)
        return *reply->error;
    return Properties(reply->properties);
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
    if (!isOfThisProcess())
        return {services.size(), forked()};
    return core_->statesOf(services);
}

std::unique_ptr<Watch> Bus::watch(std::vector<const ObjectService*> services,
                                  std::function<void()> changed)
{
    if (!isOfThisProcess())
        return nullptr;
    return core_->watch(std::move(services), std::move(changed));
}

} // namespace port::linux_backend
