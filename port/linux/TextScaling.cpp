// SPDX-License-Identifier: Apache-2.0
#include "TextScaling.h"

#include <cmath>
#include <mutex>

// A GSettings object would subscribe to changes on the session bus, and may start one for that. The
// store below it is only read.
#define G_SETTINGS_ENABLE_BACKEND
#include <gio/gsettingsbackend.h>

#include "../common/GLibTypes.h"
#include "Environment.h"

namespace port::linux_backend {
namespace {

constexpr char SCHEMA[] = "org.gnome.desktop.interface";
constexpr char KEY[] = "text-scaling-factor";
constexpr char SOURCE[] = "GSettings org.gnome.desktop.interface text-scaling-factor";

Error missing(const char* what)
{
    return notAvailable(std::string(SOURCE) + ": " + what);
}

Owned<GVariant> storedValue(const std::string& path)
{
    // Some stores are not made for several threads.
    static std::mutex mutex;
    const std::lock_guard<std::mutex> lock(mutex);
    GSettingsBackend* const store = g_settings_backend_get_default();
    GVariant* const value = G_SETTINGS_BACKEND_GET_CLASS(store)->read(store, path.c_str(),
                                                                      G_VARIANT_TYPE_DOUBLE, FALSE);
    g_object_unref(store);
    return Owned<GVariant>(value);
}

bool isFactor(GVariant* value, GSettingsSchemaKey* key)
{
    return g_variant_is_of_type(value, G_VARIANT_TYPE_DOUBLE) &&
           g_settings_schema_key_range_check(key, value) != FALSE &&
           !std::isnan(g_variant_get_double(value)); // which is in every range
}

} // namespace

Result<Sourced<double>> textScaling()
{
    if (hasMoreRightsThanItsCaller()) // the store, its schemas and its modules are the caller's
        return missing("not read in a set-user-ID process");
    GSettingsSchemaSource* const schemas = g_settings_schema_source_get_default();
    const Owned<GSettingsSchema> schema(
        schemas != nullptr ? g_settings_schema_source_lookup(schemas, SCHEMA, TRUE) : nullptr);
    if (!schema)
        return missing("the schema is not installed");
    const char* const path = g_settings_schema_get_path(schema.get());
    if (path == nullptr || !g_settings_schema_has_key(schema.get(), KEY))
        return missing("the schema has no such key");
    const Owned<GSettingsSchemaKey> key(g_settings_schema_get_key(schema.get(), KEY));
    if (!g_variant_type_equal(g_settings_schema_key_get_value_type(key.get()),
                              G_VARIANT_TYPE_DOUBLE))
        return missing("the schema has a key of another type");
    Owned<GVariant> value = storedValue(std::string(path) + KEY);
    // Fall back to the schema's value where the user set none, or one that is no factor.
    if (!value || !isFactor(value.get(), key.get()))
        value.reset(g_settings_schema_key_get_default_value(key.get()));
    return Sourced<double>{g_variant_get_double(value.get()), SOURCE};
}

} // namespace port::linux_backend
