// SPDX-License-Identifier: Apache-2.0
// Any bytes as the body of a service's reply, as the bus hands it over: of the type that it says,
// with any content.
#include <algorithm>
#include <string>

#include <sys/socket.h>
#include <unistd.h>

#include "Fuzz.h"
#include "port/linux/BusMessage.h"

using namespace port::linux_backend;

namespace {

constexpr const char* NAMES[] = {"Device", "State", "Sims", "Locale", "PrettyHostname", "Powered"};

template <class Answer>
void look(const Answer& answer)
{
    require(answer || !answer.error().reason.empty(), "what cannot be read has a reason");
}

void readEverything(const Properties& properties)
{
    for (const char* const name : NAMES) {
        look(properties.flag(name));
        look(properties.text(name));
        look(properties.texts(name));
        look(properties.path(name));
        look(properties.paths(name));
        look(properties.number(name));
        look(properties.signedNumber(name));
        look(properties.numberOf(name, 3));
    }
}

std::string number(std::size_t value)
{
    std::string text;
    for (int shift = 0; shift < 32; shift += 8)
        text += static_cast<char>(value >> shift);
    return text;
}

// A reply of that type, as it goes over a socket.
std::string replyOf(const std::string& type, const std::string& body)
{
    const std::string fields = "\x05\x01u" + std::string(1, '\0') + number(1) + "\x08\x01g" +
                               std::string(1, '\0') + static_cast<char>(type.size()) + type +
                               std::string(1, '\0');
    std::string header = "l\x02" + std::string(1, '\0') + "\x01" + number(body.size()) + number(1) +
                         number(fields.size()) + fields;
    header.resize((header.size() + 7) / 8 * 8);
    return header + body;
}

// The message at the other end of a connection; null for one that is refused.
class Connection {
public:
    explicit Connection(const std::string& reply)
    {
        int ends[2];
        require(socketpair(AF_UNIX, SOCK_STREAM | SOCK_CLOEXEC, 0, ends) == 0, "a socket");
        const std::string all =
            "DATA\r\nOK 0123456789abcdef0123456789abcdef\r\nAGREE_UNIX_FD\r\n" + reply;
        require(sd_bus_new(&bus_) >= 0 && sd_bus_set_fd(bus_, ends[0], ends[0]) >= 0 &&
                    send(ends[1], all.data(), all.size(), MSG_NOSIGNAL) ==
                        static_cast<ssize_t>(all.size()) &&
                    sd_bus_start(bus_) >= 0,
                "a connection");
        sd_bus_message* message = nullptr;
        for (int result = 1; result > 0 && message == nullptr;)
            result = sd_bus_process(bus_, &message);
        message_.reset(message);
        close(ends[1]);
    }
    ~Connection()
    {
        message_.reset();
        sd_bus_close_unref(bus_);
    }
    Connection(const Connection&) = delete;
    Connection& operator=(const Connection&) = delete;

    sd_bus_message* message() const
    {
        return message_.get();
    }

private:
    sd_bus* bus_ = nullptr;
    Message message_;
};

} // namespace

int LLVMFuzzerTestOneInput(const unsigned char* data, std::size_t size)
{
    const std::string text(reinterpret_cast<const char*>(data), std::min<std::size_t>(size, 65536));
    if (const Connection properties(replyOf("a{sv}", text)); properties.message() != nullptr) {
        PropertyMap all;
        if (MessageReader(properties.message()).properties(all))
            readEverything(Properties(std::make_shared<const PropertyMap>(all)));
    }
    if (const Connection objects(replyOf("a{oa{sa{sv}}}", text)); objects.message() != nullptr) {
        Tree tree;
        if (MessageReader(objects.message()).objects(tree, {}))
            for (const auto& [path, interfaces] : tree) {
                require(sd_bus_object_path_is_valid(path.c_str()) > 0, "an object has a path",
                        path);
                for (const auto& [name, all] : interfaces)
                    readEverything(Properties(all));
            }
    }
    return 0;
}
