// SPDX-License-Identifier: Apache-2.0
// What both interfaces of the packages do.
#ifndef PORT_SHIM_PACKAGES_H
#define PORT_SHIM_PACKAGES_H

#include <package_info.h>

#include "../backend/Backend.h"
#include "HandOut.h"

namespace port {

// These interfaces have no code for "not supported".
constexpr Codes PACKAGE_CODES{PACKAGE_MANAGER_ERROR_IO_ERROR, PACKAGE_MANAGER_ERROR_IO_ERROR,
                              PACKAGE_MANAGER_ERROR_PERMISSION_DENIED};

// Hands an installed package's version to a function, whose result is the result.
template <typename Use>
int withInstalledPackage(const char* name, Use use)
{
    return guarded([&]() -> int {
        const auto answer = backend().packages().version(name);
        if (answer && !answer.value().value)
            recordOrigin(coresystem_port::Question::PackageVersion,
                         Result<Fact>(notAvailable(answer.value().source + ": not installed")));
        else
            recordOrigin(coresystem_port::Question::PackageVersion, answer);
        if (!answer)
            return codeOf(answer.error().kind, PACKAGE_CODES);
        return answer.value().value ? use(*answer.value().value)
                                    : PACKAGE_MANAGER_ERROR_NO_SUCH_PACKAGE;
    });
}

} // namespace port

#endif
