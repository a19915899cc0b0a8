// SPDX-License-Identifier: Apache-2.0
// A file descriptor that is closed with its owner.
#ifndef DEVICEFILE_DESCRIPTOR_H
#define DEVICEFILE_DESCRIPTOR_H

#include <utility>
#include <vector>

#include <sys/eventfd.h>
#include <unistd.h>

namespace port {

class Descriptor {
public:
    Descriptor() = default;
    /// Takes it over; a negative number is none.
    explicit Descriptor(int number) : number_(number) {}
    Descriptor(Descriptor&& other) noexcept : number_(std::exchange(other.number_, -1)) {}
    Descriptor& operator=(Descriptor&& other) noexcept
    {
        std::swap(number_, other.number_);
        return *this;
    }
    ~Descriptor()
    {
        if (number_ >= 0)
            close(number_);
    }

    int number() const
    {
        return number_;
    }

private:
    int number_ = -1;
};

/// Whether that many more can be had. GLib ends the process when it lacks one; whoever needs it
/// asks before.
inline bool areDescriptorsLeft(std::size_t count)
{
    std::vector<Descriptor> taken;
    do
        taken.emplace_back(eventfd(0, EFD_CLOEXEC));
    while (taken.back().number() >= 0 && taken.size() < count);
    return taken.back().number() >= 0;
}

} // namespace port

#endif
