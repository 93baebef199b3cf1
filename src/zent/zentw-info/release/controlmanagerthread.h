// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <QString>
#include <QThread>

#include <atomic>

/**
 * Puts the terminal's own configuration back as it was before it joined management. A thread of its own restores the
 * desktop, the directory login and the control centre's modules. No step that fails stops the others.
 */
class ControlManagerThread : public QThread
{
    Q_OBJECT

public:
    ControlManagerThread();
    /// Waits for a pass that is under way.
    ~ControlManagerThread() override;

    /// Starts one pass of the removal; while one is under way there is no second.
    void removeControlManager();

signals:
    /// The pass has ended, whatever came of its steps; sent from the worker's thread.
    void sigFinishedRemove();

protected:
    void run() override;

private:
    void doRemoveController();

    std::atomic<bool> m_stop{false};
    QString m_appPath;
    QString m_defaultBasePath;
    QString m_scriptsPath;
    QString m_strCancelGroup;

    // Agreed with other components, and called by them only.
public:
    /// Stores the application's path and its folder of scripts. The removal depends on neither.
    void setAppPath(const QString& path);
    /// Prevents a pass that has not begun. One that has begun goes on to its end.
    void stop();
};
