#pragma once

#include <QByteArray>
#include <QString>

namespace zent::base
{

enum class WriteResult {
    Done,
    NotOpened, ///< nothing was changed
    Short,     ///< not written whole; the old content stands where the directory was writable
};

/// Replaces the content of the file at `path`: through a hidden file beside it where the directory is writable, so
/// that a reader or a crash never meets half a file; otherwise truncated and written in place.
WriteResult replaceFile(const QString& path, const QByteArray& content);

} // namespace zent::base
