#include "lunarcalendar.h"

#include <QtTest>

#include <array>
#include <optional>

namespace
{

struct LunarDay {
    QString monthDay;
    QString year;
    QString month;
    QString day;
    QString solarTerm;
    QString festival;
};

std::optional<LunarDay> lunarDay(const QDate& date)
{
    LunarDay result;
    if (!GetLunarDay(date, result.monthDay, result.year, result.month, result.day, result.solarTerm, result.festival))
        return std::nullopt;
    return result;
}

/// The number of a day name, reckoned from its characters; 0 when it is none.
int dayNumber(const QString& name)
{
    const QString digits = QStringLiteral("一二三四五六七八九十");
    const int unit = digits.indexOf(name.right(1)) + 1;
    if (name.size() != 2 || unit == 0)
        return 0;
    if (name == QStringLiteral("二十") || name == QStringLiteral("三十"))
        return name.startsWith(QStringLiteral("二")) ? 20 : 30;
    const int tens = QStringLiteral("初十廿").indexOf(name.left(1));
    return tens < 0 || (tens > 0 && unit == 10) ? 0 : tens * 10 + unit;
}

struct MonthDay {
    int month = 0;
    bool leap = false;
    int day = 0;
};

MonthDay parseMonthDay(const QString& text)
{
    static const QStringList months{QStringLiteral("正"), QStringLiteral("二"),   QStringLiteral("三"),
                                    QStringLiteral("四"), QStringLiteral("五"),   QStringLiteral("六"),
                                    QStringLiteral("七"), QStringLiteral("八"),   QStringLiteral("九"),
                                    QStringLiteral("十"), QStringLiteral("十一"), QStringLiteral("腊")};
    const int split = text.indexOf(QStringLiteral("月"));
    const bool leap = text.startsWith(QStringLiteral("闰"));
    const QString month = text.mid(leap ? 1 : 0, split - (leap ? 1 : 0));
    return {months.indexOf(month) + 1, leap, dayNumber(text.mid(split + 1))};
}

/// The place of a stem-and-branch text in the cycle of sixty, or -1.
int cyclePlace(const QString& text)
{
    const int stem = QStringLiteral("甲乙丙丁戊己庚辛壬癸").indexOf(text.left(1));
    const int branch = QStringLiteral("子丑寅卯辰巳午未申酉戌亥").indexOf(text.mid(1, 1));
    for (int place = 0; place < 60; ++place) {
        if (place % 10 == stem && place % 12 == branch)
            return place;
    }
    return -1;
}

/// What the walk over all days remembers of the day before.
struct Walk {
    MonthDay lunar;
    int yearPlace = -1;
    int monthPlace = -1;
    int dayPlace = -1;
    int monthsInYear = 0;
    int leapMonthsInYear = 0;
};

/// Whether `now` may be the first month after `before`.
bool followsMonth(const MonthDay& before, const MonthDay& now)
{
    if (now.leap)
        return !before.leap && now.month == before.month;
    return now.month == before.month % 12 + 1;
}

/// Checks the day against the one before it.
void checkStep(const QDate& date, const LunarDay& texts, const Walk& before, Walk& now)
{
    const QByteArray where = date.toString(Qt::ISODate).toUtf8();
    const bool newMonth = now.lunar.day == 1;
    const bool newYear = newMonth && now.lunar.month == 1 && !now.lunar.leap;
    if (newMonth) {
        QVERIFY2(before.lunar.day == 29 || before.lunar.day == 30, where);
        QVERIFY2(followsMonth(before.lunar, now.lunar), where);
    } else {
        QVERIFY2(now.lunar.day == before.lunar.day + 1, where);
        QVERIFY2(now.lunar.month == before.lunar.month && now.lunar.leap == before.lunar.leap, where);
    }
    if (newYear) {
        // The new year's eve is the day before, whatever the length of the last month.
        const std::optional<LunarDay> eve = lunarDay(date.addDays(-1));
        QVERIFY2(eve && eve->festival == QStringLiteral("除夕"), where);
        QVERIFY2(date >= QDate(date.year(), 1, 21) && date <= QDate(date.year(), 2, 21), where);
        if (before.monthsInYear > 0)
            QVERIFY2(before.monthsInYear == 12 + before.leapMonthsInYear && before.leapMonthsInYear <= 1, where);
    }
    QVERIFY2((texts.festival == QStringLiteral("春节")) == newYear, where);

    now.monthsInYear = newYear ? 1 : before.monthsInYear + (newMonth && before.monthsInYear > 0 ? 1 : 0);
    now.leapMonthsInYear = newYear ? 0 : before.leapMonthsInYear + (newMonth && now.lunar.leap ? 1 : 0);
    QCOMPARE(now.dayPlace, (before.dayPlace + 1) % 60);
    QCOMPARE(now.yearPlace, (before.yearPlace + (newYear ? 1 : 0)) % 60);
    // The month in stems and branches begins on the first solar term of the Gregorian month.
    unsigned int first = 0;
    unsigned int second = 0;
    QVERIFY2(GetSolarTerms(date, first, second), where);
    QCOMPARE(now.monthPlace, (before.monthPlace + (date.day() == static_cast<int>(first) ? 1 : 0)) % 60);
}

} // namespace

class TestLunar : public QObject
{
    Q_OBJECT

private slots:
    void describesKnownDays_data();
    void describesKnownDays();
    void findsSolarTerms_data();
    void findsSolarTerms();
    void newYearFallsOnPublishedDays_data();
    void newYearFallsOnPublishedDays();
    void everyDayFollowsTheDayBefore();
    void termNamesRunThroughTheYear();
    void refusesOutsideTheRange_data();
    void refusesOutsideTheRange();
};

void TestLunar::describesKnownDays_data()
{
    QTest::addColumn<QDate>("date");
    QTest::addColumn<QString>("monthDay");
    QTest::addColumn<QString>("ganZhi");
    QTest::addColumn<QString>("solarTerm");
    QTest::addColumn<QString>("festival");
    const auto row = [](const char* iso, const char* monthDay, const char* ganZhi, const char* term,
                        const char* festival) {
        QTest::newRow(iso) << QDate::fromString(QString::fromUtf8(iso), Qt::ISODate) << QString::fromUtf8(monthDay)
                           << QString::fromUtf8(ganZhi) << QString::fromUtf8(term) << QString::fromUtf8(festival);
    };
    // The lunar year 1900, which has a leap eighth month, and its end.
    row("1901-01-01", "十一月十一", "庚子年 戊子月 己卯日", "", "");
    row("1901-01-20", "腊月初一", "庚子年 己丑月 戊戌日", "", "");
    row("1901-02-18", "腊月三十", "庚子年 庚寅月 丁卯日", "", "除夕");
    row("1901-02-19", "正月初一", "辛丑年 庚寅月 戊辰日", "雨水", "春节");
    row("1949-10-01", "八月初十", "己丑年 癸酉月 甲子日", "", "");
    row("2000-01-01", "十一月廿五", "己卯年 丙子月 戊午日", "", "");
    row("2020-01-25", "正月初一", "庚子年 丁丑月 丁卯日", "", "春节");
    row("2099-12-31", "十一月二十", "己未年 丙子月 壬寅日", "", "");
    // Leap months: the regular month before, the leap copy, no festival in the copy, the month after.
    row("2020-05-22", "四月三十", "庚子年 辛巳月 乙丑日", "", "");
    row("2020-05-23", "闰四月初一", "庚子年 辛巳月 丙寅日", "", "");
    row("2020-06-20", "闰四月廿九", "庚子年 壬午月 甲午日", "", "");
    row("2020-06-21", "五月初一", "庚子年 壬午月 乙未日", "夏至", "");
    row("2006-08-31", "闰七月初八", "丙戌年 丙申月 壬辰日", "", "");
    row("2006-08-30", "闰七月初七", "丙戌年 丙申月 辛卯日", "", "");
    // The leap month that reaches into the next Gregorian year.
    row("2033-12-21", "十一月三十", "癸丑年 甲子月 丙午日", "冬至", "");
    row("2033-12-22", "闰十一月初一", "癸丑年 甲子月 丁未日", "", "");
    row("2034-01-01", "闰十一月十一", "癸丑年 甲子月 丁巳日", "", "");
    row("2034-01-19", "闰十一月廿九", "癸丑年 乙丑月 乙亥日", "", "");
    row("2034-01-20", "腊月初一", "癸丑年 乙丑月 丙子日", "大寒", "");
    // New Year's Eve in a short last month, and the 29th day of a long one.
    row("2022-01-31", "腊月廿九", "辛丑年 辛丑月 甲申日", "", "除夕");
    row("2024-02-08", "腊月廿九", "癸卯年 丙寅月 壬寅日", "", "");
    row("2024-02-09", "腊月三十", "癸卯年 丙寅月 癸卯日", "", "除夕");
    // Cold Food day is the day before Qingming; it may meet a lunar festival, which then follows without a separator.
    row("2020-04-03", "三月十一", "庚子年 己卯月 丙子日", "", "寒食节");
    row("2020-04-04", "三月十二", "庚子年 庚辰月 丁丑日", "清明", "");
    row("1995-04-04", "三月初五", "乙亥年 己卯月 乙丑日", "", "寒食节");
    row("1919-04-05", "三月初五", "己未年 丁卯月 丁亥日", "", "寒食节");
    row("2003-04-04", "三月初三", "癸未年 乙卯月 丁未日", "", "寒食节上巳节");
    // A day with a solar term only, and the remaining festivals.
    row("2021-02-03", "腊月廿二", "庚子年 庚寅月 壬午日", "立春", "");
    row("2021-02-04", "腊月廿三", "庚子年 庚寅月 癸未日", "", "祭灶节");
    row("2021-02-26", "正月十五", "辛丑年 庚寅月 乙巳日", "", "元宵节");
    row("2021-06-14", "五月初五", "辛丑年 甲午月 癸巳日", "", "端午节");
    row("2021-08-14", "七月初七", "辛丑年 丙申月 甲午日", "", "七夕节");
    row("2021-08-22", "七月十五", "辛丑年 丙申月 壬寅日", "", "中元节");
    row("2021-09-21", "八月十五", "辛丑年 丁酉月 壬申日", "", "中秋节");
    row("2021-10-14", "九月初九", "辛丑年 戊戌月 乙未日", "", "重阳节");
    row("2021-11-05", "十月初一", "辛丑年 戊戌月 丁巳日", "", "寒衣节");
    row("2021-11-19", "十月十五", "辛丑年 己亥月 辛未日", "", "下元节");
    row("2022-01-10", "腊月初八", "辛丑年 辛丑月 癸亥日", "", "腊八节");
}

void TestLunar::describesKnownDays()
{
    QFETCH(QDate, date);
    QFETCH(QString, monthDay);
    QFETCH(QString, ganZhi);
    QFETCH(QString, solarTerm);
    QFETCH(QString, festival);
    const std::optional<LunarDay> day = lunarDay(date);
    QVERIFY(day);
    QCOMPARE(day->monthDay, monthDay);
    QCOMPARE(QStringList({day->year, day->month, day->day}).join(QLatin1Char(' ')), ganZhi);
    QCOMPARE(day->solarTerm, solarTerm);
    QCOMPARE(day->festival, festival);
}

void TestLunar::findsSolarTerms_data()
{
    QTest::addColumn<int>("year");
    QTest::addColumn<QString>("days");
    QTest::newRow("1901") << 1901 << QStringLiteral("6,21 4,19 6,21 5,21 6,22 6,22 8,23 8,24 8,24 9,24 8,23 8,22");
    QTest::newRow("2020") << 2020 << QStringLiteral("6,20 4,19 5,20 4,19 5,20 5,21 6,22 7,22 7,22 8,23 7,22 7,21");
    QTest::newRow("2099") << 2099 << QStringLiteral("5,20 3,18 5,20 4,20 5,21 5,21 7,22 7,23 7,23 8,23 7,22 7,21");
}

void TestLunar::findsSolarTerms()
{
    QFETCH(int, year);
    QFETCH(QString, days);
    QStringList found;
    for (int month = 1; month <= 12; ++month) {
        unsigned int first = 0;
        unsigned int second = 0;
        QVERIFY(GetSolarTerms(QDate(year, month, QDate(year, month, 1).daysInMonth()), first, second));
        found += QStringLiteral("%1,%2").arg(first).arg(second);
    }
    QCOMPARE(found.join(QLatin1Char(' ')), days);
}

void TestLunar::newYearFallsOnPublishedDays_data()
{
    QTest::addColumn<QDate>("newYear");
    for (const QDate& date : {QDate(1903, 1, 29), QDate(1920, 2, 20), QDate(1944, 1, 25), QDate(1954, 2, 3),
                              QDate(1966, 1, 21), QDate(1985, 2, 20), QDate(1997, 2, 7), QDate(2008, 2, 7),
                              QDate(2024, 2, 10), QDate(2033, 1, 31), QDate(2034, 2, 19), QDate(2099, 1, 21)})
        QTest::newRow(qPrintable(date.toString(Qt::ISODate))) << date;
}

void TestLunar::newYearFallsOnPublishedDays()
{
    QFETCH(QDate, newYear);
    const std::optional<LunarDay> day = lunarDay(newYear);
    QVERIFY(day);
    QCOMPARE(day->monthDay, QStringLiteral("正月初一"));
    QCOMPARE(cyclePlace(day->year), (newYear.year() - 4) % 60);
}

void TestLunar::everyDayFollowsTheDayBefore()
{
    Walk before;
    int newYears = 0;
    for (QDate date(1901, 1, 1); date <= QDate(2099, 12, 31); date = date.addDays(1)) {
        const std::optional<LunarDay> texts = lunarDay(date);
        QVERIFY(texts);
        Walk now;
        now.lunar = parseMonthDay(texts->monthDay);
        now.yearPlace = cyclePlace(texts->year);
        now.monthPlace = cyclePlace(texts->month);
        now.dayPlace = cyclePlace(texts->day);
        QVERIFY2(now.lunar.month > 0 && now.lunar.day > 0, qPrintable(texts->monthDay));
        QVERIFY(now.yearPlace >= 0 && now.monthPlace >= 0 && now.dayPlace >= 0);
        if (before.dayPlace >= 0) {
            checkStep(date, *texts, before, now);
            if (QTest::currentTestFailed())
                return;
        }
        newYears += texts->festival == QStringLiteral("春节") ? 1 : 0;
        before = now;
    }
    QCOMPARE(newYears, 199);
}

void TestLunar::termNamesRunThroughTheYear()
{
    const QStringList names = QStringLiteral("小寒 大寒 立春 雨水 惊蛰 春分 清明 谷雨 立夏 小满 芒种 夏至 小暑 大暑 "
                                             "立秋 处暑 白露 秋分 寒露 霜降 立冬 小雪 大雪 冬至")
                                  .split(QLatin1Char(' '));
    QDate previous;
    int terms = 0;
    for (QDate date(1901, 1, 1); date <= QDate(2099, 12, 31); date = date.addDays(1)) {
        const std::optional<LunarDay> day = lunarDay(date);
        QVERIFY(day);
        if (day->solarTerm.isEmpty())
            continue;
        QCOMPARE(day->solarTerm, names.at(terms++ % names.size()));
        // A term lasts 15 degrees of the sun's yearly path.
        if (previous.isValid())
            QVERIFY2(qAbs(previous.daysTo(date) - 15) <= 1, qPrintable(date.toString(Qt::ISODate)));
        previous = date;
    }
    QCOMPARE(terms, 199 * 24);
}

void TestLunar::refusesOutsideTheRange_data()
{
    QTest::addColumn<QDate>("date");
    QTest::addColumn<bool>("accepted");
    QTest::newRow("day before the first") << QDate(1900, 12, 31) << false;
    QTest::newRow("first day") << QDate(1901, 1, 1) << true;
    QTest::newRow("last day") << QDate(2099, 12, 31) << true;
    QTest::newRow("day after the last") << QDate(2100, 1, 1) << false;
    QTest::newRow("no such day") << QDate(2023, 2, 29) << false;
    QTest::newRow("null") << QDate() << false;
    QTest::newRow("before the common era") << QDate(-1, 1, 1) << false;
    QTest::newRow("far future") << QDate(999999, 1, 1) << false;
}

void TestLunar::refusesOutsideTheRange()
{
    QFETCH(QDate, date);
    QFETCH(bool, accepted);
    const QString kept = QStringLiteral("kept");
    std::array<QString, 6> texts;
    texts.fill(kept);
    QCOMPARE(GetLunarDay(date, texts[0], texts[1], texts[2], texts[3], texts[4], texts[5]), accepted);
    for (const QString& text : texts)
        QCOMPARE(text == kept, !accepted);

    unsigned int first = 77;
    unsigned int second = 88;
    QCOMPARE(GetSolarTerms(date, first, second), accepted);
    QCOMPARE(first == 77 && second == 88, !accepted);
}

QTEST_APPLESS_MAIN(TestLunar)
#include "test_lunar.moc"
