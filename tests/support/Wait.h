// SPDX-License-Identifier: Apache-2.0
// Waits for what another thread or process brings about.
#ifndef TESTS_SUPPORT_WAIT_H
#define TESTS_SUPPORT_WAIT_H

#include "common/GLibTypes.h"

constexpr int PATIENCE_MS = 20000; // also for a sanitizer on a busy machine

/// Runs the loop of the thread's default context until a condition holds; false when it does not
/// come to hold in time.
template <typename Condition>
bool runUntil(Condition condition)
{
    bool late = false;
    const port::Owned<GMainContext> context(g_main_context_ref_thread_default());
    const port::Owned<GSource> limit(g_timeout_source_new(PATIENCE_MS));
    const auto end = [](gpointer flag) -> gboolean {
        *static_cast<bool*>(flag) = true;
        return G_SOURCE_CONTINUE;
    };
    g_source_set_callback(limit.get(), end, &late, nullptr);
    g_source_attach(limit.get(), context.get());
    bool isMet = condition();
    for (; !isMet && !late; isMet = condition())
        g_main_context_iteration(context.get(), TRUE);
    return isMet;
}

#endif
