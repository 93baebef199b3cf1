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

/// Opens the part with the mode of the file that it replaces.
bool openPart(QFile& part, const QByteArray& name, const QString& target)
{
    struct stat existing = {};
    const bool exists = stat(QFile::encodeName(target).constData(), &existing) == 0;
    const mode_t mode = exists ? existing.st_mode & kPermissionBits : kNewFileMode;
    unlink(name.constData());
    const int handle = open(name.constData(), O_WRONLY | O_CREAT | O_EXCL | O_CLOEXEC, mode);
    if (handle < 0)
        return false;
    if (exists)
        fchmod(handle, mode);
    return part.open(handle, QIODevice::WriteOnly, QFileDevice::AutoCloseHandle);
}

bool writeAll(QFile& file, const QByteArray& content)
{
    return file.write(content) == content.size() && file.flush() && fsync(file.handle()) == 0;
}

WriteResult rewrite(const QString& path, const QByteArray& content)
{
    QFile file(path);
    if (!file.open(QIODevice::WriteOnly | QIODevice::Truncate))
        return WriteResult::NotOpened;
    return file.write(content) == content.size() && file.flush() ? WriteResult::Done : WriteResult::Short;
}

} // namespace

WriteResult replaceFile(const QString& path, const QByteArray& content)
{
    // The file that a link leads to, not the link.
    const QFileInfo named(path);
    const QFileInfo target(named.exists() ? named.canonicalFilePath() : path);
    if (target.exists() && !target.isWritable())
        return WriteResult::NotOpened;
    const QByteArray partName = QFile::encodeName(partOf(target));
    QFile part;
    if ((target.exists() && !target.isFile()) || !openPart(part, partName, target.filePath()))
        return rewrite(target.filePath(), content);
    const bool whole = writeAll(part, content);
    part.close();
    if (whole && std::rename(partName.constData(), QFile::encodeName(target.filePath()).constData()) == 0)
        return WriteResult::Done;
    unlink(partName.constData());
    return WriteResult::Short;
}

} // namespace zent::base
