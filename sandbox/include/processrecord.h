// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "testfiles.h"

#include <QJsonArray>
#include <QJsonDocument>
#include <QJsonObject>
#include <QStringList>

/// What the room's stand-ins have recorded, for tests that run without the simulated platform.
namespace processrecord
{

inline QString path()
{
    return qEnvironmentVariable("ROOM") + "/record.jsonl";
}

/// The complete entries of the program, in order.
inline QList<QJsonObject> entries(const QString& program)
{
    QList<QJsonObject> result;
    const QByteArray content = testfiles::read(path());
    for (const QByteArray& line : content.left(content.lastIndexOf('\n') + 1).split('\n')) {
        const QJsonObject entry = QJsonDocument::fromJson(line).object();
        if (entry.value("kind") == "process" && entry.value("name") == program)
            result.append(entry);
    }
    return result;
}

inline QStringList words(const QJsonObject& entry)
{
    QStringList result;
    for (const QJsonValue& word : entry.value("args").toArray())
        result.append(word.toString());
    return result;
}

inline void clear()
{
    testfiles::write(path(), QByteArray());
}

} // namespace processrecord
