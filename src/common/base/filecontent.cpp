#include "filecontent.h"

#include "baseutils.h"
#include "fileproxy.h"
#include "filewrite.h"
#include "paths.h"

#include <QDebug>
#include <QJsonDocument>

namespace zent::base
{

namespace
{

/// The file's object; an empty one when it is not JSON, so that each wanted key is logged as missing.
/// Nothing when the file cannot be opened.
std::optional<QJsonObject> readInfoFile(const QString& caller)
{
    FileProxy file;
    if (!file.open(kUserinfoPath, QIODevice::ReadOnly)) {
        BaseUtils::openFailedLog(caller);
        return std::nullopt;
    }
    return parseInfoObject(file.readAll()).value_or(QJsonObject());
}

template <typename T>
T readKey(const QString& key, bool* ok, const QString& caller)
{
    T value{};
    const std::optional<QJsonObject> object = readInfoFile(caller);
    const bool found = object && BaseUtils::getJsonObjectValue(*object, key, value, caller);
    if (ok)
        *ok = found;
    return value;
}

/// Reads the file for a change. Nothing, with a log line, when it cannot be opened or is not one JSON object: a file
/// that another component is still writing must not be replaced by what little was understood of it.
std::optional<QJsonObject> readForChange(const QString& caller)
{
    FileProxy file;
    if (!file.open(kUserinfoPath, QIODevice::ReadOnly)) {
        BaseUtils::openFailedLog(caller);
        return std::nullopt;
    }
    std::optional<QJsonObject> object = parseInfoObject(file.readAll());
    if (!object)
        qWarning() << caller << "parse file failed, file:" << kUserinfoPath;
    return object;
}

/// Writes the object back. False, with a log line, when the file cannot be opened (the line names `caller`) or is not
/// written whole (`logShortWrite` then says so).
template <typename LogShortWrite>
bool writeInfoFile(const QJsonObject& object, const QString& caller, LogShortWrite logShortWrite)
{
    switch (replaceFile(kUserinfoPath, QJsonDocument(object).toJson())) {
    case WriteResult::Done:
        return true;
    case WriteResult::NotOpened:
        BaseUtils::openFailedLog(caller);
        return false;
    case WriteResult::Short:
        break;
    }
    logShortWrite();
    return false;
}

bool writeInfoFile(const QJsonObject& object, const QString& caller, const QString& changedKey)
{
    return writeInfoFile(object, caller, [&] { qWarning() << "write value failed, key:" << changedKey; });
}

/// The value of `key`, or that of `olderKey`, which is then written back under `key`. An older value that is no text
/// is not written: an empty text in its place could never be told from a missing one again.
bool readMigrating(const QJsonObject& object, const QString& key, const QString& olderKey, QString& out,
                   const QString& caller)
{
    if (BaseUtils::getJsonObjectValue(object, key, out, caller))
        return true;
    if (!BaseUtils::getJsonObjectValue(object, olderKey, out, caller))
        return false;
    if (object.value(olderKey).isString())
        updateUserInfo(key, out);
    return true;
}

} // namespace

std::optional<QJsonObject> parseInfoObject(const QByteArray& content)
{
    QJsonParseError error;
    const QJsonDocument document = QJsonDocument::fromJson(content, &error);
    if (error.error != QJsonParseError::NoError || !document.isObject())
        return std::nullopt;
    return document.object();
}

template <typename T>
bool updateUserInfo(const QString& key, const T& value)
{
    const QString caller = QStringLiteral("updateUserInfo");
    std::optional<QJsonObject> object = readForChange(caller);
    if (!object)
        return false;
    object->insert(key, value);
    return writeInfoFile(*object, caller, key);
}

template bool updateUserInfo<QString>(const QString& key, const QString& value);

FileContent* FileContent::instace()
{
    static FileContent instance;
    return &instance;
}

QString FileContent::getMachineID(bool* ok, bool)
{
    FileProxy file;
    const bool opened = file.open(kMachineidPath, QIODevice::ReadOnly);
    if (!opened)
        BaseUtils::openFailedLog(QStringLiteral("getMachineID"));
    if (ok)
        *ok = opened;
    return QString::fromUtf8(file.readAll()).trimmed();
}

bool FileContent::isDomain(bool* ok)
{
    return readKey<bool>(infokey::kIsDomain, ok, QStringLiteral("isDomain"));
}

bool FileContent::saveDomain(bool value)
{
    const QString caller = QStringLiteral("saveDomain");
    std::optional<QJsonObject> object = readForChange(caller);
    if (!object)
        return false;
    if (!object->contains(infokey::kIsDomain)) {
        qWarning() << "It is not contain in info file, key:" << infokey::kIsDomain;
        return false;
    }
    if (object->value(infokey::kIsDomain) == QJsonValue(value)) {
        qInfo() << "value is the same in file, key:" << infokey::kIsDomain;
        return true;
    }
    object->insert(infokey::kIsDomain, value);
    return writeInfoFile(*object, caller, infokey::kIsDomain);
}

bool FileContent::getHostAndPort(QString& host, QString& port)
{
    const QString caller = QStringLiteral("getHostAndPort");
    const std::optional<QJsonObject> object = readInfoFile(caller);
    if (!object)
        return false;
    const bool hasHost = BaseUtils::getJsonObjectValue(*object, infokey::kServerHost, host, caller);
    const bool hasPort = BaseUtils::getJsonObjectValue(*object, infokey::kServerPort, port, caller);
    return hasHost && hasPort;
}

QString FileContent::getTerminalAlias(bool* ok)
{
    return readKey<QString>(infokey::kTerminalName, ok, QStringLiteral("getTerminalAlias"));
}

UserInfo FileContent::getUserInfo(bool* ok)
{
    const QString caller = QStringLiteral("getUserInfo");
    UserInfo info;
    const std::optional<QJsonObject> object = readInfoFile(caller);
    bool complete = object.has_value();
    if (object) {
        complete &= BaseUtils::getJsonObjectValue(*object, infokey::kIsDomain, info.isDomain, caller);
        complete &= BaseUtils::getJsonObjectValue(*object, infokey::kServerHost, info.serverHost, caller);
        complete &= readMigrating(*object, infokey::kDomainHost, infokey::kServerIp, info.domainHost, caller);
        complete &= readMigrating(*object, infokey::kDomainPort, infokey::kServerPort, info.domainPort, caller);
        complete &= BaseUtils::getJsonObjectValue(*object, infokey::kServerPort, info.serverPort, caller);
        complete &= BaseUtils::getJsonObjectValue(*object, infokey::kTerminalName, info.terminalName, caller);
    }
    if (ok)
        *ok = complete;
    return info;
}

bool FileContent::saveUserInfo(const UserInfo& info)
{
    const QJsonObject object{{infokey::kIsDomain, info.isDomain},     {infokey::kServerHost, info.serverHost},
                             {infokey::kServerPort, info.serverPort}, {infokey::kDomainHost, info.domainHost},
                             {infokey::kDomainPort, info.domainPort}, {infokey::kTerminalName, info.terminalName}};
    return writeInfoFile(object, QStringLiteral("saveUserInfo"), [] { qWarning() << "write info json failed"; });
}

} // namespace zent::base
