// SPDX-License-Identifier: Apache-2.0
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

/// The client's own name on the session bus, and what it exports there.
inline const QString kClientService = QStringLiteral("com.vantor.tarn");
inline const QString kNotificationPath = QStringLiteral("/com/vantor/tarn/Notification");
inline const QString kFullzonePath = QStringLiteral("/com/vantor/tarn/Fullzone");

/// The platform's identity service and its domain agent (system bus); their interfaces carry the services' names.
inline const QString kIdentityService = QStringLiteral("com.vantor.zent.iam");
inline const QString kIdentityPath = QStringLiteral("/com/vantor/zent/iam");
inline const QString kDomainAgentService = QStringLiteral("com.vantor.zent.zentg");
inline const QString kDomainAgentPath = QStringLiteral("/com/vantor/zent/zentg");

/// The login manager (system bus).
inline const QString kLoginService = QStringLiteral("org.freedesktop.login1");
inline const QString kLoginPath = QStringLiteral("/org/freedesktop/login1");
inline const QString kLoginInterface = QStringLiteral("org.freedesktop.login1.Manager");

/// Reading and setting properties of any service without introspecting it.
inline const QString kPropertiesInterface = QStringLiteral("org.freedesktop.DBus.Properties");

} // namespace zent::dbus
