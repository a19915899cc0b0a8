// SPDX-License-Identifier: Apache-2.0
// What every shim does with a backend's answer.
#ifndef PORT_SHIM_HAND_OUT_H
#define PORT_SHIM_HAND_OUT_H

#include <cstring>
#include <new>
#include <string>
#include <type_traits>

#include <tizen_error.h>

#include "../backend/Origin.h"
#include "../backend/Result.h"

namespace port {

// What one family of the platform's interface answers for a backend's errors.
struct Codes {
    int failed; // there was no answer
    int notSupported;
    int denied = TIZEN_ERROR_PERMISSION_DENIED;
    int noSim = failed;
    int noMemory = TIZEN_ERROR_OUT_OF_MEMORY;
    int invalid = TIZEN_ERROR_INVALID_PARAMETER;
};

inline int codeOf(Error::Kind kind, const Codes& codes)
{
    switch (kind) {
    case Error::Kind::NotSupported:
        return codes.notSupported;
    case Error::Kind::Denied:
        return codes.denied;
    case Error::Kind::NoSim:
        return codes.noSim;
    case Error::Kind::NotAvailable:
        break;
    }
    return codes.failed;
}

// Runs a shim's body; no exception leaves it.
template <typename Body>
int guarded(Body body, int failed = TIZEN_ERROR_IO_ERROR, int noMemory = TIZEN_ERROR_OUT_OF_MEMORY)
{
    try {
        return body();
    } catch (const std::bad_alloc&) {
        return noMemory;
    } catch (...) {
        return failed;
    }
}

// Copies a text into malloc memory.
inline int handOutCopy(const std::string& text, char** slot)
{
    char* const copy = strdup(text.c_str());
    if (copy == nullptr)
        return TIZEN_ERROR_OUT_OF_MEMORY;
    *slot = copy;
    return TIZEN_ERROR_NONE;
}

// Notes where an answer came from and passes its value to `take`, whose result is the shim's; an
// error has a code.
template <typename T, typename Take>
int pass(coresystem_port::Question question, const Result<Sourced<T>>& answer, const Codes& codes,
         Take take)
{
    recordOrigin(question, answer);
    return answer ? take(answer.value().value) : codeOf(answer.error().kind, codes);
}

// Hands a value out, a text as a copy; the slot stays untouched on failure.
template <typename T, typename Slot>
int handOut(coresystem_port::Question question, const Result<Sourced<T>>& answer, Slot* slot,
            const Codes& codes)
{
    return pass(question, answer, codes, [slot](const T& value) -> int {
        if constexpr (std::is_same_v<Slot, char*>)
            return handOutCopy(value, slot);
        else
            *slot = static_cast<Slot>(value);
        return TIZEN_ERROR_NONE;
    });
}

} // namespace port

#endif
