#pragma once

#include <QMetaObject>
#include <QObject>

class MainWindow;

/// What the desktop session wires to the main window beyond what the classes do among themselves. A bus that is
/// missing is a warning in the log, never a failed start.
class SessionHost : public QObject
{
    Q_OBJECT

public:
    /// `window` must outlive the host.
    explicit SessionHost(MainWindow& window, QObject* parent = nullptr);

private:
    void showTrayIconWhenHosted();
    void askScenesAfterOrganisation();

    MainWindow& m_window;
    QMetaObject::Connection m_organisationConnection;
};
