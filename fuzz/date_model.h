// Dates checked against day numbers, for the fuzz target and the unit test.
// For valid dates, stepping, addDay, differences, day of year and comparisons
// agree with the number of days since 1 January of year 1; any date, valid or
// not, is reported when invalid, agrees with the model where the model
// reaches, may be stepped and formatted without harm, and addDay on it gives
// what single steps give.
#pragma once

#include <dwxcore/dwxdate.h>
#include <services/utilhub.h>

#include "fuzz_input.h"

#include <limits.h>
#include <stdio.h>
#include <string.h>

#include <algorithm>

namespace date_model {

inline bool Leap(int64_t year) {
    return year % 4 == 0 && (year % 100 != 0 || year % 400 == 0);
}

inline bool IsMonth(int month) {
    return month >= 1 && month <= 12;
}

inline int DaysIn(int month, int64_t year) {
    static const int days[] = {0, 31, 28, 31, 30, 31, 30, 31, 31, 30, 31, 30, 31};
    return month < 0 || month > 12 ? 0 : days[month] + (month == 2 && Leap(year));
}

inline bool Valid(int month, int day, int year) {
    return IsMonth(month) && year >= 1 && day >= 1 && day <= DaysIn(month, year);
}

inline int64_t FloorDiv(int64_t a, int64_t b) {
    return a / b - ((a % b != 0) && ((a < 0) != (b < 0)));
}

// Days since 1 January of year 1 (day 0) by the proleptic Gregorian rules, for
// months 1 to 12 and any day and year; a day outside its month counts on.
inline int64_t DayNumber(int month, int64_t day, int64_t year) {
    static const int before[] = {0, 0, 31, 59, 90, 120, 151, 181, 212, 243, 273, 304, 334};
    const int64_t y = year - 1;
    return y * 365 + FloorDiv(y, 4) - FloorDiv(y, 100) + FloorDiv(y, 400) + before[month] + day -
           1 + (month > 2 && Leap(year));
}

inline int64_t Number(const DWXDate& d) {
    return DayNumber(d.GetMonth(), d.GetDay(), d.GetYear());
}

inline int Saturate(int64_t value) {
    return static_cast<int>(std::clamp<int64_t>(value, INT_MIN, INT_MAX));
}

const int64_t kLast = DayNumber(12, 31, INT_MAX);

inline int& Reports() {
    static int count;
    return count;
}

inline void CountReport(int code, int severity, const char*) {
    FUZZ_CHECK(code == 100 && severity == 0);
    ++Reports();
}

// Counts the reports while in scope.
struct CountingReports {
    IMPErrorHandler previous = IMPSetErrorHandler(&CountReport);
    ~CountingReports() { IMPSetErrorHandler(previous); }
};

inline void CheckText(const DWXDate& d) {
    static const char* const kMonths[] = {"zero",    "January",  "February", "March",  "April",
                                          "May",     "June",     "July",     "August", "September",
                                          "October", "November", "December"};
    char expected[64];
    const int m = d.GetMonth();
    snprintf(expected, sizeof expected, "%s %d, %d", m >= 0 && m <= 12 ? kMonths[m] : "invalid",
             d.GetDay(), d.GetYear());
    char buffer[35];
    FUZZ_CHECK(d.GetString(buffer) == buffer && strcmp(buffer, expected) == 0);
    const std::string shared = d.GetString();  // cut to 23 characters
    FUZZ_CHECK(shared == std::string(expected).substr(0, 23));
}

// Two valid dates and a jump from the first.
inline void CheckValid(const DWXDate& a, const DWXDate& b, int days) {
    const int64_t na = Number(a), nb = Number(b);
    FUZZ_CHECK(a.GetDifference(b) == Saturate(na - nb));
    FUZZ_CHECK((a < b) == (na < nb) && (a <= b) == (na <= nb) && (a == b) == (na == nb));
    FUZZ_CHECK((a > b) == (na > nb) && (a >= b) == (na >= nb) && (a != b) == (na != nb));
    FUZZ_CHECK(a.GetDayOfYear() == na - DayNumber(1, 1, a.GetYear()) + 1);
    FUZZ_CHECK(DWXDate::LeapYear(a.GetYear()) == Leap(a.GetYear()));
    CheckText(a);

    DWXDate fromDay(1, 1, a.GetYear()), moved(a), next(a), previous(a);
    fromDay.SetDayOfYear(a.GetDayOfYear());
    FUZZ_CHECK(fromDay == a);
    moved.addDay(days);
    FUZZ_CHECK(Valid(moved.GetMonth(), moved.GetDay(), moved.GetYear()));
    FUZZ_CHECK(Number(moved) == std::clamp<int64_t>(na + days, 0, kLast));
    FUZZ_CHECK(Number(++next) == std::min(na + 1, kLast));
    FUZZ_CHECK(Number(--previous) == std::max<int64_t>(na - 1, 0));
}

// A valid date, with years drawn mostly near the present and sometimes up to
// the last representable year.
inline DWXDate ValidDate(FuzzInput& input) {
    const int year = input.Flag() ? input.Range(1, 3000) : input.Range(1, INT_MAX);
    const int month = input.Range(1, 12);
    const int day = input.Range(1, DaysIn(month, year));
    Reports() = 0;
    DWXDate date(month, day, year);
    FUZZ_CHECK(Reports() == 0);
    return date;
}

// Any three numbers, mostly near the edges of their ranges.
inline DWXDate AnyDate(FuzzInput& input) {
    const int month = input.Flag() ? input.Range(-1, 14) : input.Int();
    const int day = input.Flag() ? input.Range(-1, 33) : input.Int();
    const int year = input.Flag() ? input.Range(-2, 2) : input.Int();
    Reports() = 0;
    DWXDate d(month, day, year);
    FUZZ_CHECK((Reports() == 0) == Valid(month, day, year));
    FUZZ_CHECK(d.GetMonth() == month && d.GetDay() == day && d.GetYear() == year);
    return d;
}

inline void CheckAny(FuzzInput& input) {
    const DWXDate d = AnyDate(input), other = AnyDate(input);
    const int m = d.GetMonth(), day = d.GetDay(), y = d.GetYear();
    const bool months = IsMonth(m) && IsMonth(other.GetMonth());
    FUZZ_CHECK(d.GetDifference(other) == (months ? Saturate(Number(d) - Number(other)) : 0));
    FUZZ_CHECK(DWXDate::GetDaysInMonth(m, y) == DaysIn(m, y));
    FUZZ_CHECK(DWXDate::LeapYear(y) == Leap(y));
    FUZZ_CHECK(d.GetDayOfYear() == (IsMonth(m) ? Saturate(Number(d) - DayNumber(1, 1, y) + 1) : 0));
    CheckText(d);

    // A day of the year past either end lands in January or December.
    const int dayOfYear = input.Flag() ? input.Range(-1, 370) : input.Int();
    int month = 12;
    while (month > 1 && dayOfYear <= DayNumber(month, 1, y) - DayNumber(1, 1, y)) {
        --month;
    }
    const int inMonth = static_cast<int>(dayOfYear - (DayNumber(month, 1, y) - DayNumber(1, 1, y)));
    DWXDate set(d);
    Reports() = 0;
    set.SetDayOfYear(dayOfYear);
    FUZZ_CHECK(set.GetMonth() == month && set.GetDay() == inMonth && set.GetYear() == y);
    FUZZ_CHECK(Reports() == (inMonth < 1 || inMonth > DaysIn(month, y)));

    const int days = input.Range(-1000, 1000);
    DWXDate stepped(d), moved(d);
    for (int i = 0; i < days; ++i) {
        ++stepped;
    }
    for (int i = 0; i > days; --i) {
        --stepped;
    }
    moved.addDay(days);
    FUZZ_CHECK(stepped == moved);
    moved.addDay(input.Int());
    moved.SetDay(day);
    CheckText(moved);
    (void)moved.GetDifference(d);
}

inline void Run(FuzzInput& input) {
    while (!input.Empty()) {
        if (input.Flag()) {
            const DWXDate a = ValidDate(input), b = ValidDate(input);
            CheckValid(a, b, input.Flag() ? input.Range(-1000, 1000) : input.Int());
        } else {
            CheckAny(input);
        }
    }
}

}  // namespace date_model
