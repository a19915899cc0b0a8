// SPDX-License-Identifier: Apache-2.0
#include <package_info.h>

#include "HandleKinds.h"
#include "Packages.h"

using port::Call;
using port::InstalledPackages;
using port::PACKAGE_CODES;
using port::Question;

int package_info_create(const char* package_id, package_info_h* info)
{
    const Call call(__func__, PACKAGE_CODES, {Question::PackageVersion});
    return call.run([&]() -> int {
        if (package_id == nullptr || info == nullptr)
            return PACKAGE_MANAGER_ERROR_INVALID_PARAMETER;
        return port::withInstalledPackage(call, package_id, [info](const std::string& version) {
            *info = InstalledPackages::open({version});
            return PACKAGE_MANAGER_ERROR_NONE;
        });
    });
}

int package_info_destroy(package_info_h info)
{
    return Call(__func__, PACKAGE_CODES).release([&]() -> int {
        return InstalledPackages::close(info) ? PACKAGE_MANAGER_ERROR_NONE
                                              : PACKAGE_MANAGER_ERROR_INVALID_PARAMETER;
    });
}

int package_info_get_version(package_info_h info, char** version)
{
    const Call call(__func__, PACKAGE_CODES, {Question::PackageVersion});
    return call.run(version, [&]() -> int {
        const auto package = InstalledPackages::find(info);
        if (version == nullptr || !package)
            return PACKAGE_MANAGER_ERROR_INVALID_PARAMETER;
        return port::handOutCopy(package->version, version);
    });
}
