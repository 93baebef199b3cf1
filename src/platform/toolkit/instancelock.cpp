// SPDX-License-Identifier: Apache-2.0
#include "instancelock.h"

#include <QDebug>
#include <QFile>
#include <QStandardPaths>
#include <QUrl>

#include <cerrno>
#include <cstring>
#include <fcntl.h>
#include <sys/file.h>
#include <sys/stat.h>
#include <unistd.h>

InstanceLock::~InstanceLock()
{
    if (m_fd >= 0)
        ::close(m_fd);
}

InstanceLock::Result InstanceLock::acquire(const QString& directory, const QString& key)
{
    if (m_fd >= 0)
        return Result::Acquired;

    const QString path = filePath(directory, key);
    const int fd = ::open(QFile::encodeName(path).constData(), O_RDWR | O_CREAT | O_CLOEXEC | O_NOFOLLOW, 0600);
    if (fd < 0) {
        qWarning().noquote() << "cannot open the lock file" << path << ":" << std::strerror(errno);
        return Result::Failed;
    }
    int status = 0;
    do {
        status = ::flock(fd, LOCK_EX | LOCK_NB);
    } while (status != 0 && errno == EINTR);
    if (status == 0) {
        m_fd = fd;
        return Result::Acquired;
    }
    const int error = errno;
    ::close(fd);
    if (error == EWOULDBLOCK)
        return Result::Held;
    qWarning().noquote() << "cannot lock" << path << ":" << std::strerror(error);
    return Result::Failed;
}

QString InstanceLock::userDirectory()
{
    // XDG_RUNTIME_DIR may differ between two starts of the same user (su, cron), so the real folder comes first.
    QString directory = QStringLiteral("/run/user/%1").arg(::getuid());
    struct stat info = {};
    if (::lstat(QFile::encodeName(directory).constData(), &info) == 0 && S_ISDIR(info.st_mode) &&
        info.st_uid == ::getuid())
        return directory;
    return QStandardPaths::writableLocation(QStandardPaths::RuntimeLocation);
}

QString InstanceLock::filePath(const QString& directory, const QString& key)
{
    return directory + QLatin1Char('/') + QString::fromLatin1(QUrl::toPercentEncoding(key)) + QStringLiteral(".lock");
}
