// SPDX-License-Identifier: Apache-2.0
// The kernel's messages about changes of interfaces (rtnetlink(7)) and of switches of radios
// (/dev/rfkill). Where one of the two is missing, its changes go unnoticed.
#ifndef PORT_LINUX_KERNEL_EVENTS_H
#define PORT_LINUX_KERNEL_EVENTS_H

#include <vector>

#include "../../devicefile/Descriptor.h"

namespace port::linux_backend {

class KernelEvents {
public:
    void open();
    void close();

    /// The open sockets; read() takes what arrives at them.
    std::vector<int> sockets() const;

    /// Takes all that waits at one of the sockets; whether it may tell of a change.
    static bool read(int socket);

private:
    std::vector<Descriptor> sockets_;
};

} // namespace port::linux_backend

#endif
