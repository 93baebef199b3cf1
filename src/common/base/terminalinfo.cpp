// SPDX-License-Identifier: Apache-2.0
#include "terminalinfo.h"

#include "fileproxy.h"

#include <QFileInfo>
#include <QJsonDocument>

namespace zent::base
{

namespace
{

FileReading readFile(const QString& path, OpenFailure failure)
{
    FileProxy file;
    FileReading reading;
    reading.exists = QFileInfo::exists(path);
    reading.opened = failure == OpenFailure::Logged ? file.open(path, QIODevice::ReadOnly)
                                                    : file.openSilently(path, QIODevice::ReadOnly);
    if (reading.opened)
        reading.content = file.readAll();
    else
        reading.error = file.error();
    return reading;
}

} // namespace

FileReading readTerminalInfo(const QString& path, OpenFailure failure)
{
    return readFile(path, failure);
}

FileReading readMachineId(OpenFailure failure)
{
    return readFile(kMachineidPath, failure);
}

std::optional<QJsonObject> parseInfoObject(const QByteArray& content)
{
    const QJsonDocument document = QJsonDocument::fromJson(content);
    return document.isObject() ? std::optional<QJsonObject>(document.object()) : std::nullopt;
}

InfoChange changeTerminalInfo(const std::function<bool(QJsonObject&)>& edit, OpenFailure failure)
{
    const FileReading reading = readTerminalInfo(kUserinfoPath, failure);
    if (!reading.opened)
        return {InfoChange::State::NotOpened, reading.error};
    auto object = parseInfoObject(reading.content);
    if (!object)
        return {InfoChange::State::NotObject, {}};
    if (!edit(*object))
        return {InfoChange::State::Declined, {}};
    return writeTerminalInfo(*object);
}

InfoChange writeTerminalInfo(const QJsonObject& object)
{
    InfoChange change;
    switch (replaceFile(kUserinfoPath, QJsonDocument(object).toJson(), &change.error)) {
    case WriteResult::Done:
        break;
    case WriteResult::NotOpened:
        change.state = InfoChange::State::NotWritten;
        break;
    case WriteResult::Short:
        change.state = InfoChange::State::Short;
        break;
    }
    return change;
}

} // namespace zent::base
