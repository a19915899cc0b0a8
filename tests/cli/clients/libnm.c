// SPDX-License-Identifier: Apache-2.0
// A program of libnm that knows nothing of where the service comes from. It prints what is there,
// and with an argument each time that it changed.
#include <NetworkManager.h>

static char *last;

static const char *nick(GType type, int value)
{
    GEnumClass *const values = g_type_class_ref(type);
    const GEnumValue *const found = g_enum_get_value(values, value);
    g_type_class_unref(values);
    return found != NULL ? found->value_nick : "unknown";
}

static void show(NMClient *client)
{
    const GPtrArray *const devices = nm_client_get_devices(client);
    GString *const line = g_string_new(nick(NM_TYPE_STATE, (int)nm_client_get_state(client)));
    g_string_append(line, nm_client_wireless_get_enabled(client) ? " wifi" : " no-wifi");
    g_string_append(line, nm_client_wwan_get_enabled(client) ? " wwan" : " no-wwan");
    for (guint i = 0; i < devices->len; ++i) {
        NMDevice *const device = g_ptr_array_index(devices, i);
        g_string_append_printf(line, " %s=%s", nm_device_get_iface(device),
                               nick(NM_TYPE_DEVICE_STATE, (int)nm_device_get_state(device)));
    }
    if (g_strcmp0(last, line->str) != 0)
        g_print("%s\n", line->str);
    g_free(last);
    last = g_string_free(line, FALSE);
}

static void follow(NMClient *client, NMDevice *device)
{
    g_signal_connect_swapped(device, "notify::state", G_CALLBACK(show), client);
}

int main(int argc, char **argv)
{
    GError *error = NULL;
    NMClient *const client = nm_client_new(NULL, &error);
    if (client == NULL)
        g_error("%s", error->message);
    show(client);
    if (argc > 1 && argv[1] != NULL) {
        const GPtrArray *const devices = nm_client_get_devices(client);
        for (guint i = 0; i < devices->len; ++i)
            follow(client, g_ptr_array_index(devices, i));
        g_signal_connect(client, "device-added", G_CALLBACK(follow), NULL);
        g_signal_connect(client, "notify", G_CALLBACK(show), NULL);
        g_main_loop_run(g_main_loop_new(NULL, FALSE));
    }
    g_object_unref(client);
    g_free(last);
    return 0;
}
