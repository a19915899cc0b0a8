// SPDX-License-Identifier: Apache-2.0
// The one D-Bus transport: a connection to the system bus that is the port's own.
//
// It never ends the application, never blocks without a bound, and is kept: nothing reconnects
// while the bus lives.
#ifndef PORT_LINUX_BUS_H
#define PORT_LINUX_BUS_H

#include <mutex>
#include <string>
#include <vector>

#include "../backend/Result.h"
#include "GLibTypes.h"

namespace port::linux_backend {

using Connection = std::shared_ptr<GDBusConnection>;
using Variant = std::shared_ptr<GVariant>;

// A service of the system bus that is asked for its properties.
struct BusObject {
    const char* name;
    const char* path;
    const char* interface;
};

class Bus {
public:
    /// How long a connection and a call may take.
    static constexpr int CONNECT_TIMEOUT_MS = 500;
    static constexpr int CALL_TIMEOUT_MS = 1000;

    /// All properties of an object's interface, as a{sv}. Services like hostname1 and locale1 live
    /// only while they are asked: the bus starts them for this call.
    Result<Variant> properties(const BusObject& object);

    /// "running", "starts on demand", or the error why neither.
    Result<std::string> stateOf(const std::string& name);

private:
    Result<Connection> connection();
    Result<Variant> call(const BusObject& object, const char* method, GVariant* arguments,
                         const char* replyType);
    Result<std::vector<std::string>> names(const char* method);

    std::mutex mutex_;
    Connection connection_;
};

/// A text property; an error that names what is wrong when it is missing, empty or no text.
Result<std::string> textProperty(const Variant& properties, const char* name);

} // namespace port::linux_backend

#endif
