// SPDX-License-Identifier: Apache-2.0
// The codes of one family of the platform's interface for a backend's errors.
#ifndef PORT_SHIM_CODES_H
#define PORT_SHIM_CODES_H

#include <tizen_error.h>

#include "../backend/Result.h"

namespace port {

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

} // namespace port

#endif
