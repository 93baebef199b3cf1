// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <QObject>
#include <QString>
#include <QVector>

/// Takes a removable device (phone, camera, ...) away from a user. The desktop's own `gio` tool unmounts what the
/// virtual file system has mounted of it.
class RemoveDevice : public QObject
{
    Q_OBJECT

public:
    explicit RemoveDevice(QObject* parent);

    /// The longest that one removeDevice() waits for `gio`, whatever the number of mounts; 20 s at first.
    void setTimeLimit(int ms);

    /// Appends the full path of every subdirectory of `path` to `directories`, without recursion. Symbolic links are no
    /// subdirectories, wherever they lead. Returns -1 if `path` does not exist, 0 otherwise.
    int find(const QString& path, QVector<QString>& directories);

    /// Unmounts every mount of the user whose path contains `serial`; an empty serial means all of them. Blocks until
    /// the last `gio` has ended or the time is up; that one is then killed, and what is left stays mounted. Failures
    /// are logged, but not reported.
    /// @param manufacturer,product only logged, they do not decide
    /// @param uid the numeric user id as text; with anything else nothing is unmounted
    void removeDevice(const QString& manufacturer, const QString& product, const QString& serial, const QString& uid);

private:
    int m_timeLimitMs = 20000;
};
