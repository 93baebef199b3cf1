#include "lunarcalendar.h"

#include <QtTest>

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

private slots:
    void publishedDays()
    {
        const QMap<QDate, QString> days = {
            {QDate(1901, 1, 1), "十一月十一 庚子年 戊子月 己卯日"},
            {QDate(1901, 2, 19), "正月初一 辛丑年 庚寅月 戊辰日 雨水 春节"},
            {QDate(2099, 12, 31), "十一月二十 己未年 丙子月 壬寅日"},
            // Leap months: no festival in the copy, and the one that reaches into the next Gregorian year.
            {QDate(2006, 8, 30), "闰七月初七 丙戌年 丙申月 辛卯日"},
            {QDate(2033, 12, 21), "十一月三十 癸丑年 甲子月 丙午日 冬至"},
            {QDate(2034, 1, 19), "闰十一月廿九 癸丑年 乙丑月 乙亥日"},
            // New Year's Eve in a short last month, and the 29th day of a long one.
            {QDate(2022, 1, 31), "腊月廿九 辛丑年 辛丑月 甲申日  除夕"},
            {QDate(2024, 2, 8), "腊月廿九 癸卯年 丙寅月 壬寅日"},
            // The day before Qingming may meet a lunar festival, which then follows without a separator.
            {QDate(2003, 4, 4), "三月初三 癸未年 乙卯月 丁未日  寒食节上巳节"},
        };
        for (auto day = days.begin(); day != days.end(); ++day)
            QCOMPARE(LunarDay(day.key()).text(), day.value());
    }

    void everyDayFollowsTheDayBefore()
    {
        const QStringList months = QString("正 二 三 四 五 六 七 八 九 十 十一 腊").split(' ');
        const QStringList days = QString("初一 初二 初三 初四 初五 初六 初七 初八 初九 初十 十一 十二 十三 十四 十五 "
                                         "十六 十七 十八 十九 二十 廿一 廿二 廿三 廿四 廿五 廿六 廿七 廿八 廿九 三十")
                                     .split(' ');
        const QStringList terms = QString("小寒 大寒 立春 雨水 惊蛰 春分 清明 谷雨 立夏 小满 芒种 夏至 "
                                          "小暑 大暑 立秋 处暑 白露 秋分 寒露 霜降 立冬 小雪 大雪 冬至")
                                      .split(' ');
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
