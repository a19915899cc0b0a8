// SPDX-License-Identifier: Apache-2.0
#include <package_manager.h>

#include "Packages.h"

using port::Question;

int package_manager_get_package_size_info(const char* package_id,
                                          package_manager_size_info_receive_cb callback, void*)
{
    const port::Call call(__func__, port::PACKAGE_CODES, {Question::PackageVersion});
    return call.run([&]() -> int {
        if (package_id == nullptr)
            return PACKAGE_MANAGER_ERROR_INVALID_PARAMETER;
        return port::withInstalledPackage(call, package_id, [callback](const std::string&) {
            // Nothing here tells a package's sizes, and none are made up.
            return callback == nullptr ? PACKAGE_MANAGER_ERROR_NONE
                                       : PACKAGE_MANAGER_ERROR_SYSTEM_ERROR;
        });
    });
}
