// SPDX-License-Identifier: Apache-2.0
#include "filecontent.h"

#include "baseutils.h"

#include <QDebug>
#include <QJsonObject>

namespace zent::base
{

namespace
{

/// The file's object; an empty one when it is not JSON, so that each wanted key is logged as missing.
/// Nothing when the file cannot be opened.
std::optional<QJsonObject> readInfoFile(const QString& caller)
{
    const FileReading info = readTerminalInfo(kUserinfoPath, OpenFailure::Logged);
    if (info.opened)
        return parseInfoObject(info.content).value_or(QJsonObject());
    BaseUtils::openFailedLog(caller);
    return std::nullopt;
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

/// Whether the file now holds what it should; otherwise a log line says why not. `logShortWrite` does so for a write
/// that fell short.
template <typename LogShortWrite>
bool isDone(const InfoChange& change, const QString& caller, LogShortWrite logShortWrite)
{
    switch (change.state) {
    case InfoChange::State::Done:
    case InfoChange::State::Declined:
        return true;
    case InfoChange::State::NotOpened:
    case InfoChange::State::NotWritten:
        BaseUtils::openFailedLog(caller);
        return false;
    case InfoChange::State::NotObject:
        qWarning() << caller << "parse file failed, file:" << kUserinfoPath;
        return false;
    case InfoChange::State::Short:
        break;
    }
    logShortWrite();
    return false;
}

bool isDone(const InfoChange& change, const QString& caller, const QString& changedKey)
{
    return isDone(change, caller, [&] { qWarning() << "write value failed, key:" << changedKey; });
}

/// The value of `key`, or that of `olderKey`, which is then to be written under `key`. An older value that is no text
/// is not: an empty text in its place could never be told from a missing one again.
bool readMigrating(const QJsonObject& object, const QString& key, const QString& olderKey, QString& out,
                   UserInfoReading& reading, const QString& caller)
{
    if (BaseUtils::getJsonObjectValue(object, key, out, caller))
        return true;
    if (!BaseUtils::getJsonObjectValue(object, olderKey, out, caller))
        return false;
    if (object.value(olderKey).isString())
        reading.migrated.emplace_back(key, out);
    return true;
}

} // namespace

UserInfoReading readUserInfo(const QJsonObject& object, const QString& caller)
{
    UserInfoReading reading;
    UserInfo& info = reading.info;
    bool& complete = reading.complete;
    complete &= BaseUtils::getJsonObjectValue(object, infokey::kIsDomain, info.isDomain, caller);
    complete &= BaseUtils::getJsonObjectValue(object, infokey::kServerHost, info.serverHost, caller);
    complete &= readMigrating(object, infokey::kDomainHost, infokey::kServerIp, info.domainHost, reading, caller);
    complete &= readMigrating(object, infokey::kDomainPort, infokey::kServerPort, info.domainPort, reading, caller);
    complete &= BaseUtils::getJsonObjectValue(object, infokey::kServerPort, info.serverPort, caller);
    complete &= BaseUtils::getJsonObjectValue(object, infokey::kTerminalName, info.terminalName, caller);
    return reading;
}

template <typename T>
bool updateUserInfo(const QString& key, const T& value)
{
    const auto insert = [&](QJsonObject& object) {
        object.insert(key, value);
        return true;
    };
    return isDone(changeTerminalInfo(insert, OpenFailure::Logged), QStringLiteral("updateUserInfo"), key);
}

template bool updateUserInfo<QString>(const QString& key, const QString& value);

FileContent* FileContent::instace()
{
    static FileContent instance;
    return &instance;
}

QString FileContent::getMachineID(bool* ok, bool)
{
    const FileReading file = readMachineId(OpenFailure::Logged);
    if (!file.opened)
        BaseUtils::openFailedLog(QStringLiteral("getMachineID"));
    if (ok)
        *ok = file.opened;
    return QString::fromUtf8(file.content).trimmed();
}

bool FileContent::isDomain(bool* ok)
{
    return readKey<bool>(infokey::kIsDomain, ok, QStringLiteral("isDomain"));
}

bool FileContent::saveDomain(bool value)
{
    bool known = false;
    const auto set = [&](QJsonObject& object) {
        known = object.contains(infokey::kIsDomain);
        if (!known) {
            qWarning() << "It is not contain in info file, key:" << infokey::kIsDomain;
            return false;
        }
        if (object.value(infokey::kIsDomain) == QJsonValue(value)) {
            qInfo() << "value is the same in file, key:" << infokey::kIsDomain;
            return false;
        }
        object.insert(infokey::kIsDomain, value);
        return true;
    };
    const InfoChange change = changeTerminalInfo(set, OpenFailure::Logged);
    return isDone(change, QStringLiteral("saveDomain"), infokey::kIsDomain) && known;
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
    const std::optional<QJsonObject> object = readInfoFile(caller);
    const UserInfoReading reading = object ? readUserInfo(*object, caller) : UserInfoReading{{}, false, {}};
    for (const auto& [key, value] : reading.migrated)
        updateUserInfo(key, value);
    if (ok)
        *ok = reading.complete;
    return reading.info;
}

bool FileContent::saveUserInfo(const UserInfo& info)
{
    const QJsonObject object{{infokey::kIsDomain, info.isDomain},     {infokey::kServerHost, info.serverHost},
                             {infokey::kServerPort, info.serverPort}, {infokey::kDomainHost, info.domainHost},
                             {infokey::kDomainPort, info.domainPort}, {infokey::kTerminalName, info.terminalName}};
    return isDone(writeTerminalInfo(object), QStringLiteral("saveUserInfo"),
                  [] { qWarning() << "write info json failed"; });
}

} // namespace zent::base
