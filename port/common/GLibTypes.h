// SPDX-License-Identifier: Apache-2.0
// GLib's objects with C++ ownership.
#ifndef PORT_COMMON_GLIB_TYPES_H
#define PORT_COMMON_GLIB_TYPES_H

#include <memory>

#include <gio/gio.h>

namespace port {

struct GLibRelease {
    void operator()(GError* error) const
    {
        g_error_free(error);
    }
    void operator()(GVariant* variant) const
    {
        g_variant_unref(variant);
    }
    void operator()(GMainContext* context) const
    {
        g_main_context_unref(context);
    }
    void operator()(GSource* source) const
    {
        g_source_destroy(source);
        g_source_unref(source);
    }
    void operator()(GSettingsSchema* schema) const
    {
        g_settings_schema_unref(schema);
    }
    void operator()(GSettingsSchemaKey* key) const
    {
        g_settings_schema_key_unref(key);
    }
    void operator()(GKeyFile* keyFile) const
    {
        g_key_file_unref(keyFile);
    }
    void operator()(GHmac* hmac) const
    {
        g_hmac_unref(hmac);
    }
    void operator()(char* text) const
    {
        g_free(text);
    }
    void operator()(GCancellable* object) const
    {
        g_object_unref(object);
    }
    void operator()(GFile* object) const
    {
        g_object_unref(object);
    }
    void operator()(GFileMonitor* monitor) const
    {
        g_file_monitor_cancel(monitor);
        g_object_unref(monitor);
    }
    void operator()(GDBusConnection* object) const
    {
        g_object_unref(object);
    }
    void operator()(GDBusMessage* object) const
    {
        g_object_unref(object);
    }
};

template <typename T>
using Owned = std::unique_ptr<T, GLibRelease>;
using Variant = std::shared_ptr<GVariant>;

// Takes over one reference; null stays null.
inline Variant share(GVariant* variant)
{
    return variant != nullptr ? Variant(variant, GLibRelease()) : nullptr;
}

// Receives an out-parameter of a GLib call: `call(…, Out(error))`.
template <typename T>
class Out {
public:
    explicit Out(Owned<T>& target) : target_(target) {}
    ~Out()
    {
        target_.reset(raw_);
    }
    Out(const Out&) = delete;
    Out& operator=(const Out&) = delete;
    operator T**()
    {
        return &raw_;
    }

private:
    Owned<T>& target_;
    T* raw_ = nullptr;
};

} // namespace port

#endif
