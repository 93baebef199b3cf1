// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <QByteArray>
#include <QDir>
#include <QFile>
#include <QFileInfo>

/// Small helpers for files that a test changes in its room.
namespace testfiles
{

// Where the platform keeps a terminal's files, as agreed.
inline const QString kInfoFile = "/etc/zent/userinfo.json";
inline const QString kStagedInfoFile = "/tmp/zent/userinfo.json";
inline const QString kMachineFile = "/usr/share/zent/machine.txt";
inline const QString kAuthorityFile = "/etc/zent/clientapi_ca.crt";
inline const QString kVersionFile = "/etc/os-version";
inline const QString kBackupFile = "/etc/zent/config.ini";
inline const QString kHostNameFile = "/etc/hostname";

inline void write(const QString& path, const QByteArray& content)
{
    if (!qEnvironmentVariableIsSet("ROOM"))
        qFatal("runs inside a room only");
    QDir().mkpath(QFileInfo(path).path());
    QFile file(path);
    if (!file.open(QIODevice::WriteOnly | QIODevice::Truncate) || file.write(content) != content.size())
        qFatal("cannot write %s", qPrintable(path));
}

inline QByteArray read(const QString& path)
{
    QFile file(path);
    return file.open(QIODevice::ReadOnly) ? file.readAll() : QByteArray();
}

/// Removes a file or a whole directory.
inline void remove(const QString& path)
{
    if (QFileInfo(path).isDir())
        QDir(path).removeRecursively();
    else
        QFile::remove(path);
}

} // namespace testfiles
