// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "filewrite.h"

#include <QDebug>
#include <QString>

/// What the client says, in the log and to the user, about a terminal info file that cannot be read.
namespace zent::noconfig
{

/// Title of the box.
inline const QString kTitle = QStringLiteral("域管终端提示");

/// The text of the box: which file, and why.
QString text(const QString& fileName, const QString& reason);

/// Appends to a log line the file's error and the process's ids.
QDebug describe(QDebug line, const base::FileError& error);

} // namespace zent::noconfig
