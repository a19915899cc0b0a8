// SPDX-License-Identifier: Apache-2.0
#include "KernelEvents.h"

#include <array>
#include <cerrno>

#include <fcntl.h>
#include <linux/netlink.h>
#include <linux/rtnetlink.h>
#include <sys/socket.h>

namespace port::linux_backend {
namespace {

constexpr char SWITCH_EVENTS[] = "/dev/rfkill"; // each read is one event

Descriptor listenToLinks()
{
    Descriptor socket(::socket(AF_NETLINK, SOCK_RAW | SOCK_CLOEXEC | SOCK_NONBLOCK, NETLINK_ROUTE));
    sockaddr_nl address = {};
    address.nl_family = AF_NETLINK;
    address.nl_groups = RTMGRP_LINK;
    if (socket.number() < 0 ||
        bind(socket.number(), reinterpret_cast<sockaddr*>(&address), sizeof address) != 0)
        return {};
    return socket;
}

} // namespace

void KernelEvents::open()
{
    if (!sockets_.empty())
        return;
    Descriptor links = listenToLinks();
    if (links.number() >= 0)
        sockets_.push_back(std::move(links));
    Descriptor switches(::open(SWITCH_EVENTS, O_RDONLY | O_NONBLOCK | O_CLOEXEC));
    if (switches.number() >= 0)
        sockets_.push_back(std::move(switches));
}

void KernelEvents::close()
{
    sockets_.clear();
}

std::vector<int> KernelEvents::sockets() const
{
    std::vector<int> numbers;
    for (const Descriptor& socket : sockets_)
        numbers.push_back(socket.number());
    return numbers;
}

bool KernelEvents::read(int socket)
{
    // Only the arrival counts, even when more was sent than the socket could hold: the state is read
    // from /sys/class.
    std::array<char, 16384> text;
    bool hasTold = false;
    while (::read(socket, text.data(), text.size()) > 0 || errno == ENOBUFS) {
        hasTold = true;
        errno = 0;
    }
    return hasTold;
}

} // namespace port::linux_backend
