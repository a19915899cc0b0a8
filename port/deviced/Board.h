// SPDX-License-Identifier: Apache-2.0
// The board object of the device daemon on the system bus.
#ifndef PORT_DEVICED_BOARD_H
#define PORT_DEVICED_BOARD_H

#include "../backend/DeviceInfo.h"
#include "../common/GLibTypes.h"

namespace port::deviced {

constexpr char BUS_NAME[] = "org.tizen.system.deviced";

class Board {
public:
    explicit Board(DeviceInfo& deviceInfo) : deviceInfo_(deviceInfo) {}

    /// Shows the object to a connection, which must not outlive this. False when it has one
    /// already.
    bool show(GDBusConnection* connection);

private:
    static void onCall(GDBusConnection*, const char*, const char*, const char*, const char*,
                       GVariant*, GDBusMethodInvocation* call, gpointer self);
    void answerSerial(GDBusMethodInvocation* call);

    DeviceInfo& deviceInfo_;
};

} // namespace port::deviced

#endif
