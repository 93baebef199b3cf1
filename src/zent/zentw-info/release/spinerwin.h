// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "toolkitdialog.h"

class ControlManagerThread;
class QHBoxLayout;
class QLabel;
class QPushButton;
class ToolkitSpinner;
class ToolkitSuggestButton;

/// The window behind which the terminal is released. It shows a spinner while the removal worker runs, and cannot be
/// closed until that ends. Then it offers to reboot.
class spinerWin : public ToolkitDialog
{
    Q_OBJECT

public:
    explicit spinerWin(QWidget* parent = nullptr);
    /// Waits for a worker that is still running.
    ~spinerWin() override;

public slots:
    /// Puts the window into its first form and starts the removal worker.
    void nextCliked();
    /// The worker has ended: turns the window into the reboot prompt.
    void onRemoveController();
    void closing();
    /// Has the login manager reboot the machine.
    void closeGuardCliked();
    /// Closes the window without a reboot.
    void closeCliked();
    void setUsrname(const QString& name);
    void setPassword(const QString& password);
    void setScencelist(const int& count);

signals:
    void closeFatherwin();
    void uploadcloseguard();

protected:
    void closeEvent(QCloseEvent* event) override;

private:
    enum State { Running = 0, Finished = 1 };

    void createContent();
    void showFirstForm();
    void showText(const QString& text);

    int m_state = Running;
    QString m_username;
    QString m_password;
    int m_sceneCount = 0;
    QLabel* m_label;
    ToolkitSpinner* m_spinner;
    QHBoxLayout* m_buttonRow;
    ToolkitSuggestButton* m_confirm;
    QWidget* m_line;
    QPushButton* m_later = nullptr;
    QPushButton* m_now = nullptr;
    ControlManagerThread* m_worker = nullptr;
};
