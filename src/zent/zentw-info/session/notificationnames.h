// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <QString>

/// The desktop's notification service (session bus); the interface carries the same name as the service.
namespace zent::dbus
{

inline const QString kDesktopNotificationsService = QStringLiteral("org.freedesktop.Notifications");
inline const QString kDesktopNotificationsPath = QStringLiteral("/org/freedesktop/Notifications");

} // namespace zent::dbus
