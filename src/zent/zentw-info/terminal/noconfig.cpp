// SPDX-License-Identifier: Apache-2.0
#include "terminal/noconfig.h"

#include <unistd.h>

QString zent::noconfig::text(const QString& fileName, const QString& reason)
{
    return QStringLiteral("读取%1失败，错误原因是：%2").arg(fileName, reason);
}

QDebug zent::noconfig::describe(QDebug line, const base::FileError& error)
{
    line << "no config.json to use, error code: " << error.code << ", error detail: " << error.text
         << ", uid: " << getuid() << ", gid: " << getgid() << ", euid: " << geteuid() << ", egid: " << getegid();
    return line;
}
