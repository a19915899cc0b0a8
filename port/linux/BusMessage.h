// SPDX-License-Identifier: Apache-2.0
// Reads the messages of the bus. Time and memory are linear in a message's size, and what is kept
// of one is limited: more is refused with its reason.
#ifndef PORT_LINUX_BUS_MESSAGE_H
#define PORT_LINUX_BUS_MESSAGE_H

#include <initializer_list>
#include <memory>
#include <string>
#include <vector>

#include <systemd/sd-bus.h>

#include "Properties.h"

namespace port::linux_backend {

/// More than these are not believed: objects of a service, properties of an interface, and bytes of
/// all values of one message.
constexpr std::size_t MOST_OBJECTS = 1000;
constexpr std::size_t MOST_PROPERTIES = 500;
constexpr std::size_t MOST_BYTES = 4 * 1024 * 1024;

using Names = std::initializer_list<const char*>;

struct MessageRelease {
    void operator()(sd_bus_message* message) const
    {
        sd_bus_message_unref(message);
    }
};
using Message = std::unique_ptr<sd_bus_message, MessageRelease>;

// Reads one message from its beginning. Each of the functions takes the next value off; false, and
// the problem, when it is of another type or too much.
class MessageReader {
public:
    explicit MessageReader(sd_bus_message* message) : message_(message)
    {
        sd_bus_message_rewind(message, 1);
    }

    bool text(std::string& text, char type = SD_BUS_TYPE_STRING);
    bool texts(std::vector<std::string>& texts);
    /// A variant.
    bool value(Value& value);
    /// An a{sv}.
    bool properties(PropertyMap& properties);
    /// An a{sa{sv}}. Of the interfaces only the wanted ones, or all when none are named.
    bool interfaces(Interfaces& interfaces, Names wanted);
    /// An a{oa{sa{sv}}}.
    bool objects(Tree& objects, Names wanted);

    /// For people; empty when a type did not fit.
    const std::string& problem() const
    {
        return problem_;
    }

private:
    bool isRoomFor(std::size_t bytes);
    bool tooMany(const char* noun, std::size_t limit);
    bool numbers(std::map<std::uint32_t, std::uint32_t>& numbers);
    bool numberAndFlag(std::pair<std::uint32_t, bool>& both);
    bool bytes(std::vector<std::uint8_t>& bytes);
    bool contents(const std::string& type, Value& value);
    template <typename T>
    bool basic(char type, T& value);
    template <typename Read>
    bool each(const char* type, Read read);

    sd_bus_message* const message_;
    std::size_t bytes_ = 0;
    std::string problem_;
};

} // namespace port::linux_backend

#endif
