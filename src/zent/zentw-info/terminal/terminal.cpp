// SPDX-License-Identifier: Apache-2.0
#include "terminal/terminal.h"

#include "terminal/noconfig.h"
#include "terminalinfo.h"

#include <QDebug>
#include <QJsonObject>

#include <unistd.h>

namespace zent
{

std::optional<base::FileError> Terminal::missingInfoFile()
{
    const base::FileReading info = base::readTerminalInfo();
    if (info.exists)
        return std::nullopt;
    noconfig::describe(qInfo(), info.error);
    return info.error;
}

void Terminal::read()
{
    const base::FileReading info = base::readTerminalInfo();
    if (!info.opened)
        return;
    const base::FileReading machine = base::readMachineId();
    if (!machine.exists) {
        qDebug() << "no machine.txt to use";
        return;
    }
    if (!machine.opened)
        return;
    // The whole content, as agreed: a trailing line break belongs to it. Only a NUL byte ends it.
    machineId = QString::fromUtf8(machine.content.constData());
    namespace infokey = base::infokey;
    const QJsonObject object = base::parseInfoObject(info.content).value_or(QJsonObject());
    serverHost = object.value(infokey::kServerHost).toString();
    // Read as text here while the notification client reads a number: each serves one form of the file.
    serverPort = object.value(infokey::kServerPort).toString();
    hostName = localHostName();
}

QString localHostName()
{
    char name[1024] = {};
    gethostname(name, sizeof name - 1);
    return QString::fromLatin1(name);
}

} // namespace zent
