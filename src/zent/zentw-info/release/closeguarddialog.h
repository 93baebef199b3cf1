// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "toolkitdialog.h"

#include <QString>

class BusProxy;
class QDBusPendingCallWatcher;
class ToolkitPasswordEdit;
class spinerWin;

/// The dialog in which an administrator releases the terminal from management. The server checks the password. Once it
/// is accepted, the dialog undoes what management did, while the removal worker runs behind the spinner window.
class closeGuarddialog : public ToolkitDialog
{
    Q_OBJECT

public:
    explicit closeGuarddialog(QWidget* parent = nullptr);

    void setUsrname(const QString& name);
    /// Number of the user's scenes.
    void setScencelist(const int& count);

public slots:
    void onCloseClicked();
    /// Has the server check the password.
    void onCloseguardClicked();
    /// Takes the server's answer and, when the password is accepted, runs the local release.
    void onRemoveDomainStatus(int status, const QString& body);
    /// Takes the domain agent's answer and completes the release.
    void onRemoveDomainFinished(QDBusPendingCallWatcher* watcher);
    /// Shows a text and waits until the user has closed it.
    void showMessageBox(const QString& text);
    void getMachineId();

signals:
    void closeall();
    void CloseGuard();
    void terminalChecked();
    void getnewxsrftoken();

protected:
    void hideEvent(QHideEvent* event) override;

private:
    void createContent();
    void startSpinner();
    void forbidEasyLogins();
    void liftLockDown();
    void stopUserServices();
    void leaveDomain();

    ToolkitPasswordEdit* m_password;
    int m_areaId = 0;
    QString m_address;
    QString m_machineId;
    QString m_username;
    int m_sceneCount = 0;
    spinerWin* m_spinner;
    BusProxy* m_domainAgent;

    // Agreed with other components, and called by them only.
public:
    void setAreaid(const int& id);
    /// Host and port of the management server.
    void setIpport(const QString& address);
    void setToken(const QString&) {}
    void checkClosable() {}
public slots:
    void closeallfather();
};
