#include <dwxcore/dwxdate.h>

#include <services/rtprim.h>
#include <services/utilhub.h>

#include <stdint.h>
#include <stdio.h>

#include <algorithm>
#include <climits>

namespace {

// Indexed by month 0 to 12; month 0 is a placeholder that has no days.
const int kDaysPerMonth[13] = {0, 31, 28, 31, 30, 31, 30, 31, 31, 30, 31, 30, 31};
const char* const kMonthNames[13] = {"zero",    "January",  "February", "March",  "April",
                                     "May",     "June",     "July",     "August", "September",
                                     "October", "November", "December"};
// Days of a common year before the first of each month, indexed by month 1 to 12.
const int kDaysBeforeMonth[13] = {0, 0, 31, 59, 90, 120, 151, 181, 212, 243, 273, 304, 334};

const char kInvalidMonth[] = "Invalid Month for DWXDate Object (month, day, year):  %d %d %d.\n";
const char kInvalidDay[] = "Invalid Day for DWXDate Object (month, day, year):  %d %d %d.\n";
const char kInvalidYear[] = "Invalid Year for DWXDate Object (month, day, year):  %d %d %d.\n";

// Shared by every GetString call without a buffer on one thread; each thread
// has its own, so dates on different threads never write into each other's text.
thread_local char gStaticText[24];

// Days in a 400-, 100- and 4-year cycle of the Gregorian calendar.
const int64_t kDaysPer400 = 146097;
const int64_t kDaysPer100 = 36524;
const int64_t kDaysPer4 = 1461;

void Report(const char* message, int month, int day, int year) {
    IMPError(100, 0, MkName(_(message), month, day, year));
}

bool IsMonth(int month) {
    return month >= 1 && month <= 12;
}

int SaturateToInt(int64_t value) {
    return static_cast<int>(std::clamp<int64_t>(value, INT_MIN, INT_MAX));
}

// Remainders truncate towards zero; divisibility tests are the same either
// way. The library's own callers use this inline test; LeapYear exports it.
inline bool IsLeapYear(int year) {
    return year % 4 == 0 && (year % 100 != 0 || year % 400 == 0);
}

int64_t FloorDiv(int64_t a, int64_t b) {
    int64_t q = a / b;
    return (a % b != 0 && a < 0) ? q - 1 : q;
}

// Day numbers count days from 1 January of year 1 (day 0). The month must be
// 1 to 12; any year works (years below 1 give negative numbers), and a day
// outside the month counts on from the month's first day.
//
// The year is counted from March, so that the leap day ends it: January and
// February belong to the year before, and the days before a month are
// (153 * m + 2) / 5 for m = 0 (March) to 11 (February), with no leap test.
// The year is moved up by whole 400-year cycles before dividing, so that the
// divisions are by non-negative numbers and round down; the cycles' leap days
// are taken off again.
int64_t DayNumber(int month, int day, int year) {
    const int64_t kCycles = int64_t(1) << 23;  // 400 * kCycles years cover every int year
    int64_t y = int64_t(year) - (month <= 2 ? 1 : 0);
    int64_t m = month > 2 ? month - 3 : month + 9;
    uint64_t shifted = static_cast<uint64_t>(y + 400 * kCycles);
    int64_t leapDays =
        static_cast<int64_t>(shifted / 4 - shifted / 100 + shifted / 400) - 97 * kCycles;
    // 1 January of year 1 is day 306 after 1 March of year 0.
    return 365 * y + leapDays + (153 * m + 2) / 5 + day - 1 - 306;
}

// The inverse of DayNumber for a valid date. The caller keeps `number` within
// the years an int holds.
void FromDayNumber(int64_t number, int* month, int* day, int* year) {
    int64_t cycles = FloorDiv(number, kDaysPer400);
    int64_t rest = number - cycles * kDaysPer400;                  // [0, 146096]
    int64_t centuries = std::min<int64_t>(rest / kDaysPer100, 3);  // the 400th year is leap
    rest -= centuries * kDaysPer100;                               // [0, 36524]
    int64_t quads = rest / kDaysPer4;
    rest -= quads * kDaysPer4;                         // [0, 1460]
    int64_t years = std::min<int64_t>(rest / 365, 3);  // the 4th year is leap
    rest -= years * 365;                               // [0, 365]
    *year = static_cast<int>(cycles * 400 + centuries * 100 + quads * 4 + years + 1);
    int m = 1;
    while (rest >= DWXDate::GetDaysInMonth(m, *year)) {
        rest -= DWXDate::GetDaysInMonth(m, *year);
        ++m;
    }
    *month = m;
    *day = static_cast<int>(rest) + 1;
}

}  // namespace

DWXDate::DWXDate() : nMonth(1), nDay(1), nYear(1) {}

// The fields hold the values passed before SetDate runs, so every report
// names the date being constructed.
DWXDate::DWXDate(int month, int day, int year) : nMonth(month), nDay(day), nYear(year) {
    SetDate(month, day, year);
}

// The day is checked last because its range depends on the new month and year.
void DWXDate::SetDate(int month, int day, int year) {
    if (!IsMonth(month)) {
        Report(kInvalidMonth, month, nDay, nYear);
    }
    nMonth = month;
    if (year < 1) {
        Report(kInvalidYear, month, nDay, year);
    }
    nYear = year;
    if (day < 1 || day > GetDaysInMonth(month, year)) {
        Report(kInvalidDay, month, day, year);
    }
    nDay = day;
}

void DWXDate::SetMonth(int month) {
    if (!IsMonth(month)) {
        Report(kInvalidMonth, month, nDay, nYear);
    }
    nMonth = month;
}

void DWXDate::SetDay(int day) {
    if (day < 1 || day > GetDaysInMonth(nMonth, nYear)) {
        Report(kInvalidDay, nMonth, day, nYear);
    }
    nDay = day;
}

void DWXDate::SetYear(int year) {
    if (year < 1) {
        Report(kInvalidYear, nMonth, nDay, year);
    }
    nYear = year;
}

// Walks the months from January; December takes whatever remains, so a number
// past the year's end gives a December day above 31.
void DWXDate::SetDayOfYear(int dayOfYear) {
    int month = 1;
    int rest = dayOfYear;
    if (dayOfYear > kDaysPerMonth[1]) {
        while (month < 12) {
            rest -= GetDaysInMonth(month, nYear);
            ++month;
            if (rest <= GetDaysInMonth(month, nYear)) {
                break;
            }
        }
    }
    nMonth = month;
    if (rest < 1 || rest > GetDaysInMonth(month, nYear)) {
        Report(kInvalidDay, month, rest, nYear);
    }
    nDay = rest;
}

void DWXDate::SetToday() {
    // "day-month-year", read as "%d-%d-%d" reads it in the "C" locale.
    int parts[3] = {0, 0, 0};
    const char* text = IMPTime(nullptr, 10);
    for (int i = 0; i < 3; ++i) {
        char* end = nullptr;
        long value = TZN_strtol(text, &end, 10);
        if (text == nullptr || end == text || value < INT_MIN || value > INT_MAX ||
            (i < 2 && *end != '-')) {
            return;
        }
        parts[i] = static_cast<int>(value);
        text = i < 2 ? end + 1 : end;
    }
    SetDate(parts[1], parts[0], parts[2]);
}

int DWXDate::GetDayOfYear() const {
    if (!IsMonth(nMonth)) {
        return 0;
    }
    int leapDay = (nMonth > 2 && IsLeapYear(nYear)) ? 1 : 0;
    return SaturateToInt(int64_t(nDay) + kDaysBeforeMonth[nMonth] + leapDay);
}

int DWXDate::LeapYear(int year) {
    return IsLeapYear(year) ? 1 : 0;
}

int DWXDate::GetDaysInMonth(int month, int year) {
    if (month < 0 || month > 12) {
        return 0;
    }
    if (month == 2 && IsLeapYear(year)) {
        return 29;
    }
    return kDaysPerMonth[month];
}

// Only the last day of a month wraps; a day beyond it just grows.
DWXDate& DWXDate::operator++() {
    if (!IsMonth(nMonth)) {
        return *this;
    }
    if (nDay != GetDaysInMonth(nMonth, nYear)) {
        if (nDay < INT_MAX) {
            ++nDay;
        }
        return *this;
    }
    if (nMonth < 12) {
        ++nMonth;
    } else if (nYear < INT_MAX) {
        nMonth = 1;
        ++nYear;
    } else {
        return *this;
    }
    nDay = 1;
    return *this;
}

// Only the first of a month wraps; any other day, valid or not, just shrinks.
DWXDate& DWXDate::operator--() {
    if (!IsMonth(nMonth)) {
        return *this;
    }
    if (nDay != 1) {
        if (nDay > INT_MIN) {
            --nDay;
        }
        return *this;
    }
    if (nMonth > 1) {
        --nMonth;
        nDay = GetDaysInMonth(nMonth, nYear);
    } else if (nYear > 1) {
        nMonth = 12;
        nDay = 31;
        --nYear;
    }
    return *this;
}

// Gives what |days| steps of ++ or -- would give, without taking them one by
// one: an out-of-range day first runs as the steps would run it (a day past
// the month's end only ever grows under ++, one below 1 only ever shrinks
// under --), and once the day is valid the rest is a jump in day numbers.
void DWXDate::addDay(int days) {
    if (!IsMonth(nMonth) || days == 0) {
        return;
    }
    const int inMonth = GetDaysInMonth(nMonth, nYear);
    if (days > 0) {
        int64_t left = days;
        if (nDay > inMonth) {
            nDay = SaturateToInt(nDay + left);
            return;
        }
        if (nDay < 1) {
            int64_t steps = std::min<int64_t>(left, 1 - int64_t(nDay));
            nDay += static_cast<int>(steps);
            left -= steps;
            if (left == 0) {
                return;
            }
        }
        const int64_t last = DayNumber(12, 31, INT_MAX);
        int64_t target = std::min(DayNumber(nMonth, nDay, nYear) + left, last);
        FromDayNumber(target, &nMonth, &nDay, &nYear);
    } else {
        int64_t left = -int64_t(days);
        if (nDay < 1) {
            nDay = SaturateToInt(nDay - left);
            return;
        }
        if (nDay > inMonth) {
            int64_t steps = std::min<int64_t>(left, nDay - inMonth);
            nDay -= static_cast<int>(steps);
            left -= steps;
            if (left == 0) {
                return;
            }
        }
        // -- stops at 1 January of year 1, or of the date's own year when that
        // is already below 1.
        const int64_t first = DayNumber(1, 1, std::min(nYear, 1));
        int64_t target = std::max(DayNumber(nMonth, nDay, nYear) - left, first);
        FromDayNumber(target, &nMonth, &nDay, &nYear);
    }
}

int DWXDate::GetDifference(DWXDate other) const {
    if (!IsMonth(nMonth) || !IsMonth(other.nMonth)) {
        return 0;
    }
    return SaturateToInt(DayNumber(nMonth, nDay, nYear) -
                         DayNumber(other.nMonth, other.nDay, other.nYear));
}

int DWXDate::operator==(const DWXDate& other) const {
    return (nYear == other.nYear && nMonth == other.nMonth && nDay == other.nDay) ? 1 : 0;
}

int DWXDate::operator!=(const DWXDate& other) const {
    return (*this == other) ? 0 : 1;
}

int DWXDate::operator<(const DWXDate& other) const {
    if (nYear != other.nYear) {
        return nYear < other.nYear ? 1 : 0;
    }
    if (nMonth != other.nMonth) {
        return nMonth < other.nMonth ? 1 : 0;
    }
    return nDay < other.nDay ? 1 : 0;
}

int DWXDate::operator<=(const DWXDate& other) const {
    return (other < *this) ? 0 : 1;
}

int DWXDate::operator>(const DWXDate& other) const {
    return other < *this;
}

int DWXDate::operator>=(const DWXDate& other) const {
    return (*this < other) ? 0 : 1;
}

char* DWXDate::GetString(char* buffer) const {
    const char* name = (nMonth >= 0 && nMonth <= 12) ? kMonthNames[nMonth] : "invalid";
    if (buffer == nullptr) {
        // Cut to the static buffer's 23 characters and NUL.
        int length = snprintf(gStaticText, sizeof gStaticText, "%s %d, %d", name, nDay, nYear);
        (void)length;
        return gStaticText;
    }
    sprintf(buffer, "%s %d, %d", name, nDay, nYear);
    return buffer;
}
