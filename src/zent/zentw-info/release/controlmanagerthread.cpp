// SPDX-License-Identifier: Apache-2.0
#include "release/controlmanagerthread.h"

#include "release/upgradepriority.h"
#include "system/childprocess.h"

#include <QDebug>
#include <QFile>

namespace
{

const QString kBasePath = QStringLiteral("/usr/share/lumo");

/// The desktop restore script, run as the current user where it exists.
void restoreDesktop()
{
    const QString script = kBasePath + QStringLiteral("/restore_config.bash");
    if (!QFile::exists(script))
        return;
    qDebug() << "ControlManagerThread::doRemoveController()....strRestoreDesktop:" << script;
    const int result = zent::startDetached(QStringLiteral("bash"), {script}) ? 1 : 0;
    qDebug() << "doRemoveController ...execute...strRestoreDesktop:" << script << ":nRet:" << result;
}

/// The directory login restore script, run with root rights; whether it exists is the front end's business.
void restoreDirectoryLogin()
{
    const QString script = kBasePath + QStringLiteral("/restore_ldap.bash");
    qDebug() << "doRemoveController .....upgradeScript start:" << script;
    UpgradePriority::GetInstance()->upgradeScriptAsy({script}, false);
    qDebug() << "doRemoveController .....upgradeScript end:" << script;
}

void showControlCenterModules()
{
    zent::startDetached(QStringLiteral("gsettings set com.vantor.oxa.control-center hide-module \"[]\""));
    qDebug() << "doRemoveController .....execute hide-module:";
}

} // namespace

ControlManagerThread::ControlManagerThread() : m_defaultBasePath(QStringLiteral("/usr/share/orlo"))
{
}

ControlManagerThread::~ControlManagerThread()
{
    stop();
    wait();
}

void ControlManagerThread::setAppPath(const QString& path)
{
    m_appPath = path;
    m_scriptsPath = path + QStringLiteral("/scripts");
}

void ControlManagerThread::removeControlManager()
{
    m_stop = false;
    if (!isRunning())
        start(QThread::InheritPriority);
}

void ControlManagerThread::stop()
{
    m_stop = true;
}

void ControlManagerThread::run()
{
    // Not a loop: a call of removeControlManager() just before the end of the thread clears the flag, and a loop would
    // go round again.
    if (!m_stop)
        doRemoveController();
}

void ControlManagerThread::doRemoveController()
{
    qDebug() << "ControlManagerThread::doRemoveController()....m_strCancelGroup";
    restoreDesktop();
    restoreDirectoryLogin();
    showControlCenterModules();
    emit sigFinishedRemove();
    m_stop = true;
}
