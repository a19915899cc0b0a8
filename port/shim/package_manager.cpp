// SPDX-License-Identifier: Apache-2.0
#include <package_manager.h>

#include "Packages.h"
#include "Refusal.h"

int package_manager_get_package_size_info(const char* package_id,
                                          package_manager_size_info_receive_cb callback, void*)
{
    if (const port::Refusal refusal{__func__, {coresystem_port::Question::PackageVersion}})
        return refusal.code();
    if (package_id == nullptr)
        return PACKAGE_MANAGER_ERROR_INVALID_PARAMETER;
    return port::withInstalledPackage(package_id, [callback](const std::string&) {
        // Nothing here tells a package's sizes, and none are made up.
        return callback == nullptr ? PACKAGE_MANAGER_ERROR_NONE
                                   : PACKAGE_MANAGER_ERROR_SYSTEM_ERROR;
    });
}
