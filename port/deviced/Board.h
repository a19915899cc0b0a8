// SPDX-License-Identifier: Apache-2.0
// The board object of the device daemon on the system bus.
#ifndef PORT_DEVICED_BOARD_H
#define PORT_DEVICED_BOARD_H

#include "../backend/DeviceInfo.h"
#include "../backend/Faults.h"
#include "../common/GLibTypes.h"

namespace port::deviced {

constexpr char BUS_NAME[] = "org.tizen.system.deviced";

class Board {
public:
    Board(DeviceInfo& deviceInfo, Faults& faults) : deviceInfo_(deviceInfo), faults_(faults) {}

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

    DeviceInfo& deviceInfo_;
    Faults& faults_;
};

} // namespace port::deviced

#endif
