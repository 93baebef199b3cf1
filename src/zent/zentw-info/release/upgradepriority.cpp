// SPDX-License-Identifier: Apache-2.0
#include "release/upgradepriority.h"

#include "frontend/frontend.h"

#include <QDebug>
#include <QThread>

#include <utility>

namespace
{

constexpr int kAttempts = 3;
constexpr unsigned long kLaunchPauseMs = 1000;

/// The front end's arguments for the list, logged in the name of the calling function.
QStringList makeArguments(const char* function, const QStringList& list)
{
    for (const QString& word : list)
        qDebug() << function << " strScriptPath:" << word;
    const QStringList scriptArguments = list.mid(1);
    for (const QString& word : scriptArguments)
        qDebug() << function << " strList:" << word;
    QStringList arguments = zent::frontend::scriptCommand(list.first(), scriptArguments);
    // This includes the token, as agreed.
    for (const QString& word : std::as_const(arguments))
        qDebug() << function << " strCmdList:" << word;
    return arguments;
}

int runOnce(const char* function, const QStringList& arguments)
{
    const int result = zent::frontend::run(arguments);
    qDebug() << function << " nRet:" << result;
    return result;
}

int launchOnce(const char* function, const QStringList& arguments)
{
    const int result = zent::frontend::start(arguments) ? 1 : 0;
    qDebug() << function << " nRet:" << result;
    return result;
}

} // namespace

UpgradePriority* UpgradePriority::GetInstance()
{
    static UpgradePriority instance;
    return &instance;
}

void UpgradePriority::setUpgradePath(const QString& path)
{
    m_strUpgradePath = path;
}

int UpgradePriority::upgradeScript(const QStringList& list, bool flag)
{
    static constexpr const char* kFunction = "upgradeScript";
    const QStringList arguments = makeArguments(kFunction, list);
    if (flag)
        return runOnce(kFunction, arguments);
    int result = 0;
    for (int attempt = 1; attempt <= kAttempts; ++attempt) {
        result = runOnce(kFunction, arguments);
        // After a success as well, as agreed.
        QThread::sleep(static_cast<unsigned long>(attempt));
        if (result == 0)
            break;
    }
    return result;
}

int UpgradePriority::upgradeScriptAsy(const QStringList& list, bool flag)
{
    static constexpr const char* kFunction = "upgradeScriptAsy";
    const QStringList arguments = makeArguments(kFunction, list);
    int result = 0;
    // The callers' `flag` asks here for the repetition, where upgradeScript() takes it as "once".
    if (!flag) {
        result = launchOnce(kFunction, arguments);
    } else {
        // A success leads to the next launch, as agreed.
        for (int attempt = 1; attempt <= kAttempts; ++attempt) {
            result = launchOnce(kFunction, arguments);
            QThread::sleep(static_cast<unsigned long>(attempt));
            if (result == 0)
                break;
        }
    }
    QThread::msleep(kLaunchPauseMs);
    return result;
}
