#include "idcommand.h"

#include <QProcess>

namespace
{
constexpr int kTimeoutMs = 30000;
}

QString idCommandOutput()
{
    QProcess process;
    process.start(QStringLiteral("id"), QStringList(), QIODevice::ReadWrite);
    if (!process.waitForFinished(kTimeoutMs) || process.exitStatus() != QProcess::NormalExit) {
        process.kill();
        return QString();
    }
    return QString::fromLocal8Bit(process.readAllStandardOutput());
}
