#pragma once

#include <QString>

/// Names of the bus services the client talks to.
namespace zent::dbus
{

/// The desktop's network daemon (session bus); the interface carries the same name as the service.
inline const QString kNetworkService = QStringLiteral("com.vantor.daemon.Network");
inline const QString kNetworkPath = QStringLiteral("/com/vantor/daemon/Network");

/// The registry of tray icons and tray hosts (session bus); the interface carries the same name as the service.
inline const QString kTrayWatcherService = QStringLiteral("org.kde.StatusNotifierWatcher");
inline const QString kTrayWatcherPath = QStringLiteral("/StatusNotifierWatcher");

/// Reading a property of any service without introspecting it.
inline const QString kPropertiesInterface = QStringLiteral("org.freedesktop.DBus.Properties");

} // namespace zent::dbus
