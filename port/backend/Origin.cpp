// SPDX-License-Identifier: Apache-2.0
#include "Origin.h"

#include <map>
#include <mutex>

namespace {

std::mutex mutex;

std::map<coresystem_port::Question, coresystem_port::Origin>& origins()
{
    static auto& all = *new std::map<coresystem_port::Question, coresystem_port::Origin>;
    return all;
}

} // namespace

void port::recordOrigin(coresystem_port::Question question, coresystem_port::Origin origin)
{
    const std::lock_guard<std::mutex> lock(mutex);
    origins()[question] = std::move(origin);
}

coresystem_port::Origin coresystem_port::lastOrigin(Question question)
{
    const std::lock_guard<std::mutex> lock(mutex);
    return origins()[question];
}
