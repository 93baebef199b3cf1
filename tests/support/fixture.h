// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "logcapture.h"
#include "testfiles.h"

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

/// Whether a line of the log, with its level before it, is the expected one, where an asterisk stands for anything.
inline bool isLine(const QString& line, const QString& expected)
{
    const QString pattern = '^' + QRegularExpression::escape(expected).replace("\\*", ".*") + '$';
    return QRegularExpression(pattern, QRegularExpression::DotMatchesEverythingOption).match(line).hasMatch();
}

/// Fails where the lines differ from the expected ones, or their order or number does.
inline void compareLines(const QStringList& got, const QJsonValue& lines)
{
    const QStringList expected = lines.toVariant().toStringList();
    for (int i = 0; i < qMax(got.size(), expected.size()); ++i) {
        const QString both = "expected: " + expected.value(i) + "\ngot: " + got.value(i) + "\nof:\n";
        QVERIFY2(isLine(got.value(i), expected.value(i)), qPrintable(both + got.join('\n')));
    }
}

/// Fails where the log is not made of these lines, in this order.
inline void compareLog(const LogCapture& log, const QJsonValue& lines)
{
    compareLines(log.records(), lines);
}

/// Fails where one of the lines is not in the log, which several threads wrote.
inline void findInLog(const LogCapture& log, const QJsonValue& lines)
{
    const QStringList got = log.records();
    for (const QJsonValue& line : lines.toArray()) {
        const auto same = [&line](const QString& one) { return isLine(one, line.toString()); };
        QVERIFY2(std::any_of(got.begin(), got.end(), same), qPrintable(line.toString() + "\nin:\n" + got.join('\n')));
    }
}

} // namespace fixture
