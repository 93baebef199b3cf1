#pragma once

#include <QObject>
#include <QString>
#include <QVector>

/// Takes a removable device (phone, camera, ...) away from a user: unmounts what the desktop's virtual file system has
/// mounted of it, with the desktop's own `gio` tool.
class RemoveDevice : public QObject
{
    Q_OBJECT

public:
    explicit RemoveDevice(QObject* parent);

    /// Appends the full path of every subdirectory of `path` to `directories`, without recursion. Symbolic links are no
    /// subdirectories, wherever they lead. Returns -1 if `path` does not exist, 0 otherwise.
    int find(const QString& path, QVector<QString>& directories);

    /// Unmounts every mount of the user whose path contains `serial`; an empty serial means all of them. Blocks until
    /// the last `gio` has ended; failures are not reported.
    /// @param manufacturer,product only logged, they do not decide
    /// @param uid the numeric user id as text; with anything else nothing is unmounted
    void removeDevice(const QString& manufacturer, const QString& product, const QString& serial, const QString& uid);
};
