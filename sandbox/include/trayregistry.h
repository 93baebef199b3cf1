// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <QDBusConnection>
#include <QObject>

/// The registry of a desktop whose tray has come up.
class TrayRegistry : public QObject
{
    Q_OBJECT
    Q_CLASSINFO("D-Bus Interface", "org.kde.StatusNotifierWatcher")
    Q_PROPERTY(bool IsStatusNotifierHostRegistered READ hosted)

public:
    TrayRegistry()
    {
        QDBusConnection bus = QDBusConnection::sessionBus();
        bus.registerObject("/StatusNotifierWatcher", this, QDBusConnection::ExportAllProperties);
        bus.registerService("org.kde.StatusNotifierWatcher");
    }
    ~TrayRegistry() override { QDBusConnection::sessionBus().unregisterService("org.kde.StatusNotifierWatcher"); }
    bool hosted() const { return true; }
};
