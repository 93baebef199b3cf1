// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <QMetaObject>
#include <QObject>
#include <QString>

#include <memory>

class DesktopNotifier;
class MainWindow;
class Notification;
class resumeDialog;

/// Connects the main window with the desktop session: the client's objects on the session bus, and desktop
/// notifications for pushed messages. It also has the scenes requested after the organisation. A bus that is missing or
/// a name that is taken is a warning in the log, never a failed start.
class SessionHost : public QObject
{
    Q_OBJECT

public:
    /// `window` must outlive the host.
    explicit SessionHost(MainWindow& window, QObject* parent = nullptr);
    ~SessionHost() override;

private:
    void askScenesAfterOrganisation();
    void createIntegrityDialog();
    void exportOnSessionBus();
    void exportObject(const QString& path, QObject* object);
    void showPushedMessages();
    void showAsBalloon(const QString& title, const QString& sender, const QString& text);

    MainWindow& m_window;
    QMetaObject::Connection m_organisationConnection;
    Notification* m_notification;
    DesktopNotifier* m_notifier;
    std::unique_ptr<resumeDialog> m_integrityDialog;
};
