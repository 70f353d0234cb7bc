#include "report_capture.h"

#include <dwxcore/dwxdate.h>
#include <services/rtprim.h>
#include <services/utilhub.h>

#include <gtest/gtest.h>

#include <string.h>

#include <algorithm>
#include <climits>
#include <string>
#include <utility>
#include <vector>

namespace {

using Texts = std::vector<std::string>;

// Collects the date's reports while in scope.
struct Reports {
    ReportCapture capture;
    Texts Take() {
        Texts texts;
        for (const CapturedReport& report : capture.Take()) {
            texts.push_back(report.code == 100 && report.severity == 0
                                ? report.message
                                : "unexpected code or severity");
        }
        return texts;
    }
};

std::string Invalid(const char* field, int m, int d, int y) {
    return std::string("Invalid ") + field +
           " for DWXDate Object (month, day, year):  " + std::to_string(m) + " " +
           std::to_string(d) + " " + std::to_string(y) + ".\n";
}

std::string Fields(const DWXDate& date) {
    return std::to_string(date.GetMonth()) + "/" + std::to_string(date.GetDay()) + "/" +
           std::to_string(date.GetYear());
}

DWXDate Quiet(int m, int d, int y) {
    Reports reports;
    return DWXDate(m, d, y);
}

std::string Text(const DWXDate& date) {
    char buffer[64];
    return date.GetString(buffer);
}

}  // namespace

#if !defined(_WIN32)
// Stands in for the service's clock so SetToday sees a known text: the
// dynamic linker binds the library's call to this definition.
const char* gTimeText = "1-1-2000";
const char* IMPTime(const void*, int kind) {
    return kind == 10 ? gTimeText : "1-1-1999 00:00:00";
}
#endif

// Every day from 1 January of year 1 to the end of year 3000, stepped with ++,
// against the day of the year both ways, the difference from the first day,
// --, the leap rule, and addDay jumps between days of the walk.
TEST(DateWalk, StepsDayNumbersAndLeapRuleAgreeFromYear1To3000) {
    Reports reports;
    std::vector<DWXDate> walk;
    for (DWXDate date; date.GetYear() <= 3000; ++date) {
        walk.push_back(date);
    }
    const int count = static_cast<int>(walk.size());
    ASSERT_EQ(1095727, count);  // 7.5 cycles of 400 years
    for (int i = 0, dayOfYear = 0; i < count; ++i) {
        const DWXDate& date = walk[i];
        const int y = date.GetYear();
        dayOfYear = (date.GetMonth() == 1 && date.GetDay() == 1) ? 1 : dayOfYear + 1;
        ASSERT_EQ(dayOfYear, date.GetDayOfYear()) << Fields(date);
        DWXDate same(6, 15, y), back = date;
        same.SetDayOfYear(dayOfYear);
        ASSERT_TRUE(same == date && --back == walk[i > 0 ? i - 1 : 0]) << Fields(date);
        ASSERT_EQ(i, date.GetDifference(walk[0]));
        ASSERT_EQ(-i, walk[0].GetDifference(date));
        if (date.GetMonth() == 12 && date.GetDay() == 31) {
            const int leap = (y % 4 == 0 && y % 100 != 0) || y % 400 == 0;
            ASSERT_EQ(365 + leap, dayOfYear) << y;
            ASSERT_EQ(leap, DWXDate::LeapYear(y)) << y;
        }
    }
    for (int i = 0; i < count; i += 997) {
        for (int step : {1, -1, 59, -366, 1461, -146097, 400000, -400000}) {
            DWXDate moved = walk[i];
            moved.addDay(step);
            ASSERT_TRUE(i + step < 0 || i + step >= count || moved == walk[i + step])
                << Fields(walk[i]) << " + " << step;
        }
    }
    EXPECT_TRUE(reports.Take().empty());
}

// Invalid values are reported with code 100 and severity 0, then stored.
TEST(Date, ReportsNameTheDateAndStoreAnyway) {
    struct Row {
        int m, d, y;
        Texts reports;
    } rows[] = {
        {2, 29, 2000, {}},
        {2, 29, 1900, {Invalid("Day", 2, 29, 1900)}},
        {1, 1, 0, {Invalid("Year", 1, 1, 0)}},
        {13, 5, 2016, {Invalid("Month", 13, 5, 2016), Invalid("Day", 13, 5, 2016)}},
        {0, 0, 0, {Invalid("Month", 0, 0, 0), Invalid("Year", 0, 0, 0), Invalid("Day", 0, 0, 0)}},
    };
    Reports reports;
    for (const Row& row : rows) {
        DWXDate date(row.m, row.d, row.y);
        EXPECT_EQ(row.reports, reports.Take()) << row.m << " " << row.d << " " << row.y;
        EXPECT_TRUE(date.GetMonth() == row.m && date.GetDay() == row.d && date.GetYear() == row.y);
    }

    // Setters report with the fields stored at the time of each check.
    DWXDate date(3, 5, 2016);
    date.SetMonth(13);
    EXPECT_EQ(Texts{Invalid("Month", 13, 5, 2016)}, reports.Take());
    date.SetDate(13, 40, -1);
    EXPECT_EQ((Texts{Invalid("Month", 13, 5, 2016), Invalid("Year", 13, 5, -1),
                     Invalid("Day", 13, 40, -1)}),
              reports.Take());
    EXPECT_EQ("13/40/-1", Fields(date));
    date = DWXDate(2, 10, 2016);
    date.SetDay(30);
    date.SetYear(0);
    EXPECT_EQ((Texts{Invalid("Day", 2, 30, 2016), Invalid("Year", 2, 30, 0)}), reports.Take());

    // The message format goes through translation before it is filled in.
    RTMessageCatalogue previous = RTSetMessageCatalogue([](const char* message) -> const char* {
        return strncmp(message, "Invalid Year", 12) == 0 ? "Jahr? %d/%d/%d" : nullptr;
    });
    DWXDate(7, 4, -3);
    RTSetMessageCatalogue(previous);
    EXPECT_EQ(Texts{"Jahr? 7/4/-3"}, reports.Take());
}

TEST(Date, DayOfYearAndLeapYears) {
    EXPECT_EQ(61, DWXDate(3, 1, 2016).GetDayOfYear());
    struct Row {
        int year, dayOfYear;
        const char* fields;
        Texts reports;
    } rows[] = {
        {2016, 60, "2/29/2016", {}},
        {2015, 60, "3/1/2015", {}},
        {2015, 366, "12/32/2015", {Invalid("Day", 12, 32, 2015)}},
        {2015, 400, "12/66/2015", {Invalid("Day", 12, 66, 2015)}},
        {2015, 0, "1/0/2015", {Invalid("Day", 1, 0, 2015)}},
    };
    Reports reports;
    for (const Row& row : rows) {
        DWXDate date(6, 15, row.year);
        date.SetDayOfYear(row.dayOfYear);
        EXPECT_EQ(row.fields, Fields(date));
        EXPECT_EQ(row.reports, reports.Take()) << row.fields;
    }
    // The rule holds below year 1 too: year 0 is a leap year.
    EXPECT_EQ(0, DWXDate::LeapYear(-100));
    for (int year : {0, -4, -400}) {
        EXPECT_EQ(1, DWXDate::LeapYear(year)) << year;
    }
}

TEST(Date, SteppingStopsAtTheEnds) {
    DWXDate date;
    EXPECT_EQ("1/1/1", Fields(--date));
    struct Row {
        int m, d, y, days;
        const char* fields;
    } rows[] = {
        {1, 1, 2, -2, "12/30/1"},
        {1, 2, 1, -5, "1/1/1"},
        {1, 1, 2016, INT_MIN, "1/1/1"},
        {3, 1, 2000, -1, "2/29/2000"},
        {12, 31, INT_MAX, 1000, "12/31/2147483647"},
    };
    for (const Row& row : rows) {
        DWXDate moved(row.m, row.d, row.y);
        moved.addDay(row.days);
        EXPECT_EQ(row.fields, Fields(moved));
    }
    DWXDate last(12, 31, INT_MAX);
    EXPECT_EQ("12/31/2147483647", Fields(++last));
    EXPECT_EQ(INT_MIN, DWXDate().GetDifference(last));
    date.addDay(INT_MAX);
    EXPECT_EQ(INT_MAX, date.GetDifference(DWXDate()));
}

TEST(Date, DifferenceAndComparisons) {
    EXPECT_EQ(730485, DWXDate(1, 1, 3000).GetDifference(DWXDate(1, 1, 1000)));
    // Year before month before day.
    const DWXDate ordered[] = {DWXDate(12, 31, 1999), DWXDate(1, 1, 2000), DWXDate(1, 2, 2000),
                               DWXDate(2, 1, 2000)};
    for (int i = 0; i < 4; ++i) {
        for (int j = 0; j < 4; ++j) {
            const DWXDate &a = ordered[i], &b = ordered[j];
            const int got[] = {a == b, a != b, a<b, a <= b, a> b, a >= b};
            const int expected[] = {i == j, i != j, i<j, i <= j, i> j, i >= j};
            EXPECT_TRUE(std::equal(got, got + 6, expected)) << i << " " << j;
        }
    }
}

TEST(Date, GetString) {
    EXPECT_EQ("January 1, 1", Text(DWXDate()));
    EXPECT_EQ("July 4, 1776", Text(DWXDate(7, 4, 1776)));
    EXPECT_EQ("zero 5, 2016", Text(Quiet(0, 5, 2016)));
    EXPECT_EQ("invalid 5, 2016", Text(Quiet(INT_MIN, 5, 2016)));

    // A caller's buffer gets the whole text, the shared one at most 23 characters.
    const DWXDate longest = Quiet(9, INT_MIN, INT_MIN);
    EXPECT_EQ("September -2147483648, -2147483648", Text(longest));
    char* shared = longest.GetString(nullptr);
    EXPECT_STREQ("September -2147483648, ", shared);
    EXPECT_EQ(shared, DWXDate(12, 25, 2016).GetString());
    EXPECT_STREQ("December 25, 2016", shared);
}

// A month outside 1 to 12 never reaches the month tables, and such a date does not move.
TEST(Date, InvalidMonthGuards) {
    for (int m : {13, -1, INT_MIN}) {
        DWXDate date = Quiet(m, 5, 2016);
        ++date;
        --date;
        date.addDay(100);
        date.addDay(INT_MIN);
        EXPECT_EQ(Fields(Quiet(m, 5, 2016)), Fields(date));
        EXPECT_EQ(0, date.GetDayOfYear());
        EXPECT_EQ(0, DWXDate::GetDaysInMonth(m, 2016));
        EXPECT_EQ(0, date.GetDifference(DWXDate(3, 1, 2016)));
        EXPECT_EQ(0, DWXDate(3, 1, 2016).GetDifference(date));
    }
}

// On a day outside its month or a year below 1, addDay gives what single steps give.
TEST(Date, AddDayOnOddDatesMatchesSingleSteps) {
    for (const DWXDate& start : {Quiet(12, 32, 2015), Quiet(2, 30, 2016), Quiet(3, -3, 2016),
                                 Quiet(1, 1, 0), Quiet(6, 15, -3), Quiet(1, 0, 1)}) {
        for (int days = 1; days <= 1500; days += (days < 40 ? 1 : 37)) {
            for (int sign : {1, -1}) {
                DWXDate stepped = start, moved = start;
                for (int i = 0; i < days; ++i) {
                    sign > 0 ? ++stepped : --stepped;
                }
                moved.addDay(sign * days);
                ASSERT_EQ(Fields(stepped), Fields(moved)) << Fields(start) << " " << sign * days;
            }
        }
    }
    EXPECT_EQ(1, Quiet(12, 32, 2015).GetDifference(DWXDate(12, 31, 2015)));
    EXPECT_EQ(-366, Quiet(1, 1, 0).GetDifference(DWXDate()));
}

#if !defined(_WIN32)
TEST(Date, SetTodayReadsDayMonthYear) {
    Reports reports;
    DWXDate date;
    gTimeText = "31-2-2016";
    date.SetToday();
    EXPECT_EQ("2/31/2016", Fields(date));
    EXPECT_EQ(Texts{Invalid("Day", 2, 31, 2016)}, reports.Take());
    // A text without three numbers leaves the date alone.
    for (const char* text : {"", "today", "25-12", "25/12/2016", (const char*)nullptr}) {
        gTimeText = text;
        date.SetToday();
        EXPECT_EQ("2/31/2016", Fields(date));
    }
    EXPECT_TRUE(reports.Take().empty());
}
#endif

namespace {

// The day count divides years by 4, 100 and 400, rounding down also below
// year 1: every 400 years hold 146097 days, wherever they start.
TEST(Date, DifferencesRepeatEvery400YearsAcrossTheIntRange) {
    ReportCapture quiet;  // years below 1
    for (int year : {INT_MIN, -1000001, -801, -400, -399, -1, 0, 1, 2, 100, 1600, 1700, 2000, 2001,
                     2100, 1000000, INT_MAX - 400}) {
        for (int month : {1, 2, 3, 12}) {
            for (int day : {-40, 0, 1, 28, 29, 31, 40}) {
                DWXDate early(month, day, year), late(month, day, year + 400);
                ASSERT_EQ(late.GetDifference(early), 146097) << month << "/" << day << "/" << year;
            }
        }
        DWXDate march(3, 1, year), february(2, 28, year);
        EXPECT_EQ(march.GetDifference(february), 1 + DWXDate::LeapYear(year)) << year;
    }
}

}  // namespace
