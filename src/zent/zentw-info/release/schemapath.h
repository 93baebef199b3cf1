// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <QByteArray>

namespace zent
{

/// The path that an installed settings schema has of its own; empty where it has none, or is not installed. Opening a
/// schema at another path than its own ends the process.
QByteArray schemaPath(const QByteArray& id);

} // namespace zent
