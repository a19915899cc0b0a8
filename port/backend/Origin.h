// SPDX-License-Identifier: Apache-2.0
// Notes where each answer came from: see coresystem_port::Origins and lastOrigin().
#ifndef PORT_BACKEND_ORIGIN_H
#define PORT_BACKEND_ORIGIN_H

#include <coresystem_port.h>

#include "Result.h"

namespace port {

void recordOrigin(coresystem_port::Question question, const coresystem_port::Origin& origin);

template <typename T>
void recordOrigin(coresystem_port::Question question, const Result<Sourced<T>>& answer)
{
    coresystem_port::Origin origin;
    origin.available = static_cast<bool>(answer);
    (answer ? origin.source : origin.reason) =
        answer ? answer.value().source : answer.error().reason;
    recordOrigin(question, origin);
}

} // namespace port

#endif
