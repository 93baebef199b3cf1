// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "toolkitdialog.h"

#include <QString>

class QLabel;
class QTimer;

/// Tells the user that the platform's device-integrity verification failed, and leads to the repair page. Hosting code
/// exports it on a bus, with its scriptable members only; Notify() then also switches periodic verification.
class resumeDialog : public ToolkitDialog
{
    Q_OBJECT
    Q_CLASSINFO("D-Bus Interface", "com.vantor.tarn.Fullzone")

public:
    explicit resumeDialog(QWidget* parent = nullptr);

    void setRepairTitle(const QString& text);
    /// The management server's address; the repair page is on its host.
    void setIpPort(const QString& host, const QString& port);
    /// Starts one verification run; its outcome comes through Notify().
    void getDeviceIntegralityVarifyScript();

signals:
    Q_SCRIPTABLE void confirmed();
    Q_SCRIPTABLE void hidewin();

public slots:
    /// Opens the repair page with the desktop's browser.
    void confirmCliked();
    void hideWindow();
    /// "success" closes the dialog. With `url` "true" or "false", `errmsg` "open" starts the periodic verification and
    /// anything else stops it. Any other `url` is the repair page's path and `errmsg` the failure to show.
    Q_SCRIPTABLE void Notify(const QString& errmsg, const QString& url);

protected:
    void closeEvent(QCloseEvent* event) override;

private:
    void createInterface();
    void switchVerification();

    QString m_address;
    QString m_switchState;
    QString m_repairUrl;
    int m_passed = 0;
    QLabel* m_message;
    QTimer* m_timer;
};
