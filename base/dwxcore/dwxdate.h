// A Gregorian calendar date: month, day and year, with validation, day
// stepping, differences in days, day-of-year conversion, comparisons and an
// English text form.
#pragma once

#include <dwxcore/dwxcore_export.h>

// A plain value. Setters report an invalid value through IMPError (code 100,
// severity 0) and then store it all the same, so a date may hold an invalid
// month, day or year after a report. Year 1 is the first year; there is no
// year 0, and 1 January of year 1 is the earliest date stepping reaches.
class DWXCORE_API DWXDate {
  public:
    // 1 January of year 1.
    DWXDate();
    // Validates and stores as SetDate does; every report carries the three
    // numbers passed here.
    DWXDate(int month, int day, int year);
    DWXDate(const DWXDate& other) = default;
    DWXDate& operator=(const DWXDate& other) = default;
    ~DWXDate() = default;

    int GetMonth() const { return nMonth; }
    int GetDay() const { return nDay; }
    int GetYear() const { return nYear; }

    // Validates month, then year, then day, reporting each invalid value, and
    // stores all three.
    void SetDate(int month, int day, int year);
    void SetMonth(int month);
    // A day is checked against the current month and year; under a month
    // outside 1 to 12 every day is reported.
    void SetDay(int day);
    void SetYear(int year);
    // Month and day from a day number within the current year (1 is
    // 1 January). Numbers past the year's end land in December with a day
    // above 31 and are reported, as are numbers below 1 (January, day n).
    void SetDayOfYear(int dayOfYear);
    // Today's date from IMPTime. The date is left unchanged when the time
    // text does not hold three numbers.
    void SetToday();

    // 1 for 1 January up to 365 or 366 for 31 December. A day beyond the
    // month's end counts on; 0 when the month is outside 1 to 12.
    int GetDayOfYear() const;

    // 1 for a leap year, else 0. The Gregorian rule applies to years below 1
    // as well (year 0 is a leap year).
    static int LeapYear(int year);
    // The days of `month` in `year`: 29 for February of a leap year, 0 for
    // month 0 and for any month outside 0 to 12.
    static int GetDaysInMonth(int month, int year);

    // One day later or earlier. A date whose month is outside 1 to 12 does not
    // move; nor does 1 January of year 1 (or earlier) under --, nor the last
    // representable day under ++.
    DWXDate& operator++();
    DWXDate& operator--();
    // Moves the date by `days`, as that many steps of ++ or -- would; a large
    // negative count stops at 1 January of year 1. A valid date moves in
    // constant time. A date whose month is outside 1 to 12 does not move.
    void addDay(int days);
    // Days from `other` to this date, positive when this date is later. Valid
    // dates are compared in constant time. Out-of-range days and years below
    // 1 count on linearly from the month's start (32 December 2015 is one day
    // after 31 December); 0 when either month is outside 1 to 12. Saturates
    // at the limits of int.
    int GetDifference(DWXDate other) const;

    // By year, then month, then day; 1 or 0.
    int operator==(const DWXDate& other) const;
    int operator!=(const DWXDate& other) const;
    int operator<(const DWXDate& other) const;
    int operator<=(const DWXDate& other) const;
    int operator>(const DWXDate& other) const;
    int operator>=(const DWXDate& other) const;

    // Writes "Month day, year" ("July 4, 1776"; month 0 is "zero", a month
    // outside 0 to 12 is "invalid") into `buffer` and returns it. The caller's
    // buffer must hold the whole text (at most 35 bytes). With a null buffer
    // the text goes to a static buffer shared by all dates of the calling
    // thread (one per thread), cut to 23 characters; it is borrowed and
    // overwritten by the next such call on the same thread.
    char* GetString(char* buffer = nullptr) const;

  private:
    int nMonth;
    int nDay;
    int nYear;
};
