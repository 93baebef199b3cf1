// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <QApplication>

#include <map>
#include <memory>

class InstanceLock;

/**
 * The application object of a desktop program. It prefers the X platform plugin, knows substitutes for the fonts that
 * windows ask for, and runs once per user. The session manager never restarts it.
 */
class ToolkitApplication : public QApplication
{
    Q_OBJECT

public:
    ToolkitApplication(int& argc, char** argv);
    ~ToolkitApplication() override;

    /// Chooses the platform plugin and the high-DPI mode. Call once, before the application object is constructed.
    /// A plugin named by the user (QT_QPA_PLATFORM) is left alone.
    static void loadPlatformPlugin();

    /// Claims @p key for this process and this user until the process ends, however it ends. Returns false only when
    /// another process holds the key; when no lock can be made the reason is logged and the result is true.
    bool setSingleInstance(const QString& key);

private:
    std::map<QString, std::unique_ptr<InstanceLock>> m_locks;
};
