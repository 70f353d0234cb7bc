#include "../fuzz/date_model.h"
#include "report_capture.h"

#include <services/rtprim.h>

#include <gtest/gtest.h>

#include <string.h>

#include <random>
#include <string>
#include <vector>

namespace {

using Texts = std::vector<std::string>;

Texts Take(ReportCapture& capture) {
    const Texts texts = capture.Texts();
    capture.Clear();
    return texts;
}

std::string Invalid(const char* field, int m, int d, int y) {
    return std::string("100/0 Invalid ") + field +
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
// has the next day number and passes the model's checks, among them the jump
// back by one day, which rebuilds the date from its day number.
TEST(DateModel, EveryDayFromYear1To3000) {
    DateModel model;
    int64_t count = 0;
    for (DWXDate date; date.GetYear() <= 3000; ++date, ++count) {
        ASSERT_EQ(count, DateModel::Number(date)) << Fields(date);
        DateModel::CheckValid(date, DWXDate(), -1);
    }
    EXPECT_EQ(1095727, count);  // 7.5 cycles of 400 years
    EXPECT_EQ(0, DateModel::Reports());
}

TEST(DateModel, SeededRunsAndTheEndsOfTheRange) {
    DateModel model;
    std::mt19937 random(400);
    for (int run = 0; run < 2000; ++run) {
        std::vector<uint8_t> bytes(256);
        for (uint8_t& byte : bytes) {
            byte = static_cast<uint8_t>(random());
        }
        FuzzInput input(bytes.data(), bytes.size());
        DateModel::Run(input);
    }
    // Stepping and jumps stop at the ends, and differences saturate.
    const DWXDate first, last(12, 31, INT_MAX);
    DateModel::CheckValid(first, last, INT_MIN);
    DateModel::CheckValid(last, first, 1000);
    DateModel::CheckValid(DWXDate(1, 1, 2016), last, INT_MIN);
    DateModel::CheckValid(DWXDate(3, 1, 2000), first, INT_MAX);
}

// Invalid values are reported with code 100 and severity 0, then stored; each
// report names the fields stored at the time of its check.
TEST(Date, ReportsNameTheDateAndStoreAnyway) {
    ReportCapture capture;
    DWXDate(2, 29, 1900);
    DWXDate date(0, 0, 0);
    EXPECT_EQ((Texts{Invalid("Day", 2, 29, 1900), Invalid("Month", 0, 0, 0),
                     Invalid("Year", 0, 0, 0), Invalid("Day", 0, 0, 0)}),
              Take(capture));
    date = DWXDate(3, 5, 2016);
    date.SetMonth(13);
    date.SetDate(13, 40, -1);
    EXPECT_EQ("13/40/-1", Fields(date));
    date = DWXDate(2, 10, 2016);
    date.SetDay(30);
    date.SetYear(0);
    date.SetDayOfYear(400);
    EXPECT_EQ(
        (Texts{Invalid("Month", 13, 5, 2016), Invalid("Month", 13, 5, 2016),
               Invalid("Year", 13, 5, -1), Invalid("Day", 13, 40, -1), Invalid("Day", 2, 30, 2016),
               Invalid("Year", 2, 30, 0), Invalid("Day", 12, 65, 0)}),
        Take(capture));

    // The message format goes through translation before it is filled in.
    RTMessageCatalogue previous = RTSetMessageCatalogue([](const char* message) -> const char* {
        return strncmp(message, "Invalid Year", 12) == 0 ? "Jahr? %d/%d/%d" : nullptr;
    });
    DWXDate(7, 4, -3);
    RTSetMessageCatalogue(previous);
    EXPECT_EQ(Texts{"100/0 Jahr? 7/4/-3"}, Take(capture));
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
