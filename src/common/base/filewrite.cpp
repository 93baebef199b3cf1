// SPDX-License-Identifier: Apache-2.0
#include "filewrite.h"

#include <QFile>
#include <QFileInfo>

#include <cstdio>
#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>

namespace zent::base
{

namespace
{

constexpr mode_t kPermissionBits = 07777;
constexpr mode_t kNewFileMode = 0666;

/// The file that becomes `target` when it is whole. Always the same one for a user: what a writer that was killed has
/// left behind is the next one's, so nothing piles up.
QString partOf(const QFileInfo& target)
{
    return QStringLiteral("%1/.%2.zentw-info-%3").arg(target.path(), target.fileName(), QString::number(getuid()));
}

/// Opens the part with the mode and the group of the file that it replaces.
bool openPart(QFile& part, const QByteArray& name, const QString& target)
{
    struct stat existing = {};
    const bool exists = stat(QFile::encodeName(target).constData(), &existing) == 0;
    const mode_t mode = exists ? existing.st_mode & kPermissionBits : kNewFileMode;
    unlink(name.constData());
    const int handle = open(name.constData(), O_WRONLY | O_CREAT | O_EXCL | O_CLOEXEC, mode);
    if (handle < 0)
        return false;
    if (exists) {
        // Only a group that the user belongs to can be given. The mode comes last: a change of group takes bits away.
        [[maybe_unused]] const int result = fchown(handle, uid_t(-1), existing.st_gid);
        fchmod(handle, mode);
    }
    return part.open(handle, QIODevice::WriteOnly, QFileDevice::AutoCloseHandle);
}

bool writeAll(QFile& file, const QByteArray& content)
{
    return file.write(content) == content.size() && file.flush() && fsync(file.handle()) == 0;
}

FileError errorOf(const QFileDevice& file)
{
    return {file.error(), file.errorString()};
}

WriteResult rewrite(const QString& path, const QByteArray& content, FileError& error)
{
    QFile file(path);
    const bool opened = file.open(QIODevice::WriteOnly | QIODevice::Truncate);
    if (opened && file.write(content) == content.size() && file.flush())
        return WriteResult::Done;
    error = errorOf(file);
    return opened ? WriteResult::Short : WriteResult::NotOpened;
}

WriteResult replace(const QString& path, const QByteArray& content, FileError& error)
{
    const QFileInfo named(path);
    const QFileInfo target(named.exists() ? named.canonicalFilePath() : path);
    // In place goes what may not be replaced, and the target of a dangling link.
    if (target.exists() ? !target.isFile() || !target.isWritable() : target.isSymLink())
        return rewrite(path, content, error);
    const QByteArray partName = QFile::encodeName(partOf(target));
    QFile part;
    if (!openPart(part, partName, target.filePath()))
        return rewrite(path, content, error);
    const bool whole = writeAll(part, content);
    if (!whole)
        error = errorOf(part);
    part.close();
    if (whole && std::rename(partName.constData(), QFile::encodeName(target.filePath()).constData()) == 0)
        return WriteResult::Done;
    unlink(partName.constData());
    // The target may be a mount point, or another user's in a directory like /tmp.
    return whole ? rewrite(path, content, error) : WriteResult::Short;
}

} // namespace

WriteResult replaceFile(const QString& path, const QByteArray& content, FileError* error)
{
    FileError ignored;
    return replace(path, content, error ? *error : ignored);
}

} // namespace zent::base
