// SPDX-License-Identifier: Apache-2.0
// The one D-Bus transport: a connection to the system bus that is the port's own.
//
// It never ends the application, never blocks without a bound, and is kept: it is opened again only
// after the bus went away. A process that was forked from one that had asked the bus gets no answer
// from it: GLib's bus thread stays behind in the parent, and waiting for it would never end.
#ifndef PORT_LINUX_BUS_H
#define PORT_LINUX_BUS_H

#include <atomic>
#include <initializer_list>
#include <mutex>
#include <string>
#include <vector>

#include <sys/types.h>

#include "../backend/Result.h"
#include "../common/GLibTypes.h"
#include "Properties.h"

namespace port::linux_backend {

using Connection = std::shared_ptr<GDBusConnection>;

constexpr auto BUS_CLIENT = static_cast<GDBusConnectionFlags>(
    G_DBUS_CONNECTION_FLAGS_AUTHENTICATION_CLIENT | G_DBUS_CONNECTION_FLAGS_MESSAGE_BUS_CONNECTION);

// Whether asking a service may start it. hostname1 and locale1 live only while they are asked, so
// the bus starts them on purpose; nothing else ever is.
enum class Start { WhenAsked, Never };

// An object of a service of the system bus, and one of its interfaces.
struct BusObject {
    const char* name;
    const char* path;
    const char* interface;
    Start start;
};

// One method call. The texts of its object outlive it.
struct Question {
    BusObject object;
    const char* method;
    Variant arguments; // a tuple; null for none
    const char* replyType;
};

/// All properties of the object's interface; the reply is an (a{sv}).
Question propertiesOf(const BusObject& object);

/// All objects below this one, which is an object manager; the reply is an (a{oa{sa{sv}}}).
Question objectsBelow(const BusObject& manager);

struct Reply {
    Variant body;
    std::string sender; // which no other process of this bus ever has
};

class Bus {
public:
    /// How long a connection and a call may take.
    static constexpr int CONNECT_TIMEOUT_MS = 500;
    static constexpr int CALL_TIMEOUT_MS = 1000;

    /// Asks several questions in one round trip: all are sent before the first reply is awaited.
    /// The replies stand in the order of the questions. `timeoutMs` is for all of them together,
    /// connecting left out.
    std::vector<Result<Reply>> ask(const std::vector<Question>& questions,
                                   int timeoutMs = CALL_TIMEOUT_MS);
    Result<Reply> ask(const Question& question);

    /// All properties of an object's interface.
    Result<Properties> properties(const BusObject& object);

    /// The first of several properties that is a text and not empty; the error says what is wrong
    /// with each.
    Result<Fact> textProperty(const BusObject& object, std::initializer_list<const char*> names);

    /// For each service "running", "starts on demand", or the error why neither.
    std::vector<Result<std::string>> statesOf(const std::vector<BusObject>& services);

private:
    Result<Connection> connection();

    bool isOwnedByThisProcess();

    std::atomic<pid_t> owner_{0}; // the process that asked first
    std::mutex mutex_;
    Connection connection_;
    Error problem_{};                   // of the last attempt to connect
    std::atomic<unsigned> attempts_{0}; // to connect, finished
};

} // namespace port::linux_backend

#endif
