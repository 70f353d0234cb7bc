// Dates checked against day-number arithmetic: for valid dates, stepping,
// addDay, differences, day of year and comparisons agree with the number of
// days since 1 January of year 1; every date, valid or not, may be stepped,
// compared and formatted without harm, and reports only invalid values.
#include <dwxcore/dwxdate.h>
#include <services/utilhub.h>

#include "fuzz_input.h"

#include <limits.h>
#include <stdio.h>
#include <string.h>

#include <algorithm>

namespace {

int gReports;

void Count(int code, int severity, const char*) {
    FUZZ_CHECK(code == 100 && severity == 0);
    ++gReports;
}

int64_t FloorDiv(int64_t a, int64_t b) {
    return a / b - ((a % b != 0) && ((a < 0) != (b < 0)));
}

// Days since 1 January of year 1 (day 0), by the proleptic Gregorian rules.
int64_t DayNumber(int month, int day, int64_t year) {
    const int64_t y = year - 1;
    static const int before[] = {0, 0, 31, 59, 90, 120, 151, 181, 212, 243, 273, 304, 334};
    int64_t days = y * 365 + FloorDiv(y, 4) - FloorDiv(y, 100) + FloorDiv(y, 400);
    days += before[month] + day - 1;
    if (month > 2 && DWXDate::LeapYear(static_cast<int>(year))) {
        ++days;
    }
    return days;
}

bool Valid(int month, int day, int year) {
    return month >= 1 && month <= 12 && year >= 1 && day >= 1 &&
           day <= DWXDate::GetDaysInMonth(month, year);
}

const int64_t kFirst = 0;
const int64_t kLast = DayNumber(12, 31, INT_MAX);

int64_t Number(const DWXDate& d) {
    return DayNumber(d.GetMonth(), d.GetDay(), d.GetYear());
}

void CheckText(const DWXDate& d) {
    static const char* const kMonths[] = {"zero",    "January",  "February", "March",  "April",
                                          "May",     "June",     "July",     "August", "September",
                                          "October", "November", "December"};
    char expected[64];
    const int m = d.GetMonth();
    snprintf(expected, sizeof expected, "%s %d, %d", m >= 0 && m <= 12 ? kMonths[m] : "invalid",
             d.GetDay(), d.GetYear());
    char buffer[35];
    FUZZ_CHECK(d.GetString(buffer) == buffer);
    FUZZ_CHECK(strcmp(buffer, expected) == 0);
    const char* shared = d.GetString();
    FUZZ_CHECK(strlen(shared) <= 23 && strncmp(shared, expected, strlen(shared)) == 0);
}

// A valid date, with years drawn mostly near the present and sometimes up to
// the last representable year.
DWXDate ValidDate(FuzzInput& input) {
    const int year = input.Flag() ? input.Range(1, 3000) : input.Range(1, INT_MAX);
    const int month = input.Range(1, 12);
    const int day = input.Range(1, DWXDate::GetDaysInMonth(month, year));
    gReports = 0;
    DWXDate date(month, day, year);
    FUZZ_CHECK(gReports == 0);
    return date;
}

void CheckValid(FuzzInput& input) {
    DWXDate a = ValidDate(input);
    DWXDate b = ValidDate(input);
    const int64_t na = Number(a);
    const int64_t nb = Number(b);
    FUZZ_CHECK(a.GetDifference(b) ==
               static_cast<int>(std::clamp<int64_t>(na - nb, INT_MIN, INT_MAX)));
    FUZZ_CHECK((a < b) == (na < nb) && (a <= b) == (na <= nb) && (a == b) == (na == nb));
    FUZZ_CHECK((a > b) == (na > nb) && (a >= b) == (na >= nb) && (a != b) == (na != nb));
    FUZZ_CHECK(a.GetDayOfYear() == na - DayNumber(1, 1, a.GetYear()) + 1);
    CheckText(a);

    DWXDate fromDay(1, 1, a.GetYear());
    fromDay.SetDayOfYear(a.GetDayOfYear());
    FUZZ_CHECK(fromDay == a);

    const int days = input.Flag() ? input.Range(-1000, 1000) : input.Int();
    DWXDate moved(a);
    moved.addDay(days);
    FUZZ_CHECK(Valid(moved.GetMonth(), moved.GetDay(), moved.GetYear()));
    FUZZ_CHECK(Number(moved) == std::clamp<int64_t>(na + days, kFirst, kLast));

    DWXDate next(a);
    ++next;
    FUZZ_CHECK(Number(next) == std::min(na + 1, kLast));
    DWXDate previous(a);
    --previous;
    FUZZ_CHECK(Number(previous) == std::max(na - 1, kFirst));
}

// Any three numbers: reported when invalid, and safe to use afterwards.
void CheckAny(FuzzInput& input) {
    const int month = input.Flag() ? input.Range(-1, 14) : input.Int();
    const int day = input.Flag() ? input.Range(-1, 33) : input.Int();
    const int year = input.Flag() ? input.Range(-2, 2) : input.Int();
    gReports = 0;
    DWXDate d(month, day, year);
    FUZZ_CHECK((gReports == 0) == Valid(month, day, year));
    FUZZ_CHECK(d.GetMonth() == month && d.GetDay() == day && d.GetYear() == year);
    CheckText(d);
    DWXDate other(d);
    ++other;
    --other;
    other.addDay(input.Int());
    other.SetDayOfYear(input.Int());
    other.SetDay(input.Int());
    d.GetDifference(other);
    other.GetDifference(d);
    d.GetDayOfYear();
    CheckText(other);
}

}  // namespace

extern "C" int LLVMFuzzerInitialize(int*, char***) {
    IMPSetErrorHandler(Count);
    return 0;
}

extern "C" int LLVMFuzzerTestOneInput(const uint8_t* data, size_t size) {
    FuzzInput input(data, size);
    while (!input.Empty()) {
        input.Flag() ? CheckValid(input) : CheckAny(input);
    }
    return 0;
}
