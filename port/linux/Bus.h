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
#include "GLibTypes.h"

namespace port::linux_backend {

using Connection = std::shared_ptr<GDBusConnection>;
using Variant = std::shared_ptr<GVariant>;

// Whether asking a service may start it. hostname1 and locale1 live only while they are asked, so
// the bus starts them on purpose; nothing else ever is.
enum class Start { WhenAsked, Never };

// A service of the system bus that is asked for its properties.
struct BusObject {
    const char* name;
    const char* path;
    const char* interface;
    Start start;
};

class Bus {
public:
    /// How long a connection and a call may take.
    static constexpr int CONNECT_TIMEOUT_MS = 500;
    static constexpr int CALL_TIMEOUT_MS = 1000;

    /// All properties of an object's interface, as a{sv}.
    Result<Variant> properties(const BusObject& object);

    /// The first of several properties that is a text and not empty; the error says what is wrong
    /// with each.
    Result<Fact> textProperty(const BusObject& object, std::initializer_list<const char*> names);

    /// "running", "starts on demand", or the error why neither.
    Result<std::string> stateOf(const std::string& name);

private:
    Result<Connection> connection();
    Result<Variant> call(const BusObject& object, const char* method, GVariant* arguments,
                         const char* replyType);
    Result<std::vector<std::string>> names(const char* method);

    bool isOwnedByThisProcess();

    std::atomic<pid_t> owner_{0}; // the process that asked first
    std::mutex mutex_;
    Connection connection_;
    Error problem_{};                   // of the last attempt to connect
    std::atomic<unsigned> attempts_{0}; // to connect, finished
};

} // namespace port::linux_backend

#endif
