// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <QString>

/**
 * A lock file that one process at a time can hold.
 *
 * The kernel releases the lock however the holder ends. Programs that the holder starts do not inherit it. The file
 * itself stays behind: removing it would let two processes lock two files of the same name.
 */
class InstanceLock
{
public:
    enum class Result {
        Acquired, ///< this process holds the lock now
        Held,     ///< another process holds it
        Failed,   ///< no lock file could be made; the reason was logged
    };

    InstanceLock() = default;
    ~InstanceLock();
    InstanceLock(const InstanceLock&) = delete;
    InstanceLock& operator=(const InstanceLock&) = delete;

    /// Tries to lock the file for @p key in @p directory without waiting. Holding it already counts as acquired.
    Result acquire(const QString& directory, const QString& key);

    /// The folder for this user's locks: /run/user/<uid> where it exists and belongs to the user, whatever the
    /// environment says. Else Qt's run-time folder, which is empty when Qt cannot provide one.
    static QString userDirectory();

    /// The path of the lock file; every character of @p key that could leave @p directory is percent-encoded.
    static QString filePath(const QString& directory, const QString& key);

private:
    int m_fd = -1;
};
