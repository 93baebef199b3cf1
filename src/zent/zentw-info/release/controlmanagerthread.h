#pragma once

#include <QString>
#include <QThread>

#include <atomic>

/**
 * Puts the terminal's own configuration back as it was before it joined management, on a thread of its own: the
 * desktop, the directory login and the control centre's modules. No step that fails stops the others.
 */
class ControlManagerThread : public QThread
{
    Q_OBJECT

public:
    ControlManagerThread();
    /// Waits for a pass that is under way.
    ~ControlManagerThread() override;

    /// Stores the application's path and its folder of scripts. The removal depends on neither.
    void setAppPath(const QString& path);

    /// Starts one pass of the removal; while one is under way there is no second.
    void removeControlManager();

    /// Prevents a pass that has not begun. One that has begun goes on to its end.
    void stop();

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
};
