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

    QStringList names(const char* kind) const { return m_data[kind].toString().split(' '); }

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
        for (QDate date(1901, 1, 1); date <= QDate(2099, 12, 31); date = date.addDays(1))
            all.addData(LunarDay(date).text().toUtf8());
        fixture::compare(QString(all.result().toHex()), m_data["checksum"]);
    }

    void everyDayFollowsTheDayBefore()
    {
        const QStringList months = names("months");
        const QStringList days = names("days of a month");
        const QStringList terms = names("solar terms");
        // The first day is the 11th of the eleventh month.
        int month = 10, day = 9, termCount = 0;
        bool leap = false;
        QDate lastTerm(1900, 12, 22);
        for (QDate date(1901, 1, 1); date <= QDate(2099, 12, 31); date = date.addDays(1)) {
            const QByteArray where = date.toString(Qt::ISODate).toUtf8();
            const LunarDay found(date);
            QVERIFY2(found.known, where);
            const bool nowLeap = found.monthDay.startsWith("闰");
            const int nowMonth = months.indexOf(found.monthDay.section("月", 0, 0).remove("闰"));
            const int nowDay = days.indexOf(found.monthDay.section("月", 1));
            QVERIFY2(nowMonth >= 0 && nowDay >= 0, where);
            if (nowDay == 0) {
                QVERIFY2(day == 28 || day == 29, where);
                QVERIFY2(nowLeap ? !leap && nowMonth == month : nowMonth == (month + 1) % 12, where);
            } else {
                QVERIFY2(nowDay == day + 1 && nowMonth == month && nowLeap == leap, where);
            }
            month = nowMonth;
            day = nowDay;
            leap = nowLeap;

            if (found.solarTerm.isEmpty())
                continue;
            QCOMPARE(found.solarTerm, terms.at(termCount++ % terms.size()));
            // A term lasts 15 degrees of the sun's yearly path.
            QVERIFY2(qAbs(lastTerm.daysTo(date) - 15) <= 1, where);
            lastTerm = date;
        }
        QCOMPARE(termCount, 199 * 24);
    }

    void refusesOutsideTheRange()
    {
        for (const QDate& date : {QDate(1900, 12, 31), QDate(2100, 1, 1), QDate(), QDate(-1, 1, 1)}) {
            const LunarDay day(date);
            QVERIFY(!day.known && day.text().isEmpty());
        }
    }
};

QTEST_APPLESS_MAIN(TestLunar)
#include "test_lunar.moc"
