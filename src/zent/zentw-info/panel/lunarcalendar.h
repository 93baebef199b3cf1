// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <QDate>
#include <QString>

// The Chinese lunisolar calendar for Gregorian dates from 1901-01-01 to 2099-12-31. Both functions are stateless and
// may be called from any thread.

/// Finds the days on which the two solar terms of the date's Gregorian month fall.
/// @param date any day of the month asked about
/// @param firstTermDay receives the day of the month (1-31) of the month's first term, e.g. Qingming in April
/// @param secondTermDay receives the day of the month (1-31) of the month's second term
/// @return false, with both outputs untouched, when the date is invalid or outside the supported range
bool GetSolarTerms(const QDate& date, unsigned int& firstTermDay, unsigned int& secondTermDay);

/// Describes a date in the lunisolar calendar.
/// @param date the Gregorian date
/// @param lunarMonthDay receives the lunar month and day, a leap month marked by 闰: "正月初一", "闰四月初八"
/// @param yearGanZhi receives the lunar year in stems and branches: "辛丑年"
/// @param monthGanZhi receives the month in stems and branches: "庚寅月"; it begins on the month's first solar term
/// @param dayGanZhi receives the day in stems and branches: "甲子日"
/// @param solarTerm receives the solar term that falls on this day, else an empty text
/// @param festival receives the day's traditional festivals one after another, else an empty text
/// @return false, with all outputs untouched, when the date is invalid or outside the supported range
bool GetLunarDay(const QDate& date, QString& lunarMonthDay, QString& yearGanZhi, QString& monthGanZhi,
                 QString& dayGanZhi, QString& solarTerm, QString& festival);
