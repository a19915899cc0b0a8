// SPDX-License-Identifier: Apache-2.0
// systemd's host name service.
#ifndef PORT_LINUX_HOSTNAME1_H
#define PORT_LINUX_HOSTNAME1_H

#include "Bus.h"

namespace port::linux_backend {

constexpr BusObject HOSTNAME1 = {"org.freedesktop.hostname1", "/org/freedesktop/hostname1",
                                 "org.freedesktop.hostname1", Start::WhenAsked};

} // namespace port::linux_backend

#endif
