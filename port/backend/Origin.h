// SPDX-License-Identifier: Apache-2.0
// Remembers where the last answer to each question came from.
#ifndef PORT_BACKEND_ORIGIN_H
#define PORT_BACKEND_ORIGIN_H

#include <coresystem_port.h>

#include "Result.h"

namespace port {

void recordOrigin(coresystem_port::Question question, const Result<Fact>& answer);

} // namespace port

#endif
