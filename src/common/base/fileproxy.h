// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "filewrite.h"

#include <QFile>
#include <QIODevice>
#include <QObject>
#include <QString>

namespace zent::base
{

/// A file that says in the log why it could not be opened, and closes when the proxy goes.
class FileProxy : public QObject
{
    Q_OBJECT

public:
    explicit FileProxy(QObject* parent = nullptr);

    /// Opens `path` in `mode`; on failure logs path, mode and whether the file exists, and returns false.
    bool open(const QString& path, QIODevice::OpenMode mode);
    /// The same without the log line.
    bool openSilently(const QString& path, QIODevice::OpenMode mode);
    /// Why the file could not be opened.
    FileError error() const;

    /// The whole content from the current position; empty when the file is not open.
    QByteArray readAll();

private:
    QFile m_file;
};

} // namespace zent::base
