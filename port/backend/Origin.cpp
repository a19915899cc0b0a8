// SPDX-License-Identifier: Apache-2.0
#include "Origin.h"

#include <map>
#include <mutex>

using coresystem_port::Origin;
using coresystem_port::Origins;
using coresystem_port::Question;

namespace {

using Answered = std::map<Question, Origin>;

Origin originIn(const Answered& answered, Question question)
{
    const auto found = answered.find(question);
    return found != answered.end() ? found->second : Origin();
}

std::mutex mutex;

Answered& lastOrigins()
{
    static auto& all = *new Answered;
    return all;
}

} // namespace

struct coresystem_port::Origins::Collected {
    Answered answered;
    Collected* outer;
};

namespace coresystem_port {

struct OriginsAccess {
    // The innermost collection of this thread.
    static Origins::Collected*& innermost()
    {
        static thread_local Origins::Collected* collected = nullptr;
        return collected;
    }

    static void record(Question question, const Origin& origin)
    {
        for (auto* each = innermost(); each != nullptr; each = each->outer)
            each->answered[question] = origin;
    }
};

} // namespace coresystem_port

using coresystem_port::OriginsAccess;

Origins::Origins() : collected_(new Collected{{}, OriginsAccess::innermost()})
{
    OriginsAccess::innermost() = collected_.get();
}

Origins::~Origins()
{
    OriginsAccess::innermost() = collected_->outer;
}

Origin Origins::of(Question question) const
{
    return originIn(collected_->answered, question);
}

void port::recordOrigin(Question question, const Origin& origin)
{
    OriginsAccess::record(question, origin);
    const std::lock_guard<std::mutex> lock(mutex);
    lastOrigins()[question] = origin;
}

Origin coresystem_port::lastOrigin(Question question)
{
    const std::lock_guard<std::mutex> lock(mutex);
    return originIn(lastOrigins(), question);
}
