// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "password/passwordreplies.h"
#include "toolkitdialog.h"

#include <QString>

class QLabel;
class QNetworkReply;
class QProcess;
class QPushButton;
class ToolkitPasswordEdit;

/// The dialog in which a user changes their own domain password. The identity service does it; its answer decides what
/// the user sees. Closing hides the dialog, hiding empties its fields.
class ModifyDialog : public ToolkitDialog
{
    Q_OBJECT

public:
    explicit ModifyDialog(QWidget* parent = nullptr);

    /// Host and port of the management server, joined by a colon.
    void setIpport(const QString& address);
    void setMachineId(const QString& id);
    /// The user's name and the code of the scene whose length rule holds.
    void setUserName(const QString& name, const QString& sceneCode);
    void setUserID(int id);

    void clearOldPassword();
    void clearPassword();
    void clearRePassword();

public slots:
    void onOldpasswordeditTextchanged();
    void onPasswordeditTextchanged();
    void onRepasswordeditTextchanged();
    void onRepasswordeditFinished();
    void modifyConfirm();
    void modifyClose();

protected:
    void closeEvent(QCloseEvent* event) override;
    void hideEvent(QHideEvent* event) override;

private:
    void createDialog();
    void retranslateDialog();
    void updateChangePasswordButton();
    void takeIdentityReply(const QString& text);
    void showNotice(const QString& text, const QString& title = QString());

    QString m_userName;
    QString m_sceneCode;
    QString m_address;
    QString m_machineId;
    int m_userId = 0;
    int m_minimumLength = zent::kDefaultMinimumLength;
    QString m_probePassword;
    QProcess* m_restoreProcess = nullptr;
    QLabel* m_title;
    ToolkitPasswordEdit* m_oldPassword;
    ToolkitPasswordEdit* m_password;
    ToolkitPasswordEdit* m_rePassword;
    QPushButton* m_confirm;
    QPushButton* m_cancel;

    // Agreed with other components, and called by them only.
public:
    void setToken(const QString&) {}
    /// Whether the repeated password is as long as the scene's configuration asks for.
    bool IsPasswordLenthValid();
    /// Takes the server's answer to a password change: true when it was a success.
    bool analyseData(QByteArray* body);
    /// Stores a renewed token in the terminal info file, whose other keys stay. Failures are logged and shown.
    void renewToken(const QString& token);
    /// Has the privileged front end remove the cached password.
    void removePasswdCache();
public slots:
    void onPasswordChecked(QNetworkReply* reply);
    /// Tells the user what the restore process printed; there must be one.
    void onRestoreReadprocess();
    void onRestoreFinishedprocess();
};
