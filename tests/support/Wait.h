// SPDX-License-Identifier: Apache-2.0
// Waits for what another thread or process brings about.
#ifndef TESTS_SUPPORT_WAIT_H
#define TESTS_SUPPORT_WAIT_H

#include <gio/gio.h>

constexpr int PATIENCE_MS = 20000; // also for a sanitizer on a busy machine

/// Runs the loop of the thread's default context until a condition holds; false when it does not
/// come to hold in time.
template <typename Condition>
bool runUntil(Condition condition)
{
    bool late = false;
    GMainContext* const context = g_main_context_ref_thread_default();
    GSource* const limit = g_timeout_source_new(PATIENCE_MS);
    const auto end = [](gpointer flag) -> gboolean {
        *static_cast<bool*>(flag) = true;
        return G_SOURCE_CONTINUE;
    };
    g_source_set_callback(limit, end, &late, nullptr);
    g_source_attach(limit, context);
    while (!condition() && !late)
        g_main_context_iteration(context, TRUE);
    g_source_destroy(limit);
    g_source_unref(limit);
    g_main_context_unref(context);
    return condition();
}

#endif
