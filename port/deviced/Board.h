// SPDX-License-Identifier: Apache-2.0
// The board object of the device daemon on the system bus.
#ifndef PORT_DEVICED_BOARD_H
#define PORT_DEVICED_BOARD_H

#include <map>
#include <mutex>
#include <string>

#include "../backend/Backend.h"
#include "../common/GLibTypes.h"

namespace port::deviced {

constexpr char BUS_NAME[] = "org.tizen.system.deviced";

/// Keeps each caller from having more than so many calls under way: the rest is refused on the bus
/// library's own thread, before it takes a place in a queue.
class CallLimit {
public:
    static constexpr unsigned CALLS_OF_ONE = 64;
    static constexpr unsigned CALLS_OF_ALL = 4096;

    /// From now on for all calls that come by the connection, which must not outlive this.
    void apply(GDBusConnection* connection);

private:
    static GDBusMessage* onMessage(GDBusConnection* connection, GDBusMessage* message,
                                   gboolean isIncoming, gpointer self);
    bool take(const std::string& caller);
    void giveBack(const std::string& caller);

    std::mutex mutex_;
    std::map<std::string, unsigned> underWay_;
    unsigned all_ = 0;
};

class Board {
public:
    explicit Board(Backend& backend) : backend_(backend) {}

    /// Shows the object to a connection, which must not outlive this. False when it has one
    /// already.
    bool show(GDBusConnection* connection);

private:
    static void onCall(GDBusConnection*, const char*, const char*, const char*, const char*,
                       GVariant*, GDBusMethodInvocation* call, gpointer self);
    static gboolean onDelayEnd(gpointer late);
    void meetSerial(GDBusMethodInvocation* call);
    void answerSerial(GDBusMethodInvocation* call, const CallFault& fault);
    void tellSerial(GDBusMethodInvocation* call);

    Backend& backend_;
    CallLimit limit_;
};

} // namespace port::deviced

#endif
