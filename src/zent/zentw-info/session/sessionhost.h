#pragma once

#include <QMetaObject>
#include <QObject>
#include <QString>

#include <memory>

class DesktopNotifier;
class MainWindow;
class Notification;
class resumeDialog;

/// What the desktop session wires to the main window beyond what the classes do among themselves: the client's objects
/// on the session bus, desktop notifications for pushed messages, and the wait for a tray host. A bus that is missing
/// or a name that is taken is a warning in the log, never a failed start.
class SessionHost : public QObject
{
    Q_OBJECT

public:
    /// `window` must outlive the host.
    explicit SessionHost(MainWindow& window, QObject* parent = nullptr);
    ~SessionHost() override;

private:
    void showTrayIconWhenHosted();
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
