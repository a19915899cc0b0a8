// SPDX-License-Identifier: Apache-2.0
#include "Faults.h"

namespace port::simulator {
namespace {

using devicefile::Fault;
using devicefile::Meaning;
using devicefile::Value;

bool isSame(const Fault& one, const Fault& other)
{
    return one.error == other.error && one.delayMs == other.delayMs && one.call == other.call;
}

CallFault::Answer answerOf(const Meaning& meaning)
{
    switch (meaning.kind) {
    case Meaning::Kind::Nothing:
        return CallFault::Answer::Nothing;
    case Meaning::Kind::NotAString:
        return CallFault::Answer::NotAString;
    case Meaning::Kind::BusError:
        return CallFault::Answer::BusError;
    default:
        return CallFault::Answer::Code;
    }
}

std::string reasonOf(const std::string& call, const Fault& rule, const std::string& source)
{
    const bool succeeds = rule.meaning == Meaning::Kind::Nothing;
    return source + ": " + call + (succeeds ? " answers " : " fails with ") + rule.error;
}

CallFault faultOf(const std::string& call, const Fault& rule, const std::string& source)
{
    CallFault fault;
    fault.delay = std::chrono::milliseconds(rule.delayMs);
    if (rule.error.empty())
        return fault;
    fault.reason = reasonOf(call, rule, source);
    fault.answer = answerOf(rule.meaning);
    if (fault.answer == CallFault::Answer::Code)
        fault.code = static_cast<int>(rule.meaning.number);
    if (fault.answer == CallFault::Answer::BusError)
        fault.busError = rule.error;
    return fault;
}

} // namespace

std::optional<CallFault> SimulatedFaults::meet(const char* call)
{
    const auto now = file_.device();
    if (!now)
        return std::nullopt; // the questions fail by themselves
    const Value* const stated = now.value()->section("fault").find(call);
    if (stated == nullptr) {
        forget(call);
        return std::nullopt;
    }
    const auto& rule = std::get<Fault>(stated->content);
    if (!isTheCall(call, rule))
        return std::nullopt;
    return faultOf(call, rule, stated->source);
}

bool SimulatedFaults::isTheCall(const std::string& call, const Fault& rule)
{
    const std::lock_guard<devicefile::ForkMutex> lock(mutex_);
    Count& count = counts_[call];
    if (!isSame(count.rule, rule))
        count = {rule, 0};
    ++count.calls;
    return rule.call == 0 || rule.call == count.calls;
}

void SimulatedFaults::forget(const std::string& call)
{
    const std::lock_guard<devicefile::ForkMutex> lock(mutex_);
    counts_.erase(call);
}

} // namespace port::simulator
