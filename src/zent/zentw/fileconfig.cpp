// SPDX-License-Identifier: Apache-2.0
#include "fileconfig.h"

#include "activeconnections.h"
#include "dbusnames.h"
#include "filewrite.h"
#include "networkdaemonproxy.h"
#include "paths.h"
#include "terminalinfo.h"

#include <QDebug>
#include <QDir>
#include <QFile>
#include <QFileInfo>
#include <QJsonDocument>
#include <QJsonObject>

#include <sys/stat.h>
#include <unistd.h>

namespace
{

namespace infokey = zent::base::infokey;

QUrl httpsUrl(const QString& host, const QString& port, const QString& path)
{
    QUrl url;
    url.setScheme(QStringLiteral("https"));
    url.setHost(host, QUrl::DecodedMode);
    url.setPath(path, QUrl::DecodedMode);
    url.setPort(port.toInt());
    qDebug() << "url:" << url;
    return url;
}

/// Makes the staging directory where it is missing. False for a symbolic link, and for a directory of another user or
/// one that others may write to: everybody may write to the temporary directory.
bool prepareStagingDirectory(const QString& path)
{
    const QByteArray encoded = QFile::encodeName(path);
    if (mkdir(encoded.constData(), 0755) == 0)
        return true;
    struct stat status = {};
    return lstat(encoded.constData(), &status) == 0 && S_ISDIR(status.st_mode) && status.st_uid == getuid() &&
           (status.st_mode & (S_IWGRP | S_IWOTH)) == 0;
}

} // namespace

FileConfig* FileConfig::GetInstance()
{
    static FileConfig instance;
    return &instance;
}

FileConfig::FileConfig()
{
    readServerConfig(zent::kUserinfoPath);
}

QUrl FileConfig::getServerUrl(const QString& path) const
{
    return httpsUrl(m_serverHost, m_serverPort, path);
}

QUrl FileConfig::getDomainUrl(const QString& path) const
{
    return httpsUrl(m_domainHost, m_domainPort, path);
}

void FileConfig::readServerConfig(const QString& path)
{
    const zent::base::FileReading file = zent::base::readTerminalInfo(path);
    if (!file.opened) {
        qWarning() << (file.exists ? "fail to open file userinfo.json !" : " not found userinfo.json");
        m_terminalName = readHostName();
        return;
    }
    QJsonParseError error;
    const QJsonDocument document = QJsonDocument::fromJson(file.content, &error);
    if (error.error != QJsonParseError::NoError) {
        qWarning() << "userinfo.json Json error";
        return;
    }
    const QJsonObject object = document.object();
    m_serverHost = object.value(infokey::kServerHost).toString();
    m_serverPort = object.value(infokey::kServerPort).toString();
    m_domainHost = object.value(infokey::kDomainHost).toString();
    m_domainPort = object.value(infokey::kDomainPort).toString();
    m_terminalName = object.value(infokey::kTerminalName).toString();
    m_isDomain = object.value(infokey::kIsDomain).toBool();
}

void FileConfig::writeServerConfig()
{
    const QJsonObject object{
        {infokey::kServerHost, m_serverHost},     {infokey::kServerPort, m_serverPort},
        {infokey::kDomainHost, m_domainHost},     {infokey::kDomainPort, m_domainPort},
        {infokey::kTerminalName, m_terminalName}, {infokey::kIsDomain, m_isDomain},
    };
    const QByteArray json = QJsonDocument(object).toJson();
    qDebug() << "FileConfig::writeServerInfo---strConfig:" << QString::fromUtf8(json);

    if (prepareStagingDirectory(QFileInfo(zent::kTmpUserinfoPath).path()) &&
        zent::base::replaceFile(zent::kTmpUserinfoPath, json) == zent::base::WriteResult::Done)
        qInfo() << "write json success";
    else
        qWarning() << "file open error";
}

QString FileConfig::readHostName() const
{
    QFile file(zent::kHostnamePath);
    if (!file.exists()) {
        qWarning() << " not found :" << zent::kHostnamePath;
        return QString();
    }
    if (!file.open(QIODevice::ReadOnly | QIODevice::Text)) {
        qWarning() << " open filed :" << zent::kHostnamePath;
        return QString();
    }
    return QString::fromUtf8(file.readAll()).remove(QLatin1Char('\n'));
}

QString FileConfig::getMacAddress() const
{
    NetworkDaemonProxy daemon(zent::dbus::kNetworkService, zent::dbus::kNetworkPath, QDBusConnection::sessionBus());
    const std::optional<QString> answer = daemon.activeConnectionInfo();
    if (!answer) {
        qCritical() << "GetActiveConnectionInfo error";
        return QString();
    }
    const auto array = zent::parseConnectionArray(answer->toUtf8());
    const auto address = zent::primaryHwAddress(array.value_or(QJsonArray()));
    if (address)
        qInfo() << *address;
    return address.value_or(QString());
}

void FileConfig::saveCert(const QString& base64Content, const QString& filePath)
{
    QDir().mkpath(QFileInfo(filePath).path());
    const QByteArray content = QByteArray::fromBase64(base64Content.toLatin1());
    if (zent::base::replaceFile(filePath, content) != zent::base::WriteResult::Done)
        qWarning() << "writeCERT open error! " << filePath;
}
