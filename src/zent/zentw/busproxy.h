// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <QDBusAbstractInterface>
#include <QDBusConnection>
#include <QString>

/// A bus object whose interface carries the name of its service, as the platform's services do, or another one. Unlike
/// QDBusInterface it does not introspect the other side, which would block for as long as a hung service stays silent.
class BusProxy : public QDBusAbstractInterface
{
    Q_OBJECT

public:
    BusProxy(const QString& service, const QString& path, const QString& interface, const QDBusConnection& bus,
             QObject* parent = nullptr);

    /// Sets a property and waits for the answer; the error is invalid on success.
    QDBusError setRemoteProperty(const QString& name, const QVariant& value);
};
