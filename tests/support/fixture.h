// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "logcapture.h"
#include "testfiles.h"

#include <QJsonArray>
#include <QJsonDocument>
#include <QJsonObject>
#include <QtTest>

/// Tables of whole requests and replies, kept below tests/data: an object with a named object for each row.
namespace fixture
{

inline QJsonObject read(const QString& file)
{
    const QString path = QStringLiteral(ZENT_TEST_DATA "/") + file;
    const QJsonObject rows = QJsonDocument::fromJson(testfiles::read(path)).object();
    if (rows.isEmpty())
        qFatal("no rows in %s", qPrintable(path));
    return rows;
}

/// For the _data function of a test: a column "row" with the rows of the file.
inline void addRows(const QString& file)
{
    QTest::addColumn<QJsonObject>("row");
    const QJsonObject rows = read(file);
    for (auto row = rows.begin(); row != rows.end(); ++row)
        QTest::newRow(qPrintable(row.key())) << row.value().toObject();
}

inline QByteArray text(const QJsonValue& value)
{
    return QJsonDocument(QJsonArray{value}).toJson(QJsonDocument::Compact);
}

/// Fails, with one line that says both, where the values differ.
inline void compare(const QJsonValue& got, const QJsonValue& expected)
{
    const QByteArray both = "expected " + text(expected) + " got " + text(got);
    QTest::qVerify(got == expected, "equal values", both.constData(), __FILE__, __LINE__);
}

/// Fails where one of the lines is missing.
inline void compareLog(const LogCapture& log, const QJsonValue& lines)
{
    for (const QJsonValue& line : lines.toArray())
        QVERIFY2(log.contains(line.toString()), qPrintable(line.toString() + "\n\n" + log.lines().join('\n')));
}

} // namespace fixture
