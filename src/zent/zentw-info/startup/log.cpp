#include "log.h"

#include <QByteArray>
#include <QDateTime>
#include <QFileInfo>
#include <QLoggingCategory>

#include <syslog.h>

namespace zent
{

namespace
{

int currentLevel = LEVEL_DEBUG;

struct Severity {
    const char* word;
    int priority;
};

Severity severityOf(QtMsgType type)
{
    switch (type) {
    case QtDebugMsg:
        return {"debug", LOG_DEBUG};
    case QtInfoMsg:
        return {"info", LOG_INFO};
    case QtWarningMsg:
        return {"warning", LOG_WARNING};
    case QtCriticalMsg:
        // More urgent than a fatal message: alarms at the sites are tuned to this order.
        return {"critical", LOG_CRIT};
    case QtFatalMsg:
        break;
    }
    // Four letters, as log filters in the field look for this word.
    return {"fata", LOG_ERR};
}

/// The name after the last "/" of the context's path, which may be absent.
QByteArray bareFileName(const char* path)
{
    const QByteArray file(path);
    return file.mid(file.lastIndexOf('/') + 1);
}

} // namespace

void uOpenlog(LEVEL level)
{
    // syslog keeps the pointer, so the text must live as long as the process.
    static const QByteArray identity =
        QFileInfo(QFileInfo(QStringLiteral("/proc/self/exe")).symLinkTarget()).fileName().toLatin1();

    QLoggingCategory::defaultCategory()->setEnabled(QtDebugMsg, level == LEVEL_DEBUG);
    currentLevel = level;
    openlog(identity.constData(), LOG_PID | LOG_CONS | LOG_PERROR, LOG_DAEMON);
    qInstallMessageHandler(uSyslogMessageHandler);
}

void uCloselog()
{
    closelog();
}

void uSyslogMessageHandler(QtMsgType type, const QMessageLogContext& context, const QString& message)
{
    const Severity severity = severityOf(type);
    if (severity.priority > currentLevel)
        return;
    const QByteArray time = QDateTime::currentDateTime().toString(QStringLiteral("yyyy-MM-dd hh:mm:ss.zzz")).toLatin1();
    syslog(severity.priority, "%s %s [ %s %s %u]  %s \n", time.constData(), severity.word,
           bareFileName(context.file).constData(), context.function ? context.function : "",
           static_cast<unsigned int>(context.line), message.toLocal8Bit().constData());
}

} // namespace zent
