// SPDX-License-Identifier: Apache-2.0
// systemd's locale service.
#ifndef PORT_LINUX_LOCALE1_H
#define PORT_LINUX_LOCALE1_H

#include "Bus.h"

namespace port::linux_backend {

constexpr BusObject LOCALE1 = {"org.freedesktop.locale1", "/org/freedesktop/locale1",
                               "org.freedesktop.locale1", Start::WhenAsked};

} // namespace port::linux_backend

#endif
