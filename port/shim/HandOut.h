// SPDX-License-Identifier: Apache-2.0
// What every shim does with a backend's answer.
#ifndef PORT_SHIM_HAND_OUT_H
#define PORT_SHIM_HAND_OUT_H

#include <cstring>
#include <new>

#include <tizen_error.h>

#include "../backend/Origin.h"
#include "../backend/Result.h"

namespace port {

// The platform's code for a backend's error.
inline int errorCode(Error::Kind kind, int notSupportedCode)
{
    return kind == Error::Kind::NotSupported ? notSupportedCode : TIZEN_ERROR_IO_ERROR;
}

// Runs a shim's body; no exception leaves it.
template <typename Body>
int guarded(Body body)
{
    try {
        return body();
    } catch (const std::bad_alloc&) {
        return TIZEN_ERROR_OUT_OF_MEMORY;
    } catch (...) {
        return TIZEN_ERROR_IO_ERROR;
    }
}

// Hands a text out in malloc memory; the slot stays untouched on failure.
inline int handOut(coresystem_port::Question question, const Result<Fact>& answer, char** slot,
                   int notSupportedCode)
{
    recordOrigin(question, answer);
    if (!answer)
        return errorCode(answer.error().kind, notSupportedCode);
    char* const copy = strdup(answer.value().value.c_str());
    if (copy == nullptr)
        return TIZEN_ERROR_OUT_OF_MEMORY;
    *slot = copy;
    return TIZEN_ERROR_NONE;
}

} // namespace port

#endif
