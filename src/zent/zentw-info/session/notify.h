// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <QObject>
#include <QString>

#include <memory>

/// What the platform's notification service and device watcher reach over D-Bus: a message pushed to the user, or a
/// removable device to be unmounted. Exporting it, and showing the messages, is the hosting code's business; its
/// interface is described in com.vantor.tarn.Notification.xml. Signal and slots are scriptable, so that an object
/// exported with ExportScriptableSlots and ExportScriptableSignals offers them and nothing of QObject.
class Notification : public QObject
{
    Q_OBJECT
    Q_CLASSINFO("D-Bus Interface", "com.vantor.tarn.Notification")

public:
    explicit Notification(QObject* parent = nullptr);
    ~Notification() override;

Q_SIGNALS:
    /// A message was pushed with Notify().
    Q_SCRIPTABLE void onMessage(int, const QString& username, const QString& title, const QString& message,
                                const QString& sender);

public Q_SLOTS:
    /// Emits onMessage() with the same arguments.
    Q_SCRIPTABLE void Notify(int, const QString& username, const QString& title, const QString& message,
                             const QString& sender);
    /// Accepts the call and does nothing.
    Q_SCRIPTABLE void AgencyNotify(const QString&, const QString&) const;
    /// Unmounts the matching removable device of a user; blocks until that is done, see RemoveDevice::removeDevice().
    Q_SCRIPTABLE void GioMount(const QString& manufacturer, const QString& product, const QString& serial,
                               const QString& uid);

private:
    struct Private;
    const std::unique_ptr<Private> d;
};
