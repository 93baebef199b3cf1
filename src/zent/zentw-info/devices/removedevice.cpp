// SPDX-License-Identifier: Apache-2.0
#include "devices/removedevice.h"

#include "system/childprocess.h"

#include <QDebug>
#include <QDir>
#include <QFileInfo>
#include <QStringList>

#include <algorithm>
#include <exception>

namespace
{

/// Callers on the bus choose the uid: digits alone cannot lead to another place than the mount root of a user.
bool isUserId(const QString& uid)
{
    return !uid.isEmpty() && std::all_of(uid.begin(), uid.end(), [](QChar c) { return c >= '0' && c <= '9'; });
}

QString mountRoot(const QString& uid)
{
    return QStringLiteral("/run/user/%1/gvfs/").arg(uid);
}

/// The form in which the virtual file system writes a product name into mount names.
QString mountNameForm(QString product)
{
    return product.replace(QStringLiteral(" "), QStringLiteral("_"))
        .replace(QStringLiteral(":"), QStringLiteral("%3A"));
}

/// False when the time is up.
bool unmount(const QString& path, const QDeadlineTimer& limit)
{
    qDebug() << "Driver: " << path;
    try {
        const int status =
            zent::execute(QStringLiteral("gio"), {QStringLiteral("mount"), QStringLiteral("-u"), path}, limit);
        if (status == zent::kTimeIsUp)
            return false;
        if (status != 0)
            qWarning() << path << " unmount failed:" << status;
    } catch (const std::exception& reason) {
        qWarning() << path << " unmount failed:" << reason.what();
    }
    return true;
}

} // namespace

RemoveDevice::RemoveDevice(QObject* parent) : QObject(parent)
{
}

void RemoveDevice::setTimeLimit(int ms)
{
    m_timeLimitMs = ms;
}

int RemoveDevice::find(const QString& path, QVector<QString>& directories)
{
    qDebug() << "find path: " << path;
    const QDir root(path);
    if (!root.exists())
        return -1;
    const QFileInfoList entries = root.entryInfoList(QDir::Dirs, QDir::DirsFirst);
    for (const QFileInfo& entry : entries) {
        if (entry.fileName() == QLatin1String(".") || entry.fileName() == QLatin1String(".."))
            continue;
        // Unmounting a link would unmount what it points to: another device, or something that is not below the root.
        if (!entry.isDir() || entry.isSymLink())
            continue;
        qDebug() << "dir: " << entry.filePath();
        directories.append(entry.filePath());
    }
    return 0;
}

void RemoveDevice::removeDevice(const QString& manufacturer, const QString& product, const QString& serial,
                                const QString& uid)
{
    qDebug() << "removeDevice ------------i";
    if (!isUserId(uid)) {
        qWarning() << "removeDevice not a user id:" << uid;
        return;
    }
    QVector<QString> directories;
    find(mountRoot(uid), directories);
    if (directories.isEmpty())
        return;

    qDebug() << "removeDevice manufacturer:" << manufacturer << ":product:" << product << ":serial:" << serial
             << ":uid:" << uid;
    const QString productInNames = mountNameForm(product);
    qDebug() << "manufacturer: " << manufacturer << ", product: " << productInNames << ", serial: " << serial;

    QStringList matches;
    for (const QString& path : qAsConst(directories)) {
        const int serialIndex = path.indexOf(serial);
        qDebug() << "itBegin: " << path << ", idx: " << path.indexOf(manufacturer) << ", "
                 << path.indexOf(productInNames) << ", " << serialIndex;
        if (serialIndex >= 0)
            matches.append(path);
    }
    const QDeadlineTimer limit(m_timeLimitMs);
    for (int i = 0; i < matches.size(); ++i) {
        if (unmount(matches.at(i), limit))
            continue;
        qWarning() << matches.at(i) << " unmount failed: time is up, skipped as well:" << matches.size() - i - 1;
        break;
    }
}
