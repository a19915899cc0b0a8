// SPDX-License-Identifier: Apache-2.0
#include "DBusManager.h"

#include <cstdlib>
#include <cstring>

#define GLIB_DISABLE_DEPRECATION_WARNINGS // g_type_init(): devices have a GLib that needs it
#include <gio/gio.h>

#define CORESYSTEM_DEFAULT_TAG "Logger"
#include "Log.h"
#include "Singleton.h"

using namespace coresystem;

namespace {

// The text alone tells a time-out, not the error's domain or code: frozen 33.
bool tellsTimeOut(const GError& error)
{
    return std::strstr(error.message, "Time") != nullptr;
}

} // namespace

CORESYSTEM_DEFINE_GET_INSTANCE(DBusManager);

DBusManager::DBusManager()
{
    DEBUG_LINE("DBusManager()");
}

DBusManager::~DBusManager() {}

int DBusManager::GetDeviceUniqueID(char** id)
{
    DEBUG_LINE("DBusManager::GetDeviceUniqueID");
    int status = CORE_DBUS_ERROR_NONE;
    *id = nullptr;
    GDBusConnection* const connection = InitDbusConnection(&status);
    if (connection == nullptr)
        return status;
    GDBusMessage* const reply = SendDbusMethodNReceive(connection, &status);
    if (reply == nullptr)
        return status;
    char* const serial = ParseDeviceUniqueID(reply, &status);
    g_object_unref(reply);
    if (serial == nullptr)
        return status;
    *id = strdup(serial);
    DEBUG_LINE("deviceUniqueID : %s", *id);
    std::free(serial);
    return status;
}

GDBusConnection* DBusManager::InitDbusConnection(int* status)
{
    DEBUG_LINE("DBusManager::InitDbusConnection");
    g_type_init();
    GError* error = nullptr;
    GDBusConnection* const connection = g_bus_get_sync(G_BUS_TYPE_SYSTEM, nullptr, &error);
    if (connection != nullptr) {
        DEBUG_LINE("Success GDBusConnection !!");
        return connection;
    }
    ERROR_LINE("GDBusConnection is NULL");
    if (error == nullptr) {
        *status = CORE_DBUS_ERROR_CONNECTION_FAIL;
        ERROR_LINE("[dbus] CORE_DBUS_ERROR_CONNECTION_FAIL");
        return nullptr;
    }
    ERROR_LINE("g_bus_get_sync() failed:[%d:%s]", error->code, error->message);
    if (tellsTimeOut(*error)) {
        *status = CORE_DBUS_ERROR_CONNECTION_TIME_OUT;
        ERROR_LINE("[dbus] DBUS_ERROR_CONNECTION_TIME_OUT");
    } else {
        *status = CORE_DBUS_ERROR_CONNECTION_FAIL;
        ERROR_LINE("[dbus] DBUS_ERROR_CONNECTION_FAIL");
    }
    g_error_free(error);
    return nullptr;
}

GDBusMessage* DBusManager::SendDbusMethodNReceive(GDBusConnection* connection, int* status)
{
    DEBUG_LINE("DBusManager::SendDbusMethodNReceive");
    GDBusMessage* const message = g_dbus_message_new_method_call(
        "org.tizen.system.deviced", "/Org/Tizen/System/DeviceD/Board",
        "org.tizen.system.deviced.Board", "GetSerial");
    GError* error = nullptr;
    GDBusMessage* const reply = g_dbus_connection_send_message_with_reply_sync(
        connection, message, G_DBUS_SEND_MESSAGE_FLAGS_NONE, -1, nullptr, nullptr, &error);
    g_object_unref(message);
    if (reply == nullptr) {
        ERROR_LINE("reply is NULL");
        if (error != nullptr) {
            ERROR_LINE("g_dbus_connection_send_message_with_reply_sync() failed:[%d:%s]",
                       error->code, error->message);
            g_error_free(error);
        }
        *status = CORE_DBUS_ERROR_REPLY_FAIL;
        ERROR_LINE("[dbus] CORE_DBUS_ERROR_REPLY_FAIL");
        return nullptr;
    }
    DEBUG_LINE("Success get reply");
    g_dbus_connection_flush_sync(connection, nullptr, nullptr);
    return reply;
}

char* DBusManager::ParseDeviceUniqueID(GDBusMessage* reply, int* status)
{
    DEBUG_LINE("DBusManager::ParseDeviceUniqueID");
    if (g_dbus_message_get_message_type(reply) == G_DBUS_MESSAGE_TYPE_ERROR) {
        GError* error = nullptr;
        g_dbus_message_to_gerror(reply, &error);
        if (error != nullptr) {
            ERROR_LINE("g_dbus_message_to_gerror() failed:[%d:%s]", error->code, error->message);
            g_error_free(error);
        }
        *status = CORE_DBUS_ERROR_REPLY_FAIL;
        return nullptr;
    }
    const char* const serial = g_dbus_message_get_arg0(reply);
    if (serial == nullptr) { // the first argument is no text
        *status = CORE_DBUS_ERROR_REPLY_FAIL;
        return nullptr;
    }
    DEBUG_LINE("Success to get deviceUniqueID: %s ", serial);
    return strdup(serial);
}
