// SPDX-License-Identifier: Apache-2.0
#include "busproxy.h"

#include "dbusnames.h"

#include <QDBusError>
#include <QDBusMessage>
#include <QDBusVariant>

BusProxy::BusProxy(const QString& service, const QString& path, const QString& interface, const QDBusConnection& bus,
                   QObject* parent)
    : QDBusAbstractInterface(service, path, interface.toLatin1().constData(), bus, parent)
{
}

QDBusError BusProxy::setRemoteProperty(const QString& name, const QVariant& value)
{
    QDBusMessage message =
        QDBusMessage::createMethodCall(service(), path(), zent::dbus::kPropertiesInterface, QStringLiteral("Set"));
    message << interface() << name << QVariant::fromValue(QDBusVariant(value));
    return QDBusError(connection().call(message, QDBus::Block));
}
