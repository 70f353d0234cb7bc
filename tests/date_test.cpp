#include <dwxcore/dwxdate.h>
#include <services/rtprim.h>
#include <services/utilhub.h>

#include <gtest/gtest.h>

#include <string.h>

#include <climits>
#include <string>
#include <vector>

namespace {

// Collects IMPError reports while in scope.
class ReportCapture {
  public:
    struct Report {
        int code;
        int severity;
        std::string message;
    };

    ReportCapture() { mPrevious = IMPSetErrorHandler(&Handler); }
    ~ReportCapture() {
        IMPSetErrorHandler(mPrevious);
        Reports().clear();
    }

    static std::vector<Report>& Reports() {
        static std::vector<Report> reports;
        return reports;
    }
    static std::vector<std::string> Messages() {
        std::vector<std::string> texts;
        for (const Report& report : Reports()) {
            EXPECT_EQ(100, report.code);
            EXPECT_EQ(0, report.severity);
            texts.push_back(report.message);
        }
        Reports().clear();
        return texts;
    }

  private:
    static void Handler(int code, int severity, const char* message) {
        Reports().push_back({code, severity, message ? message : "(null)"});
    }
    IMPErrorHandler mPrevious;
};

std::string Month(int m, int d, int y) {
    return "Invalid Month for DWXDate Object (month, day, year):  " + std::to_string(m) + " " +
           std::to_string(d) + " " + std::to_string(y) + ".\n";
}
std::string Day(int m, int d, int y) {
    return "Invalid Day for DWXDate Object (month, day, year):  " + std::to_string(m) + " " +
           std::to_string(d) + " " + std::to_string(y) + ".\n";
}
std::string Year(int m, int d, int y) {
    return "Invalid Year for DWXDate Object (month, day, year):  " + std::to_string(m) + " " +
           std::to_string(d) + " " + std::to_string(y) + ".\n";
}

using Texts = std::vector<std::string>;

// Builds a date without looking at the reports it makes.
DWXDate Quiet(int m, int d, int y) {
    ReportCapture capture;
    return DWXDate(m, d, y);
}

void ExpectDate(const DWXDate& date, int m, int d, int y) {
    EXPECT_EQ(m, date.GetMonth());
    EXPECT_EQ(d, date.GetDay());
    EXPECT_EQ(y, date.GetYear());
}

std::string Text(const DWXDate& date) {
    char buffer[64];
    return date.GetString(buffer);
}

}  // namespace

#if !defined(_WIN32)
// Stands in for the service's clock so SetToday sees a known text: the
// dynamic linker binds the library's call to this definition.
namespace {
const char* gTimeText = "1-1-2000";
int gTimeKind = 0;
}  // namespace
const char* IMPTime(const void*, int kind) {
    gTimeKind = kind;
    return gTimeText;
}
#endif

// Every day from 1 January of year 1 to the end of year 3000, stepped with ++,
// must agree with the day of the year, SetDayOfYear, the difference from the
// first day, the leap rule and --. addDay is checked against the same walk.
TEST(DateWalk, StepsDayNumbersAndLeapRuleAgreeFromYear1To3000) {
    ReportCapture capture;
    const DWXDate first;
    std::vector<DWXDate> walk;
    walk.reserve(1100000);
    DWXDate date;
    int dayOfYear = 1;
    while (date.GetYear() <= 3000) {
        walk.push_back(date);
        const int index = static_cast<int>(walk.size()) - 1;
        ASSERT_EQ(dayOfYear, date.GetDayOfYear()) << Text(date);
        ASSERT_EQ(index, date.GetDifference(first)) << Text(date);
        ASSERT_EQ(-index, first.GetDifference(date)) << Text(date);
        DWXDate fromDayOfYear(1, 1, date.GetYear());
        fromDayOfYear.SetDayOfYear(dayOfYear);
        ASSERT_TRUE(fromDayOfYear == date) << Text(date);

        DWXDate next = date;
        ++next;
        ASSERT_TRUE(next > date);
        DWXDate back = next;
        --back;
        ASSERT_TRUE(back == date) << Text(date);
        if (next.GetYear() != date.GetYear()) {
            const int y = date.GetYear();
            const bool leap = (y % 4 == 0 && y % 100 != 0) || y % 400 == 0;
            ASSERT_EQ(leap ? 366 : 365, dayOfYear) << y;
            ASSERT_EQ(leap ? 1 : 0, DWXDate::LeapYear(y));
            ASSERT_EQ(leap ? 29 : 28, DWXDate::GetDaysInMonth(2, y));
            dayOfYear = 1;
        } else {
            ++dayOfYear;
        }
        date = next;
    }
    ExpectDate(date, 1, 1, 3001);
    // 3000 years hold 7.5 cycles of 400 years (146097 days each).
    EXPECT_EQ(1095727, date.GetDifference(first));
    EXPECT_TRUE(capture.Messages().empty());

    const int count = static_cast<int>(walk.size());
    const int steps[] = {1, -1, 2, -2, 59, -59, 365, -366, 1461, -1461, 146097, -146097, 400000};
    for (int i = 0; i < count; i += 997) {
        for (int step : steps) {
            const int target = i + step;
            if (target < 0 || target >= count) {
                continue;
            }
            DWXDate moved = walk[i];
            moved.addDay(step);
            ASSERT_TRUE(moved == walk[target]) << Text(walk[i]) << " + " << step;
            ASSERT_EQ(-step, walk[i].GetDifference(moved));
        }
    }
}

TEST(Date, ConstructionReportsWithTheNumbersPassed) {
    struct Row {
        int m, d, y;
        Texts reports;
    } rows[] = {
        {2, 29, 2000, {}},
        {12, 31, 1, {}},
        {2, 29, 1900, {Day(2, 29, 1900)}},
        {4, 31, 2016, {Day(4, 31, 2016)}},
        {1, 0, 2016, {Day(1, 0, 2016)}},
        {1, 1, 0, {Year(1, 1, 0)}},
        {13, 5, 2016, {Month(13, 5, 2016), Day(13, 5, 2016)}},
        {0, 0, 0, {Month(0, 0, 0), Year(0, 0, 0), Day(0, 0, 0)}},
    };
    ReportCapture capture;
    for (const Row& row : rows) {
        DWXDate date(row.m, row.d, row.y);
        EXPECT_EQ(row.reports, capture.Messages()) << row.m << " " << row.d << " " << row.y;
        ExpectDate(date, row.m, row.d, row.y);
    }
}

TEST(Date, SettersReportWithTheCurrentFieldsAndStoreAnyway) {
    ReportCapture capture;
    DWXDate date(3, 5, 2016);
    date.SetMonth(13);
    EXPECT_EQ(Texts{Month(13, 5, 2016)}, capture.Messages());
    EXPECT_EQ(13, date.GetMonth());

    date = DWXDate(2, 10, 2016);
    date.SetDay(30);
    EXPECT_EQ(Texts{Day(2, 30, 2016)}, capture.Messages());
    date.SetDay(29);
    EXPECT_TRUE(capture.Messages().empty());
    date.SetYear(0);
    EXPECT_EQ(Texts{Year(2, 29, 0)}, capture.Messages());
    ExpectDate(date, 2, 29, 0);

    // SetDate checks month, then year, then day, each against what is stored by then.
    date = DWXDate(3, 5, 2016);
    date.SetDate(13, 40, -1);
    EXPECT_EQ((Texts{Month(13, 5, 2016), Year(13, 5, -1), Day(13, 40, -1)}), capture.Messages());
    ExpectDate(date, 13, 40, -1);
    date.SetDate(2, 29, 2015);
    EXPECT_EQ(Texts{Day(2, 29, 2015)}, capture.Messages());
}

TEST(Date, ReportFormatIsTranslated) {
    static const char* const kYear =
        "Invalid Year for DWXDate Object (month, day, year):  %d %d %d.\n";
    RTMessageCatalogue previous = RTSetMessageCatalogue([](const char* message) -> const char* {
        return strcmp(message, kYear) == 0 ? "Jahr? %d/%d/%d" : nullptr;
    });
    ReportCapture capture;
    DWXDate date(7, 4, 1776);
    date.SetYear(-3);
    RTSetMessageCatalogue(previous);
    EXPECT_EQ(Texts{"Jahr? 7/4/-3"}, capture.Messages());
}

TEST(Date, LeapYearAndDaysInMonth) {
    struct Row {
        int year, leap;
    } rows[] = {{1900, 0}, {2000, 1}, {2016, 1}, {2015, 0}, {1, 0},
                {4, 1},    {0, 1},    {-4, 1},   {-100, 0}, {-400, 1}};
    for (const Row& row : rows) {
        EXPECT_EQ(row.leap, DWXDate::LeapYear(row.year)) << row.year;
    }
    EXPECT_EQ(0, DWXDate::GetDaysInMonth(0, 2016));
    EXPECT_EQ(31, DWXDate::GetDaysInMonth(12, 2016));
    EXPECT_EQ(30, DWXDate::GetDaysInMonth(11, 2016));
    EXPECT_EQ(0, DWXDate::GetDaysInMonth(13, 2016));
    EXPECT_EQ(0, DWXDate::GetDaysInMonth(-1, 2016));
    EXPECT_EQ(0, DWXDate::GetDaysInMonth(INT_MIN, 2016));
}

TEST(Date, DayOfYearBothWays) {
    EXPECT_EQ(61, DWXDate(3, 1, 2016).GetDayOfYear());
    EXPECT_EQ(365, DWXDate(12, 31, 2015).GetDayOfYear());
    EXPECT_EQ(366, DWXDate(12, 31, 2016).GetDayOfYear());

    struct Row {
        int year, dayOfYear, m, d;
        Texts reports;
    } rows[] = {
        {2016, 60, 2, 29, {}},
        {2015, 60, 3, 1, {}},
        {2015, 31, 1, 31, {}},
        {2015, 32, 2, 1, {}},
        {2016, 366, 12, 31, {}},
        {2015, 366, 12, 32, {Day(12, 32, 2015)}},
        {2015, 400, 12, 66, {Day(12, 66, 2015)}},
        {2015, 0, 1, 0, {Day(1, 0, 2015)}},
        {2015, -5, 1, -5, {Day(1, -5, 2015)}},
    };
    ReportCapture capture;
    for (const Row& row : rows) {
        DWXDate date(6, 15, row.year);
        date.SetDayOfYear(row.dayOfYear);
        EXPECT_EQ(row.reports, capture.Messages()) << row.year << " " << row.dayOfYear;
        ExpectDate(date, row.m, row.d, row.year);
    }
}

TEST(Date, SteppingAndTheYearOneFloor) {
    DWXDate date(12, 31, 2015);
    ExpectDate(++date, 1, 1, 2016);
    date = DWXDate(2, 28, 2016);
    ExpectDate(++date, 2, 29, 2016);
    date = DWXDate(3, 1, 2015);
    ExpectDate(--date, 2, 28, 2015);
    date = DWXDate();
    ExpectDate(--date, 1, 1, 1);

    struct Row {
        int m, d, y, days, em, ed, ey;
    } rows[] = {
        {1, 1, 2, -2, 12, 30, 1},      {1, 2, 1, -5, 1, 1, 1},
        {7, 4, 1776, 0, 7, 4, 1776},   {1, 1, 2016, INT_MIN, 1, 1, 1},
        {12, 31, 1999, 1, 1, 1, 2000}, {3, 1, 2000, -1, 2, 29, 2000},
    };
    for (const Row& row : rows) {
        DWXDate moved(row.m, row.d, row.y);
        moved.addDay(row.days);
        ExpectDate(moved, row.em, row.ed, row.ey);
    }

    // The far end: the largest step lands exactly INT_MAX days on, and the
    // last representable day does not wrap.
    DWXDate far;
    far.addDay(INT_MAX);
    EXPECT_EQ(INT_MAX, far.GetDifference(DWXDate()));
    DWXDate last(12, 31, INT_MAX);
    ++last;
    ExpectDate(last, 12, 31, INT_MAX);
    last.addDay(1000);
    ExpectDate(last, 12, 31, INT_MAX);
    EXPECT_EQ(INT_MIN, DWXDate().GetDifference(last));
}

TEST(Date, DifferenceAndComparisons) {
    const DWXDate march(3, 1, 2016), february(2, 1, 2016);
    EXPECT_EQ(29, march.GetDifference(february));
    EXPECT_EQ(-29, february.GetDifference(march));
    EXPECT_EQ(0, march.GetDifference(march));
    EXPECT_EQ(730485, DWXDate(1, 1, 3000).GetDifference(DWXDate(1, 1, 1000)));
    ExpectDate(february, 2, 1, 2016);

    // Year before month before day, as signed numbers.
    const DWXDate ordered[] = {DWXDate(12, 31, 1999), DWXDate(1, 1, 2000), DWXDate(1, 2, 2000),
                               DWXDate(2, 1, 2000), DWXDate(1, 1, 2001)};
    for (int i = 0; i < 5; ++i) {
        for (int j = 0; j < 5; ++j) {
            const DWXDate& a = ordered[i];
            const DWXDate& b = ordered[j];
            EXPECT_EQ(i == j, a == b);
            EXPECT_EQ(i != j, a != b);
            EXPECT_EQ(i < j, a < b);
            EXPECT_EQ(i <= j, a <= b);
            EXPECT_EQ(i > j, a > b);
            EXPECT_EQ(i >= j, a >= b);
        }
    }
    EXPECT_EQ(1, Quiet(1, 1, -5) < DWXDate());
}

TEST(Date, GetString) {
    EXPECT_EQ("January 1, 1", Text(DWXDate()));
    EXPECT_EQ("July 4, 1776", Text(DWXDate(7, 4, 1776)));
    EXPECT_EQ("zero 5, 2016", Text(Quiet(0, 5, 2016)));
    EXPECT_EQ("invalid 5, 2016", Text(Quiet(13, 5, 2016)));
    EXPECT_EQ("invalid 5, 2016", Text(Quiet(INT_MIN, 5, 2016)));

    // A caller's buffer gets the whole text, the static buffer at most 23 characters.
    const DWXDate longest = Quiet(9, INT_MIN, INT_MIN);
    char buffer[64];
    EXPECT_EQ(buffer, longest.GetString(buffer));
    EXPECT_STREQ("September -2147483648, -2147483648", buffer);
    char* shared = longest.GetString(nullptr);
    EXPECT_STREQ("September -2147483648, ", shared);
    EXPECT_EQ(shared, DWXDate(12, 25, 2016).GetString());
    EXPECT_STREQ("December 25, 2016", shared);
}

// Dates holding a month outside 1 to 12 never index the month tables and do not move.
TEST(Date, InvalidMonthGuards) {
    const int months[] = {13, -1, INT_MAX, INT_MIN};
    for (int m : months) {
        const DWXDate bad = Quiet(m, 5, 2016);
        DWXDate date = bad;
        EXPECT_TRUE(++date == bad);
        EXPECT_TRUE(--date == bad);
        date.addDay(100);
        date.addDay(-100);
        date.addDay(INT_MIN);
        EXPECT_TRUE(date == bad);
        EXPECT_EQ(0, bad.GetDayOfYear());
        EXPECT_EQ(0, bad.GetDifference(DWXDate(3, 1, 2016)));
        EXPECT_EQ(0, DWXDate(3, 1, 2016).GetDifference(bad));
    }
    EXPECT_EQ(0, Quiet(0, 5, 2016).GetDayOfYear());
}

// addDay on a date with a day outside its month or a year below 1 gives what
// the same number of single steps gives.
TEST(Date, AddDayOnOddDatesMatchesSingleSteps) {
    const DWXDate starts[] = {Quiet(12, 32, 2015), Quiet(2, 30, 2016), Quiet(3, 0, 2016),
                              Quiet(3, -3, 2016),  Quiet(1, 1, 0),     Quiet(6, 15, -3),
                              Quiet(1, 3, 1),      Quiet(1, 0, 1)};
    for (const DWXDate& start : starts) {
        for (int days = 1; days <= 1500; days += (days < 40 ? 1 : 37)) {
            DWXDate stepped = start;
            for (int i = 0; i < days; ++i) {
                ++stepped;
            }
            DWXDate forward = start;
            forward.addDay(days);
            ASSERT_TRUE(forward == stepped)
                << Text(start) << " + " << days << ": " << Text(forward) << " vs " << Text(stepped);
            stepped = start;
            for (int i = 0; i < days; ++i) {
                --stepped;
            }
            DWXDate backward = start;
            backward.addDay(-days);
            ASSERT_TRUE(backward == stepped) << Text(start) << " - " << days << ": "
                                             << Text(backward) << " vs " << Text(stepped);
        }
    }
    // Days past the month's end count on in differences.
    EXPECT_EQ(31, Quiet(12, 32, 2015).GetDifference(DWXDate(12, 1, 2015)));
    EXPECT_EQ(1, Quiet(12, 32, 2015).GetDifference(DWXDate(12, 31, 2015)));
    EXPECT_EQ(-366, Quiet(1, 1, 0).GetDifference(DWXDate()));
}

#if !defined(_WIN32)
TEST(Date, SetTodayReadsDayMonthYear) {
    ReportCapture capture;
    DWXDate date(7, 4, 1776);
    gTimeText = "25-12-2016";
    date.SetToday();
    EXPECT_EQ(10, gTimeKind);
    ExpectDate(date, 12, 25, 2016);
    EXPECT_TRUE(capture.Messages().empty());

    gTimeText = "31-2-2016";
    date.SetToday();
    EXPECT_EQ(Texts{Day(2, 31, 2016)}, capture.Messages());
    ExpectDate(date, 2, 31, 2016);

    // A text without three numbers leaves the date alone.
    const char* const broken[] = {"", "today", "25-12", "25/12/2016", nullptr};
    for (const char* text : broken) {
        date = DWXDate(7, 4, 1776);
        gTimeText = text;
        date.SetToday();
        ExpectDate(date, 7, 4, 1776);
    }
    EXPECT_TRUE(capture.Messages().empty());
}
#endif
