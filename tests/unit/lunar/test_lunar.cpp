// SPDX-License-Identifier: Apache-2.0
#include "fixture.h"
#include "lunarcalendar.h"

#include <QCryptographicHash>

namespace
{

struct LunarDay {
    QString monthDay, year, month, day, solarTerm, festival;
    bool known;

    explicit LunarDay(const QDate& date) { known = GetLunarDay(date, monthDay, year, month, day, solarTerm, festival); }
    QString text() const { return QStringList({monthDay, year, month, day, solarTerm, festival}).join(' ').trimmed(); }
};

} // namespace

class TestLunar : public QObject
{
    Q_OBJECT

    const QJsonObject m_data = fixture::read("lunar.json");

private slots:
    void publishedDays()
    {
        // With leap months, without a festival in the copy, and one that reaches into the next Gregorian year; New
        // Year's Eve in a short last month, and the 29th day of a long one. The day before Qingming may meet a lunar
        // festival, which then follows without a separator.
        const QJsonObject days = m_data["days"].toObject();
        QVERIFY(!days.isEmpty());
        for (auto day = days.begin(); day != days.end(); ++day) {
            const LunarDay found(QDate::fromString(day.key(), Qt::ISODate));
            fixture::compare(QString(day.key() + ' ' + found.text()), QString(day.key() + ' ' + day->toString()));
        }
    }

    void wholeCalendarIsAsItWas()
    {
        // Of the tables that were compared with published calendars; a change of any day shows here.
        QCryptographicHash all(QCryptographicHash::Sha256);
        for (QDate date(1901, 1, 1); date <= QDate(2099, 12, 31); date = date.addDays(1)) {
            const LunarDay day(date);
            QVERIFY2(day.known, qPrintable(date.toString(Qt::ISODate)));
            all.addData(day.text().toUtf8());
        }
        fixture::compare(QString(all.result().toHex()), m_data["checksum"]);
        for (const QDate& date : {QDate(1900, 12, 31), QDate(2100, 1, 1), QDate(), QDate(-1, 1, 1)}) {
            const LunarDay day(date);
            QVERIFY2(!day.known && day.text().isEmpty(), qPrintable(date.toString(Qt::ISODate)));
        }
    }
};

QTEST_APPLESS_MAIN(TestLunar)
#include "test_lunar.moc"
