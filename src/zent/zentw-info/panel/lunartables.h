// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <QStringView>

#include <array>

/// The constant data of the lunisolar calendar. Everything is initialised at compile time, so that the tables cost
/// nothing at start-up and are usable from any other static initialiser.
namespace lunartables
{

inline constexpr int kFirstYear = 1901;
inline constexpr int kLastYear = 2099;
inline constexpr int kFirstSolarTermYear = 1900;

/// One word per lunar year, indexed by year - kFirstYear.
///   bits 0-4    day, and
///   bits 5-6    month of the Gregorian date of the lunar new year
///   bits 7-19   month lengths in the year's order, first month at bit 19: set is 30 days, clear 29
///               a leap month follows the regular month of the same number
///   bits 20-23  number of the leap month, 0 when the year has none
extern const std::array<quint32, 199> kLunarYears;

/// The lunar year before the table: it holds the Gregorian dates from 1901-01-01 to the lunar new year of 1901.
inline constexpr quint32 kLunarYear1900 = 0x84B6BF;

/// One Gregorian year's solar terms: six groups of five hexadecimal digits, one per pair of months. A group's value
/// written in decimal has six digits, three per month: one for the day of its first term, two for that of its second.
struct SolarTermRow {
    char digits[31];
};

/// Indexed by year - kFirstSolarTermYear.
extern const std::array<SolarTermRow, 201> kSolarTerms;

using Text = QStringView;

/// Two names per Gregorian month, starting with January.
inline constexpr std::array<Text, 24> kSolarTermNames = {
    u"小寒", u"大寒", u"立春", u"雨水", u"惊蛰", u"春分", u"清明", u"谷雨", u"立夏", u"小满", u"芒种", u"夏至",
    u"小暑", u"大暑", u"立秋", u"处暑", u"白露", u"秋分", u"寒露", u"霜降", u"立冬", u"小雪", u"大雪", u"冬至"};

inline constexpr std::array<Text, 10> kHeavenlyStems = {u"甲", u"乙", u"丙", u"丁", u"戊",
                                                        u"己", u"庚", u"辛", u"壬", u"癸"};

inline constexpr std::array<Text, 12> kEarthlyBranches = {u"子", u"丑", u"寅", u"卯", u"辰", u"巳",
                                                          u"午", u"未", u"申", u"酉", u"戌", u"亥"};

/// The animals of the earthly branches, in their order.
inline constexpr std::array<Text, 12> kZodiacAnimals = {u"鼠", u"牛", u"虎", u"兔", u"龙", u"蛇",
                                                        u"马", u"羊", u"猴", u"鸡", u"狗", u"猪"};

/// Indexed by month number; entry 0 is a placeholder.
inline constexpr std::array<Text, 13> kMonthNames = {u"*",  u"正", u"二", u"三", u"四",   u"五", u"六",
                                                     u"七", u"八", u"九", u"十", u"十一", u"腊"};

/// Indexed by day number; entry 0 is a placeholder.
inline constexpr std::array<Text, 31> kDayNames = {
    u"*",    u"初一", u"初二", u"初三", u"初四", u"初五", u"初六", u"初七", u"初八", u"初九", u"初十",
    u"十一", u"十二", u"十三", u"十四", u"十五", u"十六", u"十七", u"十八", u"十九", u"二十", u"廿一",
    u"廿二", u"廿三", u"廿四", u"廿五", u"廿六", u"廿七", u"廿八", u"廿九", u"三十"};

/// A festival and the lunar date it falls on, never in a leap month.
struct LunarFestival {
    int month;
    int day;
    Text name;
};

inline constexpr std::array<LunarFestival, 12> kLunarFestivals = {{{1, 1, u"春节"},
                                                                   {1, 15, u"元宵节"},
                                                                   {3, 3, u"上巳节"},
                                                                   {5, 5, u"端午节"},
                                                                   {7, 7, u"七夕节"},
                                                                   {7, 15, u"中元节"},
                                                                   {8, 15, u"中秋节"},
                                                                   {9, 9, u"重阳节"},
                                                                   {10, 1, u"寒衣节"},
                                                                   {10, 15, u"下元节"},
                                                                   {12, 8, u"腊八节"},
                                                                   {12, 23, u"祭灶节"}}};

} // namespace lunartables
