// SPDX-License-Identifier: Apache-2.0
// Shared by both interfaces of the packages.
#ifndef PORT_SHIM_PACKAGES_H
#define PORT_SHIM_PACKAGES_H

#include <package_info.h>

#include "Call.h"

namespace port {

// These interfaces have no code for "not supported".
constexpr Codes PACKAGE_CODES{PACKAGE_MANAGER_ERROR_IO_ERROR, PACKAGE_MANAGER_ERROR_IO_ERROR,
                              PACKAGE_MANAGER_ERROR_PERMISSION_DENIED};

// Hands an installed package's version to a function, whose result is the result.
template <typename Use>
int withInstalledPackage(const Call& call, const char* name, Use use)
{
    using Version = std::optional<std::string>;
    const auto answer = backend().packageVersion(name);
    const int result =
        call.pass(Question::PackageVersion, answer, [&](const Version& version) -> int {
            return version ? use(*version) : PACKAGE_MANAGER_ERROR_NO_SUCH_PACKAGE;
        });
    if (answer && !answer.value().value)
        recordOrigin(Question::PackageVersion,
                     {false, "", answer.value().source + ": not installed"});
    return result;
}

} // namespace port

#endif
