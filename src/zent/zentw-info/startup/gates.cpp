// SPDX-License-Identifier: Apache-2.0
#include "startup/gates.h"

#include "paths.h"
#include "system/idcommand.h"
#include "terminalinfo.h"

#include <QDebug>
#include <QFile>
#include <QStringList>

bool isDomain()
{
    const zent::base::FileReading info = zent::base::readTerminalInfo();
    if (!info.opened)
        return false;
    if (zent::saysInDomain(info.content))
        return true;
    qInfo() << "is not Domain!";
    return false;
}

bool isLDAPUser()
{
    return IdCommand().output().contains(QLatin1String("zent"));
}

int getMiniVersion()
{
    constexpr int kNoVersionFile = 1000;
    QFile file(zent::kOsVersionPath);
    if (!file.exists())
        return kNoVersionFile;
    if (!file.open(QIODevice::ReadOnly | QIODevice::Text))
        return -1;
    return zent::minorVersionIn(QString::fromUtf8(file.readAll()));
}

namespace zent
{

bool saysInDomain(const QByteArray& infoFile)
{
    const auto object = base::parseInfoObject(infoFile);
    return object && object->value(base::infokey::kIsDomain) == QJsonValue(true);
}

int minorVersionIn(const QString& versionFile)
{
    int version = -1;
    for (QString line : versionFile.split(QLatin1Char('\n'))) {
        if (!line.contains(QLatin1String("MinorVersion")))
            continue;
        version = line.remove(QLatin1String("MinorVersion=")).toInt();
        qDebug() << "nOSVersion:" << version;
    }
    return version;
}

} // namespace zent
