// SPDX-License-Identifier: Apache-2.0
// Before Qt, whose keyword "signals" is a member's name there.
#include <gio/gio.h>

#include "release/schemapath.h"

QByteArray zent::schemaPath(const QByteArray& id)
{
    GSettingsSchemaSource* source = g_settings_schema_source_get_default();
    GSettingsSchema* schema = source ? g_settings_schema_source_lookup(source, id.constData(), TRUE) : nullptr;
    if (!schema)
        return QByteArray();
    QByteArray path = g_settings_schema_get_path(schema);
    g_settings_schema_unref(schema);
    return path;
}
