// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <QObject>
#include <QString>
#include <QStringList>

/**
 * Has the privileged front end run scripts with root rights. Both ways block the calling thread for whole seconds: for
 * worker threads, never for the user interface's. Calls from several threads need no lock.
 *
 * The lists hold the script's absolute path and then the script's own arguments; they must not be empty.
 */
class UpgradePriority : public QObject
{
    Q_OBJECT

public:
    /// The process-wide instance.
    static UpgradePriority* GetInstance();

    /// Starts the script detached. With `flag` false once; with `flag` true three times unless a start fails, each
    /// followed by a pause of 1, 2 and 3 s. Ends with a pause of 1 s in every case. Returns 1, or 0 when a start
    /// failed; how the script fares is not observed.
    int upgradeScriptAsy(const QStringList& list, bool flag);

private:
    UpgradePriority() = default;

    QString m_strUpgradePath;

    // Agreed with other components, and called by them only.
public:
    /// Stores an upgrade path. Nothing here depends on it.
    void setUpgradePath(const QString& path);
    /// Runs the script and waits for it. With `flag` true once; with `flag` false up to three times until it succeeds,
    /// followed by pauses of 1, 2 and 3 s. Returns the last run's exit code, -2 when it could not be started or -1
    /// when it crashed.
    int upgradeScript(const QStringList& list, bool flag);
};
