// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <QByteArray>
#include <QFileDevice>
#include <QString>

namespace zent::base
{

/// Why a file could not be opened or written.
struct FileError {
    QFileDevice::FileError code = QFileDevice::NoError;
    QString text;
};

enum class WriteResult {
    Done,
    NotOpened, ///< nothing was changed
    Short,     ///< not written whole; the old content stands where the directory was writable
};

/// Replaces the content of the file at `path`, or of the one that a link there leads to. Where the directory allows it
/// a hidden file beside it takes its place, so that nobody ever reads half a file. Otherwise it is truncated and
/// written in place. The file keeps its mode, and its group where permitted. `error` may be null.
WriteResult replaceFile(const QString& path, const QByteArray& content, FileError* error = nullptr);

} // namespace zent::base
