// SPDX-License-Identifier: Apache-2.0
// A program of libmm-glib that knows nothing of where the service comes from. It prints what modems
// are there, and with an argument each time that they changed.
#include <libmm-glib.h>

static char *last;

static void describe(MMObject *object, GString *line)
{
    MMModem *const modem = mm_object_peek_modem(object);
    MMModem3gpp *const network = mm_object_peek_modem_3gpp(object);
    MMSim *const sim = mm_modem_get_sim_sync(modem, NULL, NULL);
    const char *const imsi = sim != NULL ? mm_sim_get_imsi(sim) : NULL;
    g_string_append_printf(line, "%s %s", mm_modem_get_equipment_identifier(modem),
                           mm_modem_state_get_string(mm_modem_get_state(modem)));
    if (network != NULL)
        g_string_append_printf(line, " %s",
                               mm_modem_3gpp_registration_state_get_string(
                                   mm_modem_3gpp_get_registration_state(network)));
    g_string_append_printf(line, " %s;", imsi != NULL ? imsi : "-");
    if (sim != NULL)
        g_object_unref(sim);
}

static void show(GDBusObjectManager *manager)
{
    GList *const objects = g_dbus_object_manager_get_objects(manager);
    GString *const line = g_string_new(NULL);
    for (GList *each = objects; each != NULL; each = each->next)
        describe(MM_OBJECT(each->data), line);
    g_list_free_full(objects, g_object_unref);
    if (g_strcmp0(last, line->str) != 0)
        g_print("%s\n", line->str);
    g_free(last);
    last = g_string_free(line, FALSE);
}

int main(int argc, char **argv)
{
    GError *error = NULL;
    GDBusConnection *const bus = g_bus_get_sync(G_BUS_TYPE_SYSTEM, NULL, &error);
    MMManager *const manager =
        bus != NULL ? mm_manager_new_sync(bus, G_DBUS_OBJECT_MANAGER_CLIENT_FLAGS_DO_NOT_AUTO_START,
                                          NULL, &error)
                    : NULL;
    if (manager == NULL)
        g_error("%s", error->message);
    show(G_DBUS_OBJECT_MANAGER(manager));
    if (argc > 1 && argv[1] != NULL) {
        for (const char *const *signal =
                 (const char *const[]){"object-added", "object-removed",
                                       "interface-proxy-properties-changed", NULL};
             *signal != NULL; ++signal)
            g_signal_connect(manager, *signal, G_CALLBACK(show), NULL);
        g_main_loop_run(g_main_loop_new(NULL, FALSE));
    }
    g_object_unref(manager);
    g_object_unref(bus);
    g_free(last);
    return 0;
}
