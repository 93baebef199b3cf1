#include "noconfig.h"

#include <unistd.h>

QString zent::noconfig::text(const QString& fileName, const QString& reason)
{
    return QStringLiteral("读取%1失败，错误原因是：%2").arg(fileName, reason);
}

QDebug zent::noconfig::describe(QDebug line, const QFile& file)
{
    line << "no config.json to use, error code: " << file.error() << ", error detail: " << file.errorString()
         << ", uid: " << getuid() << ", gid: " << getgid() << ", euid: " << geteuid() << ", egid: " << getegid();
    return line;
}
