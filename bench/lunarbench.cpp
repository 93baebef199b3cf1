// SPDX-License-Identifier: Apache-2.0
// The lunar date of every supported day, by the client and by ICU's Chinese calendar. Prints one line of nanoseconds a
// day: client, ICU.

#include "lunarcalendar.h"

#include <QDate>
#include <QTextStream>
#include <QVector>

#include <unicode/calendar.h>
#include <unicode/locid.h>

#include <chrono>
#include <cstdio>
#include <memory>

namespace
{

const QDate kFirst(1901, 1, 1);
const QDate kLast(2099, 12, 31);

template <typename Work>
double nanosecondsADay(Work work)
{
    const auto start = std::chrono::steady_clock::now();
    for (QDate day = kFirst; day <= kLast; day = day.addDays(1))
        work(day);
    const std::chrono::duration<double, std::nano> spent = std::chrono::steady_clock::now() - start;
    return spent.count() / static_cast<double>(kFirst.daysTo(kLast) + 1);
}

qint64 lengthOfClientTexts(const QDate& day)
{
    QString monthDay;
    QString year;
    QString month;
    QString dayName;
    QString term;
    QString festival;
    GetLunarDay(day, monthDay, year, month, dayName, term, festival);
    return monthDay.size() + year.size() + month.size() + dayName.size() + term.size() + festival.size();
}

} // namespace

int main()
{
    UErrorCode error = U_ZERO_ERROR;
    const std::unique_ptr<icu::Calendar> calendar(
        icu::Calendar::createInstance(icu::Locale("zh_CN@calendar=chinese"), error));
    if (U_FAILURE(error)) {
        std::fprintf(stderr, "ICU has no Chinese calendar: %s\n", u_errorName(error));
        return 1;
    }
    // What is computed must be used, or the compiler may leave it out.
    qint64 sum = 0;
    const double client = nanosecondsADay([&](const QDate& day) { sum += lengthOfClientTexts(day); });
    const QDate epoch(1970, 1, 1);
    const double icu = nanosecondsADay([&](const QDate& day) {
        // Noon in China, whatever the zone of the machine.
        constexpr double kDayMs = 86400000.0;
        calendar->setTime((static_cast<double>(epoch.daysTo(day)) + 4.0 / 24.0) * kDayMs, error);
        sum += calendar->get(UCAL_EXTENDED_YEAR, error) + calendar->get(UCAL_MONTH, error) +
               calendar->get(UCAL_DATE, error) + calendar->get(UCAL_IS_LEAP_MONTH, error);
    });
    if (U_FAILURE(error) || sum == 0)
        return 1;
    QTextStream(stdout) << client << ' ' << icu << '\n';
    return 0;
}
