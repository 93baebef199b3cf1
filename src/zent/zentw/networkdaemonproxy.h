// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <QDBusAbstractInterface>
#include <QDBusConnection>
#include <QString>

#include <optional>

/// The desktop's network daemon. Making the proxy asks nothing of the daemon, which need not exist.
class NetworkDaemonProxy : public QDBusAbstractInterface
{
    Q_OBJECT

public:
    NetworkDaemonProxy(const QString& service, const QString& path, const QDBusConnection& connection,
                       QObject* parent = nullptr);

    /// The daemon's active connections as its JSON text. Waits for the answer, for as long as the bus allows, without
    /// letting events through. Nothing on a bus error, which is logged. After a time-out no proxy of this process asks
    /// for 60 s; each then gives nothing at once.
    std::optional<QString> activeConnectionInfo();
};
