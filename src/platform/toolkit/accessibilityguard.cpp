// SPDX-License-Identifier: Apache-2.0
#include "accessibilityguard.h"

#include <QDBusConnection>
#include <QDBusMessage>

namespace
{

// As Qt names them.
const QString kConnectionName = QStringLiteral("a11y");
const QString kRoot = QStringLiteral("/org/a11y/atspi/accessible");
const QString kPropertiesInterface = QStringLiteral("org.freedesktop.DBus.Properties");
constexpr int kFewestArguments = 2;

} // namespace

AccessibilityGuard::AccessibilityGuard(QObject* parent) : QDBusVirtualObject(parent)
{
    QAccessible::installActivationObserver(this);
}

QString AccessibilityGuard::introspect(const QString& path) const
{
    return m_guarded ? m_guarded->introspect(path) : QString();
}

bool AccessibilityGuard::handleMessage(const QDBusMessage& message, const QDBusConnection& connection)
{
    if (message.interface() != kPropertiesInterface || message.arguments().size() >= kFewestArguments)
        return m_guarded && m_guarded->handleMessage(message, connection);
    return connection.send(
        message.createErrorReply(QDBusError::NotSupported, QStringLiteral("one property at a time")));
}

void AccessibilityGuard::accessibilityActiveChanged(bool active)
{
    // Qt makes its object after it has told this.
    if (active)
        QMetaObject::invokeMethod(this, &AccessibilityGuard::takePlace, Qt::QueuedConnection);
}

void AccessibilityGuard::takePlace()
{
    QDBusConnection connection(kConnectionName);
    auto* object = qobject_cast<QDBusVirtualObject*>(connection.objectRegisteredAt(kRoot));
    if (!object || object == this)
        return;
    m_guarded = object;
    connection.unregisterObject(kRoot);
    connection.registerVirtualObject(kRoot, this, QDBusConnection::SubPath);
}
