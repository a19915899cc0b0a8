// SPDX-License-Identifier: Apache-2.0
#include <package_info.h>

#include "HandleKinds.h"
#include "Packages.h"
#include "Refusal.h"

using coresystem_port::Question;
using port::InstalledPackages;

int package_info_create(const char* package_id, package_info_h* info)
{
    if (const port::Refusal refusal{__func__, {Question::PackageVersion}})
        return refusal.code();
    if (package_id == nullptr || info == nullptr)
        return PACKAGE_MANAGER_ERROR_INVALID_PARAMETER;
    return port::withInstalledPackage(package_id, [info](const std::string& version) {
        *info = InstalledPackages::open({version});
        return PACKAGE_MANAGER_ERROR_NONE;
    });
}

int package_info_destroy(package_info_h info)
{
    const port::Refusal refusal{__func__};
    return refusal.after(InstalledPackages::close(info) ? PACKAGE_MANAGER_ERROR_NONE
                                                        : PACKAGE_MANAGER_ERROR_INVALID_PARAMETER);
}

int package_info_get_version(package_info_h info, char** version)
{
    if (const port::Refusal refusal{__func__, {Question::PackageVersion}})
        return refusal.code(version);
    if (version == nullptr)
        return PACKAGE_MANAGER_ERROR_INVALID_PARAMETER;
    return port::guarded([=]() -> int {
        const auto package = InstalledPackages::find(info);
        return package ? port::handOutCopy(package->version, version)
                       : PACKAGE_MANAGER_ERROR_INVALID_PARAMETER;
    });
}
