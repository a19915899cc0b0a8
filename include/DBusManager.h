// SPDX-License-Identifier: Apache-2.0
// Internal: the singleton that asks the device daemon on the system bus. Never installed.
#ifndef CORESYSTEM_D_BUS_MANAGER_H
#define CORESYSTEM_D_BUS_MANAGER_H

// As the bus library names them.
typedef struct _GDBusConnection GDBusConnection; // NOLINT(bugprone-reserved-identifier)
typedef struct _GDBusMessage GDBusMessage;       // NOLINT(bugprone-reserved-identifier)

/// The codes that GetDeviceUniqueID() returns.
enum CoreDbusError {
    CORE_DBUS_ERROR_NONE = 0,
    CORE_DBUS_ERROR_CONNECTION_FAIL = 1,    ///< no connection to the system bus
    CORE_DBUS_ERROR_REPLY_FAIL = 2,         ///< no reply, an error, or a reply without a text
    CORE_DBUS_ERROR_CONNECTION_TIME_OUT = 3 ///< connecting to the system bus took too long
};

/// The device's serial number, reached through GetInstance() on every call.
///
/// Every call asks the bus anew and blocks until the reply comes, at most for the bus library's own
/// time-out (25 seconds). No lock is taken; any thread.
class DBusManager {
public:
    /// The one instance, made by the first call; null if allocation failed. Any thread.
    static DBusManager* GetInstance();

    /// Stores a copy of the serial number, which the caller frees with `free`, or null on failure.
    /// \return a CoreDbusError.
    int GetDeviceUniqueID(char** id);

    /// \name The steps of it; each stores its CoreDbusError in `status` on failure
    /// \{

    /// The process's shared connection to the system bus, with a reference that is never dropped,
    /// so that the next call need not connect again; null on failure.
    GDBusConnection* InitDbusConnection(int* status);
    /// The daemon's reply, which the caller unreferences; null when there is none.
    GDBusMessage* SendDbusMethodNReceive(GDBusConnection* connection, int* status);
    /// A `strdup` copy of the reply's first argument; null when the reply is an error or holds no
    /// text.
    char* ParseDeviceUniqueID(GDBusMessage* reply, int* status);

    /// \}

private:
    friend struct CoreSystemInternals;

    DBusManager();
    virtual ~DBusManager();
    DBusManager(const DBusManager&) = delete;
    DBusManager& operator=(const DBusManager&) = delete;

    static DBusManager* instance_;
};

#endif
