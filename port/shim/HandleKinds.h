// SPDX-License-Identifier: Apache-2.0
// The objects behind the handles of the connection and package interfaces.
#ifndef PORT_SHIM_HANDLE_KINDS_H
#define PORT_SHIM_HANDLE_KINDS_H

#include <string>

#include <net_connection.h>
#include <package_info.h>

#include "Handles.h"

namespace port {

struct Connection {};
using Connections = Handles<connection_h, Connection>;

struct InstalledPackage {
    std::string version;
};
using InstalledPackages = Handles<package_info_h, InstalledPackage>;

} // namespace port

#endif
