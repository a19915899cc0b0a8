// SPDX-License-Identifier: Apache-2.0
// The interfaces of the services that are played, as data.
#ifndef PORT_PLAYED_INTERFACES_H
#define PORT_PLAYED_INTERFACES_H

#include <map>
#include <string>

#include "../common/GLibTypes.h"

namespace port::played {

// One interface after the other, a member a line:
//   interface NAME
//   METHOD (IN) -> (OUT)
//   signal SIGNAL (ARGUMENTS)
//   PROPERTY TYPE ACCESS = VALUE
// Types are signatures, a value is a GVariant's text: what the real service says where it knows
// nothing.
extern const char MODEM_MANAGER_INTERFACES[];
extern const char NETWORK_MANAGER_INTERFACES[];
extern const char BLUEZ_INTERFACES[];
extern const char SYSTEMD_INTERFACES[];

using Values = std::map<std::string, Variant>;

struct Interface {
    GDBusInterfaceInfo* info; // lives as long as the process
    Values defaults;          // of every property
};

/// An interface of one of the services. It must be there.
const Interface& interfaceOf(const std::string& name);

} // namespace port::played

#endif
