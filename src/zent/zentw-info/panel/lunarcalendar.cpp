// SPDX-License-Identifier: Apache-2.0
#include "panel/lunarcalendar.h"

#include "panel/lunartables.h"

#include <QStringBuilder>

#include <charconv>

namespace
{

using namespace lunartables;

struct LunarDate {
    int year;
    int month;
    bool leap;
    int day;
    int monthLength;
};

/// The tables cover whole years, so the year alone decides.
bool isSupported(const QDate& date)
{
    return date.isValid() && date.year() >= kFirstYear && date.year() <= kLastYear;
}

quint32 lunarYearWord(int year)
{
    return year < kFirstYear ? kLunarYear1900 : kLunarYears[year - kFirstYear];
}

QDate lunarNewYear(int year)
{
    const quint32 word = lunarYearWord(year);
    return {year, static_cast<int>(word >> 5 & 0x3), static_cast<int>(word & 0x1F)};
}

/// @param index the month's place in the year, leap month included, from 0
int monthLength(quint32 word, int index)
{
    return (word >> (19 - index) & 1) != 0 ? 30 : 29;
}

LunarDate toLunar(const QDate& date)
{
    int year = date.year();
    QDate newYear = lunarNewYear(year);
    if (date < newYear) {
        // Counted from the previous new year, not backwards from the next one. Its place in the year then tells a leap
        // month from the regular one of the same number.
        newYear = lunarNewYear(--year);
    }

    const quint32 word = lunarYearWord(year);
    int remaining = static_cast<int>(newYear.daysTo(date));
    int index = 0;
    int length = monthLength(word, index);
    while (remaining >= length) {
        remaining -= length;
        length = monthLength(word, ++index);
    }

    const int leapMonth = static_cast<int>(word >> 20 & 0xF);
    const bool afterRegular = leapMonth != 0 && index >= leapMonth;
    return {year, afterRegular ? index : index + 1, leapMonth != 0 && index == leapMonth, remaining + 1, length};
}

QString ganZhi(int stem, int branch, QStringView unit)
{
    return kHeavenlyStems[stem % 10] % kEarthlyBranches[branch % 12] % unit;
}

QString monthText(const QDate& date, unsigned int firstTermDay)
{
    const bool begun = date.day() >= static_cast<int>(firstTermDay);
    const int months = (date.year() - kFirstYear) * 12 + date.month() - (begun ? 2 : 3);
    return ganZhi(months + 6, months + 2, u"月");
}

QString dayText(const QDate& date)
{
    const int days = static_cast<int>(QDate(1900, 1, 30).daysTo(date));
    return ganZhi(days + 9, days + 3, u"日");
}

QString festivalText(const QDate& date, const LunarDate& lunar, unsigned int firstTermDay)
{
    QString text;
    if (lunar.month == 12 && !lunar.leap && lunar.day == lunar.monthLength)
        text += QStringLiteral("除夕");
    if (date.month() == 4 && date.day() + 1 == static_cast<int>(firstTermDay))
        text += QStringLiteral("寒食节");
    for (const LunarFestival& festival : kLunarFestivals) {
        if (festival.month == lunar.month && festival.day == lunar.day && !lunar.leap)
            text += festival.name;
    }
    return text;
}

} // namespace

bool GetSolarTerms(const QDate& date, unsigned int& firstTermDay, unsigned int& secondTermDay)
{
    if (!isSupported(date))
        return false;

    constexpr int kGroupLength = 5;
    const int month = date.month();
    const char* group =
        kSolarTerms[date.year() - kFirstSolarTermYear].digits + static_cast<ptrdiff_t>((month - 1) / 2 * kGroupLength);
    unsigned int value = 0;
    const auto [end, error] = std::from_chars(group, group + kGroupLength, value, 16);
    if (error != std::errc() || end != group + kGroupLength)
        return false;

    const unsigned int days = month % 2 != 0 ? value / 1000 : value % 1000;
    firstTermDay = days / 100;
    secondTermDay = days % 100;
    return true;
}

bool GetLunarDay(const QDate& date, QString& lunarMonthDay, QString& yearGanZhi, QString& monthGanZhi,
                 QString& dayGanZhi, QString& solarTerm, QString& festival)
{
    unsigned int firstTermDay = 0;
    unsigned int secondTermDay = 0;
    if (!GetSolarTerms(date, firstTermDay, secondTermDay))
        return false;

    const LunarDate lunar = toLunar(date);
    lunarMonthDay =
        QStringView(lunar.leap ? u"闰" : u"") % kMonthNames[lunar.month] % QStringView(u"月") % kDayNames[lunar.day];
    yearGanZhi = ganZhi(lunar.year - 4, lunar.year - 4, u"年");
    monthGanZhi = monthText(date, firstTermDay);
    dayGanZhi = dayText(date);

    solarTerm.clear();
    const int firstTerm = (date.month() - 1) * 2;
    if (date.day() == static_cast<int>(firstTermDay))
        solarTerm += kSolarTermNames[firstTerm];
    if (date.day() == static_cast<int>(secondTermDay))
        solarTerm += kSolarTermNames[firstTerm + 1];
    festival = festivalText(date, lunar, firstTermDay);
    return true;
}
