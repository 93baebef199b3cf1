// SPDX-License-Identifier: Apache-2.0
#include "system/childprocess.h"

#include <QProcess>
#include <QStandardPaths>

#include <fcntl.h>
#include <unistd.h>

namespace
{

void keepDescriptorsFromChildren()
{
    close_range(STDERR_FILENO + 1, ~0U, CLOSE_RANGE_CLOEXEC);
}

class ChildProcess : public QProcess
{
public:
    ChildProcess()
    {
        setProcessChannelMode(ForwardedChannels);
        setStandardInputFile(nullDevice());
    }

protected:
    // GLib opens files without the flag that keeps them from children, at times while another thread forks.
    void setupChildProcess() override { keepDescriptorsFromChildren(); }
};

} // namespace

void zent::prepareDescriptorsForChildren()
{
    // It may become one of the three itself, and those are for the children too.
    const int null = open("/dev/null", O_RDWR);
    if (null < 0)
        return;
    dup2(null, STDIN_FILENO);
    for (const int stream : {STDOUT_FILENO, STDERR_FILENO}) {
        if (fcntl(stream, F_GETFD) < 0)
            dup2(null, stream);
    }
    if (null > STDERR_FILENO)
        close(null);
    // The client opens its own this way already; these are left from whoever started it.
    keepDescriptorsFromChildren();
}

int zent::execute(const QString& program, const QStringList& arguments, const QDeadlineTimer& limit)
{
    constexpr int kCrashed = -1;
    constexpr int kNotStarted = -2;
    ChildProcess process;
    process.start(program, arguments);
    if (!process.waitForFinished(int(limit.remainingTime()))) {
        if (process.state() == QProcess::NotRunning)
            return kNotStarted;
        process.kill();
        process.waitForFinished();
        return kTimeIsUp;
    }
    if (process.error() == QProcess::FailedToStart)
        return kNotStarted;
    return process.exitStatus() == QProcess::NormalExit ? process.exitCode() : kCrashed;
}

// QProcess::startDetached() allocates and takes locks in the forked child, which can hang when another thread holds one
// at that moment. QProcess::start() prepares everything before it forks.
bool zent::startDetached(const QString& program, const QStringList& arguments, Output output)
{
    if (QStandardPaths::findExecutable(program).isEmpty())
        return false;
    ChildProcess process;
    if (output == Output::Nowhere) {
        process.setStandardOutputFile(QProcess::nullDevice());
        process.setStandardErrorFile(QProcess::nullDevice());
    }
    process.start(QStringLiteral("setsid"), QStringList{QStringLiteral("--fork"), program} + arguments);
    return process.waitForFinished() && process.exitCode() == 0;
}

bool zent::startDetached(const QString& commandLine)
{
    QStringList words = QProcess::splitCommand(commandLine);
    return !words.isEmpty() && startDetached(words.takeFirst(), words);
}
