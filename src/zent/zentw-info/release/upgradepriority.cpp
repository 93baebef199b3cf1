#include "upgradepriority.h"

#include "thirdscript.h"

#include <QDebug>
#include <QProcess>
#include <QThread>

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
    const QStringList arguments = zent::thirdScriptArguments(list.first(), scriptArguments);
    // This includes the token: with it support staff can repeat the request by hand.
    for (const QString& word : arguments)
        qDebug() << function << " strCmdList:" << word;
    return arguments;
}

int runOnce(const char* function, const QStringList& arguments)
{
    const int result = QProcess::execute(zent::kFrontEndInterpreter, arguments);
    qDebug() << function << " nRet:" << result;
    return result;
}

int launchOnce(const char* function, const QStringList& arguments)
{
    const int result = QProcess::startDetached(zent::kFrontEndInterpreter, arguments) ? 1 : 0;
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
        // After a success as well: what the script has changed settles before the caller goes on.
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
        // Success leads to the next launch: nobody sees how a detached script fares, so it is simply sent three times.
        for (int attempt = 1; attempt <= kAttempts; ++attempt) {
            result = launchOnce(kFunction, arguments);
            QThread::sleep(static_cast<unsigned long>(attempt));
            if (result == 0)
                break;
        }
    }
    // The front end needs a moment to take the request up before the caller's next step.
    QThread::msleep(kLaunchPauseMs);
    return result;
}
