// SPDX-License-Identifier: Apache-2.0
// Notes where each answer came from: see coresystem_port::Origins and lastOrigin().
#ifndef PORT_BACKEND_ORIGIN_H
#define PORT_BACKEND_ORIGIN_H

#include <coresystem_port.h>

#include "Result.h"

namespace port {

void recordOrigin(coresystem_port::Question question, const coresystem_port::Origin& origin);

template <typename T>
coresystem_port::Origin originOf(const Result<Sourced<T>>& answer)
{
    if (answer)
        return {true, answer.value().source, ""};
    return {false, "", answer.error().reason, answer.error().kind == Error::Kind::NotSupported};
}

template <typename T>
void recordOrigin(coresystem_port::Question question, const Result<Sourced<T>>& answer)
{
    recordOrigin(question, originOf(answer));
}

} // namespace port

#endif
