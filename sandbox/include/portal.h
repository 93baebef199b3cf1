// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <QDBusConnection>
#include <QDBusMessage>
#include <QDBusVariant>

/// The desktop portal, whose colours are dark.
class Portal : public QObject
{
    Q_OBJECT
    Q_CLASSINFO("D-Bus Interface", "org.freedesktop.portal.Settings")

public:
    static void change(const QString& nameSpace, const QString& key, const QVariant& value)
    {
        auto signal = QDBusMessage::createSignal("/org/freedesktop/portal/desktop", "org.freedesktop.portal.Settings",
                                                 "SettingChanged");
        signal << nameSpace << key << QVariant::fromValue(QDBusVariant(value));
        QDBusConnection::sessionBus().send(signal);
    }
    QString asked;

public slots:
    QDBusVariant Read(const QString& nameSpace, const QString& key)
    {
        asked = nameSpace + ' ' + key;
        return QDBusVariant(QVariant::fromValue(QDBusVariant(1U)));
    }
};
