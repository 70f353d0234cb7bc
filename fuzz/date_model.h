// Dates checked against day numbers, for the fuzz target and the unit test.
// For valid dates, stepping, addDay, differences, day of year and comparisons
// agree with the number of days since 1 January of year 1. Any date, valid or
// not, is reported exactly when invalid, agrees with the model wherever the
// model reaches, formats without harm, and addDay on it gives what single
// steps give.
#pragma once

#include <dwxcore/dwxdate.h>
#include <services/utilhub.h>

#include "fuzz_input.h"

#include <limits.h>
#include <stdio.h>

#include <algorithm>
#include <string>
#include <vector>

struct DateModel {
    static bool Leap(int64_t year) { return year % 4 == 0 && (year % 100 != 0 || year % 400 == 0); }
    static bool IsMonth(int month) { return month >= 1 && month <= 12; }
    static int DaysIn(int month, int64_t year) {
        static const int days[] = {0, 31, 28, 31, 30, 31, 30, 31, 31, 30, 31, 30, 31};
        return month < 0 || month > 12 ? 0 : days[month] + (month == 2 && Leap(year));
    }
    static bool Valid(int month, int day, int year) {
        return IsMonth(month) && year >= 1 && day >= 1 && day <= DaysIn(month, year);
    }
    static int64_t FloorDiv(int64_t a, int64_t b) { return a / b - (a % b < 0); }  // b > 0

    // Days since 1 January of year 1 (day 0) by the proleptic Gregorian
    // rules, for months 1 to 12 and any year; a day outside its month counts on.
    static int64_t DayNumber(int month, int64_t day, int64_t year) {
        static const int before[] = {0, 0, 31, 59, 90, 120, 151, 181, 212, 243, 273, 304, 334};
        const int64_t y = year - 1;
        return y * 365 + FloorDiv(y, 4) - FloorDiv(y, 100) + FloorDiv(y, 400) + before[month] +
               day - 1 + (month > 2 && Leap(year));
    }
    static int64_t Number(const DWXDate& d) {
        return DayNumber(d.GetMonth(), d.GetDay(), d.GetYear());
    }
    static int64_t Last() { return DayNumber(12, 31, INT_MAX); }
    static int Saturate(int64_t n) { return int(std::clamp<int64_t>(n, INT_MIN, INT_MAX)); }

    // The texts reported while a DateModel exists (the fuzz target keeps one).
    static inline std::vector<std::string> reports;
    static void Record(int code, int severity, const char* text) {
        FUZZ_CHECK(code == 100 && severity == 0);
        reports.push_back(text);
    }
    IMPErrorHandler previous = IMPSetErrorHandler(&Record);
    DateModel() { reports.clear(); }
    ~DateModel() { IMPSetErrorHandler(previous); }

    static void CheckText(const DWXDate& d) {
        static const char* const kMonths[] = {
            "zero", "January", "February",  "March",   "April",    "May",     "June",
            "July", "August",  "September", "October", "November", "December"};
        char expected[64], buffer[35];
        const int m = d.GetMonth();
        snprintf(expected, sizeof expected, "%s %d, %d", m >= 0 && m <= 12 ? kMonths[m] : "invalid",
                 d.GetDay(), d.GetYear());
        FUZZ_CHECK(d.GetString(buffer) == buffer && std::string(buffer) == expected);
        FUZZ_CHECK(std::string(expected).substr(0, 23) == d.GetString());  // the shared text
    }

    // Two valid dates, and a jump from the first.
    static void CheckValid(const DWXDate& a, const DWXDate& b, int days) {
        const int64_t na = Number(a), nb = Number(b);
        FUZZ_CHECK(a.GetDifference(b) == Saturate(na - nb));
        FUZZ_CHECK((a < b) == (na < nb) && (a <= b) == (na <= nb) && (a == b) == (na == nb));
        FUZZ_CHECK((a > b) == (na > nb) && (a >= b) == (na >= nb) && (a != b) == (na != nb));
        FUZZ_CHECK(a.GetDayOfYear() == na - DayNumber(1, 1, a.GetYear()) + 1);
        CheckText(a);
        DWXDate fromDay(1, 1, a.GetYear()), moved(a), next(a), previous(a);
        fromDay.SetDayOfYear(a.GetDayOfYear());
        moved.addDay(days);
        FUZZ_CHECK(fromDay == a && Valid(moved.GetMonth(), moved.GetDay(), moved.GetYear()));
        FUZZ_CHECK(Number(moved) == std::clamp<int64_t>(na + days, 0, Last()));
        FUZZ_CHECK(Number(++next) == std::min(na + 1, Last()));
        FUZZ_CHECK(Number(--previous) == std::max<int64_t>(na - 1, 0));
    }

    static DWXDate Made(int month, int day, int year) {
        reports.clear();
        const DWXDate d(month, day, year);
        FUZZ_CHECK(reports.empty() == Valid(month, day, year));
        FUZZ_CHECK(d.GetMonth() == month && d.GetDay() == day && d.GetYear() == year);
        return d;
    }

    // A valid date, the year mostly near the present, sometimes up to the last.
    static DWXDate ValidDate(FuzzInput& input) {
        const int year = input.Flag() ? input.Range(1, 3000) : input.Range(1, INT_MAX);
        const int month = input.Range(1, 12);
        return Made(month, input.Range(1, DaysIn(month, year)), year);
    }

    // Any three numbers, mostly near the edges of their ranges.
    static DWXDate AnyDate(FuzzInput& input) {
        const int month = input.Flag() ? input.Range(-1, 14) : input.Int();
        const int day = input.Flag() ? input.Range(-1, 33) : input.Int();
        return Made(month, day, input.Flag() ? input.Range(-2, 2) : input.Int());
    }

    static void CheckAny(const DWXDate& d, const DWXDate& other, int days, int jump) {
        const int m = d.GetMonth(), y = d.GetYear();
        const bool months = IsMonth(m) && IsMonth(other.GetMonth());
        FUZZ_CHECK(d.GetDifference(other) == (months ? Saturate(Number(d) - Number(other)) : 0));
        FUZZ_CHECK(DWXDate::GetDaysInMonth(m, y) == DaysIn(m, y) &&
                   DWXDate::LeapYear(y) == Leap(y));
        FUZZ_CHECK(d.GetDayOfYear() ==
                   (IsMonth(m) ? Saturate(Number(d) - DayNumber(1, 1, y) + 1) : 0));
        CheckText(d);
        DWXDate stepped(d), moved(d);
        for (int i = 0; i != days; i += days > 0 ? 1 : -1) {
            days > 0 ? ++stepped : --stepped;
        }
        moved.addDay(days);
        FUZZ_CHECK(stepped == moved);
        moved.addDay(jump);  // far jumps do no harm
        CheckText(moved);
    }

    static void Run(FuzzInput& input) {
        while (!input.Empty()) {
            if (input.Flag()) {
                const DWXDate a = ValidDate(input), b = ValidDate(input);
                CheckValid(a, b, input.Flag() ? input.Range(-1000, 1000) : input.Int());
            } else {
                const DWXDate d = AnyDate(input), other = AnyDate(input);
                const int days = input.Range(-1000, 1000);
                CheckAny(d, other, days, input.Int());
            }
        }
    }
};
