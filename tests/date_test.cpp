#include "../fuzz/date_model.h"
#include "report_capture.h"

#include <services/rtprim.h>

#include <gtest/gtest.h>

#include <random>
#include <string>
#include <vector>

namespace {

using Texts = std::vector<std::string>;

// The texts of the reports so far, each checked for the date's code and severity.
Texts Take(ReportCapture& capture) {
    Texts texts;
    for (const CapturedReport& report : capture.Take()) {
        texts.push_back(report.code == 100 && report.severity == 0 ? report.message
                                                                   : "unexpected code or severity");
    }
    return texts;
}

std::string Invalid(const char* field, int m, int d, int y) {
    return std::string("Invalid ") + field +
           " for DWXDate Object (month, day, year):  " + std::to_string(m) + " " +
           std::to_string(d) + " " + std::to_string(y) + ".\n";
}

std::string Fields(const DWXDate& date) {
    return std::to_string(date.GetMonth()) + "/" + std::to_string(date.GetDay()) + "/" +
           std::to_string(date.GetYear());
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

// Every day from 1 January of year 1 to the end of year 3000, reached with ++,
// is the next day number, and each is checked against the model, including
// the jump back by one day, which rebuilds the date from its day number.
TEST(DateModel, EveryDayFromYear1To3000) {
    date_model::CountingReports reports;
    int64_t count = 0;
    for (DWXDate date; date.GetYear() <= 3000; ++date, ++count) {
        ASSERT_EQ(count, date_model::Number(date)) << Fields(date);
        date_model::CheckValid(date, DWXDate(), -1);
    }
    EXPECT_EQ(1095727, count);  // 7.5 cycles of 400 years
    EXPECT_EQ(0, date_model::Reports());
}

TEST(DateModel, SeededRuns) {
    date_model::CountingReports reports;
    std::mt19937 random(400);
    for (int run = 0; run < 2000; ++run) {
        std::vector<uint8_t> bytes(256);
        for (uint8_t& byte : bytes) {
            byte = static_cast<uint8_t>(random());
        }
        FuzzInput input(bytes.data(), bytes.size());
        date_model::Run(input);
    }
}

// The ends of the range: stepping and jumps stop there, differences saturate.
TEST(DateModel, EndsOfTheRange) {
    const DWXDate first, last(12, 31, INT_MAX);
    date_model::CheckValid(first, last, -1);
    date_model::CheckValid(first, DWXDate(1, 1, 2), INT_MIN);
    date_model::CheckValid(last, first, 1000);
    date_model::CheckValid(DWXDate(1, 1, 2016), last, INT_MIN);
    date_model::CheckValid(DWXDate(3, 1, 2000), first, INT_MAX);
}

// Invalid values are reported with code 100 and severity 0, then stored.
TEST(Date, ReportsNameTheDateAndStoreAnyway) {
    struct Row {
        int m, d, y;
        Texts reports;
    } rows[] = {
        {2, 29, 2000, {}},
        {2, 29, 1900, {Invalid("Day", 2, 29, 1900)}},
        {13, 5, 2016, {Invalid("Month", 13, 5, 2016), Invalid("Day", 13, 5, 2016)}},
        {0, 0, 0, {Invalid("Month", 0, 0, 0), Invalid("Year", 0, 0, 0), Invalid("Day", 0, 0, 0)}},
    };
    ReportCapture capture;
    for (const Row& row : rows) {
        DWXDate date(row.m, row.d, row.y);
        EXPECT_EQ(row.reports, Take(capture)) << row.m << " " << row.d << " " << row.y;
    }

    // Setters report with the fields stored at the time of each check.
    DWXDate date(3, 5, 2016);
    date.SetMonth(13);
    EXPECT_EQ(Texts{Invalid("Month", 13, 5, 2016)}, Take(capture));
    date.SetDate(13, 40, -1);
    EXPECT_EQ((Texts{Invalid("Month", 13, 5, 2016), Invalid("Year", 13, 5, -1),
                     Invalid("Day", 13, 40, -1)}),
              Take(capture));
    EXPECT_EQ("13/40/-1", Fields(date));
    date = DWXDate(2, 10, 2016);
    date.SetDay(30);
    date.SetYear(0);
    date.SetDayOfYear(400);
    EXPECT_EQ(
        (Texts{Invalid("Day", 2, 30, 2016), Invalid("Year", 2, 30, 0), Invalid("Day", 12, 65, 0)}),
        Take(capture));

    // The message format goes through translation before it is filled in.
    RTMessageCatalogue previous = RTSetMessageCatalogue([](const char* message) -> const char* {
        return strncmp(message, "Invalid Year", 12) == 0 ? "Jahr? %d/%d/%d" : nullptr;
    });
    DWXDate(7, 4, -3);
    RTSetMessageCatalogue(previous);
    EXPECT_EQ(Texts{"Jahr? 7/4/-3"}, Take(capture));
}

#if !defined(_WIN32)
TEST(Date, SetTodayReadsDayMonthYear) {
    ReportCapture capture;
    DWXDate date;
    gTimeText = "31-2-2016";
    date.SetToday();
    EXPECT_EQ("2/31/2016", Fields(date));
    EXPECT_EQ(Texts{Invalid("Day", 2, 31, 2016)}, Take(capture));
    // A text without three numbers leaves the date alone.
    for (const char* text : {"", "today", "25-12", "25-12-", "25/12/2016", "1-x-2",
                             static_cast<const char*>(nullptr)}) {
        gTimeText = text;
        date.SetToday();
        EXPECT_EQ("2/31/2016", Fields(date)) << (text ? text : "null");
    }
    EXPECT_TRUE(capture.Take().empty());
}
#endif
