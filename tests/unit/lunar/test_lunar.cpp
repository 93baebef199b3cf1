#include "lunarcalendar.h"

#include <QtTest>

#include <array>

namespace
{

struct LunarDay {
    QString monthDay, year, month, day, solarTerm, festival;
    bool known;

    explicit LunarDay(const QDate& date) { known = GetLunarDay(date, monthDay, year, month, day, solarTerm, festival); }
    QString text() const { return QStringList({monthDay, year, month, day, solarTerm, festival}).join(' ').trimmed(); }
};

/// Entry `place` of the cycle of sixty, for a year, month or day.
QString cycle(int place, const char* unit)
{
    const QString stems = "甲乙丙丁戊己庚辛壬癸";
    const QString branches = "子丑寅卯辰巳午未申酉戌亥";
    return QString(stems[place % 10]) + branches[place % 12] + unit;
}

QStringList words(const char* text)
{
    return QString(text).split(' ');
}

} // namespace

class TestLunar : public QObject
{
    Q_OBJECT

private slots:
    void publishedDays_data()
    {
        QTest::addColumn<QString>("text");
        const auto row = [](const char* date, const char* text) { QTest::newRow(date) << text; };
        // The lunar year 1900, which has a leap eighth month, and its end.
        row("1901-01-01", "十一月十一 庚子年 戊子月 己卯日");
        row("1901-02-18", "腊月三十 庚子年 庚寅月 丁卯日  除夕");
        row("1901-02-19", "正月初一 辛丑年 庚寅月 戊辰日 雨水 春节");
        row("1949-10-01", "八月初十 己丑年 癸酉月 甲子日");
        row("2000-01-01", "十一月廿五 己卯年 丙子月 戊午日");
        row("2099-12-31", "十一月二十 己未年 丙子月 壬寅日");
        // Leap months: the regular month before, the leap copy, no festival in the copy, the month after.
        row("2020-05-22", "四月三十 庚子年 辛巳月 乙丑日");
        row("2020-05-23", "闰四月初一 庚子年 辛巳月 丙寅日");
        row("2020-06-21", "五月初一 庚子年 壬午月 乙未日 夏至");
        row("2006-08-30", "闰七月初七 丙戌年 丙申月 辛卯日");
        // The leap month that reaches into the next Gregorian year.
        row("2033-12-21", "十一月三十 癸丑年 甲子月 丙午日 冬至");
        row("2034-01-19", "闰十一月廿九 癸丑年 乙丑月 乙亥日");
        row("2034-01-20", "腊月初一 癸丑年 乙丑月 丙子日 大寒");
        // New Year's Eve in a short last month, and the 29th day of a long one.
        row("2022-01-31", "腊月廿九 辛丑年 辛丑月 甲申日  除夕");
        row("2024-02-08", "腊月廿九 癸卯年 丙寅月 壬寅日");
        // Cold Food day is the day before Qingming; it may meet a lunar festival, which then follows without a
        // separator.
        row("2020-04-03", "三月十一 庚子年 己卯月 丙子日  寒食节");
        row("2020-04-04", "三月十二 庚子年 庚辰月 丁丑日 清明");
        row("2020-04-19", "三月廿七 庚子年 庚辰月 壬辰日 谷雨");
        row("2003-04-04", "三月初三 癸未年 乙卯月 丁未日  寒食节上巳节");
    }

    void publishedDays()
    {
        QFETCH(QString, text);
        QCOMPARE(LunarDay(QDate::fromString(QTest::currentDataTag(), Qt::ISODate)).text(), text);
    }

    void publishedNewYears()
    {
        for (const QDate& date : {QDate(1903, 1, 29), QDate(1920, 2, 20), QDate(1944, 1, 25), QDate(1954, 2, 3),
                                  QDate(1966, 1, 21), QDate(1985, 2, 20), QDate(1997, 2, 7), QDate(2008, 2, 7),
                                  QDate(2024, 2, 10), QDate(2033, 1, 31), QDate(2034, 2, 19), QDate(2099, 1, 21)}) {
            const LunarDay day(date);
            QCOMPARE(day.monthDay + day.year, "正月初一" + cycle((date.year() - 4) % 60, "年"));
        }
    }

    void everyDayFollowsTheDayBefore()
    {
        const QStringList months = words("正 二 三 四 五 六 七 八 九 十 十一 腊");
        const QStringList days =
            words("初一 初二 初三 初四 初五 初六 初七 初八 初九 初十 十一 十二 十三 十四 十五 十六 "
                  "十七 十八 十九 二十 廿一 廿二 廿三 廿四 廿五 廿六 廿七 廿八 廿九 三十");
        const QMap<QString, QString> festivals = {
            {"正月初一", "春节"},   {"正月十五", "元宵节"}, {"三月初三", "上巳节"}, {"五月初五", "端午节"},
            {"七月初七", "七夕节"}, {"七月十五", "中元节"}, {"八月十五", "中秋节"}, {"九月初九", "重阳节"},
            {"十月初一", "寒衣节"}, {"十月十五", "下元节"}, {"腊月初八", "腊八节"}, {"腊月廿三", "祭灶节"}};
        // The first day is the 11th of the eleventh month; the places in the cycle are those of the day before.
        int month = 10, day = 9, leapMonths = 0, yearPlace = 36, monthPlace = 24, dayPlace = 14;
        bool leap = false;
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
            const bool newYear = found.monthDay == "正月初一";
            leapMonths = newYear ? 0 : leapMonths + (nowDay == 0 && nowLeap);
            QVERIFY2(leapMonths <= 1, where);
            QVERIFY2(!newYear || (date >= QDate(date.year(), 1, 21) && date <= QDate(date.year(), 2, 21)), where);

            // The month in stems and branches begins on the first solar term of the Gregorian month.
            unsigned int first = 0;
            unsigned int second = 0;
            QVERIFY2(GetSolarTerms(date, first, second), where);
            yearPlace = (yearPlace + newYear) % 60;
            monthPlace = (monthPlace + (date.day() == int(first))) % 60;
            dayPlace = (dayPlace + 1) % 60;
            QCOMPARE(found.year + found.month + found.day,
                     cycle(yearPlace, "年") + cycle(monthPlace, "月") + cycle(dayPlace, "日"));

            const bool eve = LunarDay(date.addDays(1)).monthDay == "正月初一";
            const bool coldFood = date.month() == 4 && date.day() == int(first) - 1;
            QCOMPARE(found.festival,
                     QString(eve ? "除夕" : "") + (coldFood ? "寒食节" : "") + festivals.value(found.monthDay));
            month = nowMonth;
            day = nowDay;
            leap = nowLeap;
        }
    }

    void solarTermsRunThroughTheYears()
    {
        const QStringList names = words("小寒 大寒 立春 雨水 惊蛰 春分 清明 谷雨 立夏 小满 芒种 夏至 "
                                        "小暑 大暑 立秋 处暑 白露 秋分 寒露 霜降 立冬 小雪 大雪 冬至");
        QDate previous(1900, 12, 22);
        int terms = 0;
        for (QDate date(1901, 1, 1); date <= QDate(2099, 12, 31); date = date.addDays(1)) {
            const QString term = LunarDay(date).solarTerm;
            if (term.isEmpty())
                continue;
            QCOMPARE(term, names.at(terms++ % names.size()));
            // A term lasts 15 degrees of the sun's yearly path.
            QVERIFY2(qAbs(previous.daysTo(date) - 15) <= 1, qPrintable(date.toString(Qt::ISODate)));
            previous = date;
        }
        QCOMPARE(terms, 199 * 24);
    }

    void refusesOutsideTheRange()
    {
        const QList<QPair<QDate, bool>> cases = {
            {QDate(1900, 12, 31), false}, {QDate(1901, 1, 1), true},    {QDate(2099, 12, 31), true},
            {QDate(2100, 1, 1), false},   {QDate(2023, 2, 29), false},  {QDate(), false},
            {QDate(-1, 1, 1), false},     {QDate(999999, 1, 1), false},
        };
        for (const auto& [date, accepted] : cases) {
            std::array<QString, 6> texts;
            texts.fill("kept");
            QCOMPARE(GetLunarDay(date, texts[0], texts[1], texts[2], texts[3], texts[4], texts[5]), accepted);
            for (const QString& text : texts)
                QCOMPARE(text == "kept", !accepted);
            unsigned int first = 77;
            unsigned int second = 88;
            QCOMPARE(GetSolarTerms(date, first, second), accepted);
            QCOMPARE(first == 77 && second == 88, !accepted);
        }
    }
};

QTEST_APPLESS_MAIN(TestLunar)
#include "test_lunar.moc"
