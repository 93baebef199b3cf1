// SPDX-License-Identifier: Apache-2.0
#include "fixture.h"
#include "lunarcalendar.h"

#include <QCryptographicHash>

class TestLunar : public QObject
{
    Q_OBJECT

    /// What is said of a day, "unknown" before the rest where there is nothing to say.
    static QString lunarDay(const QDate& date)
    {
        QString monthDay, year, month, day, solarTerm, festival;
        const bool known = GetLunarDay(date, monthDay, year, month, day, solarTerm, festival);
        return ((known ? "" : "unknown ") + QStringList{monthDay, year, month, day, solarTerm, festival}.join(' '))
            .trimmed();
    }

private slots:
    void everyDayIsAsPublished()
    {
        // With leap months, without a festival in the copy, and one that reaches into the next Gregorian year; New
        // Year's Eve in a short last month, and the 29th day of a long one. The day before Qingming may meet a lunar
        // festival, which then follows without a separator. Days of other years are unknown.
        const QJsonObject data = fixture::read("lunar.json");
        const QJsonObject days = data["days"].toObject();
        for (auto day = days.begin(); day != days.end(); ++day)
            QCOMPARE(day.key() + ' ' + lunarDay(QDate::fromString(day.key(), Qt::ISODate)),
                     day.key() + ' ' + day->toString());
        // Of the tables that were compared with published calendars; a change of any day shows here.
        QCryptographicHash all(QCryptographicHash::Sha256);
        for (QDate date(1901, 1, 1); date <= QDate(2099, 12, 31); date = date.addDays(1))
            all.addData(lunarDay(date).toUtf8());
        fixture::compare(QString(all.result().toHex()), data["checksum"]);
    }
};

QTEST_APPLESS_MAIN(TestLunar)
#include "test_lunar.moc"
