// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <QAccessible>
#include <QDBusVirtualObject>
#include <QPointer>

/// Stands before Qt's own object on the accessibility bus: that one takes every call of the bus's properties for one
/// with two arguments, and crashes on another, such as "GetAll", with which many programs begin.
class AccessibilityGuard : public QDBusVirtualObject, QAccessible::ActivationObserver
{
    Q_OBJECT

public:
    explicit AccessibilityGuard(QObject* parent);

    QString introspect(const QString& path) const override;
    bool handleMessage(const QDBusMessage& message, const QDBusConnection& connection) override;

private:
    void accessibilityActiveChanged(bool active) override;
    /// Takes the place of Qt's object, once that is there.
    void takePlace();

    QPointer<QDBusVirtualObject> m_guarded;
};
