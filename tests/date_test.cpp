#include "../fuzz/date_model.h"

#include <services/rtprim.h>

#include <gtest/gtest.h>

#include <string.h>

#include <algorithm>
#include <functional>
#include <random>
#include <string>
#include <utility>
#include <vector>

namespace {

using Texts = std::vector<std::string>;

std::string Invalid(const char* field, int m, int d, int y) {
    return "Invalid " + std::string(field) +
           " for DWXDate Object (month, day, year):  " + std::to_string(m) + " " +
           std::to_string(d) + " " + std::to_string(y) + ".\n";
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
// back by one day, which rebuilds the date from its day number. Seeded runs
// and the ends of the range follow.
TEST(DateModel, EveryDayFromYear1To3000SeededRunsAndTheEnds) {
    DateModel model;
    int64_t count = 0;
    for (DWXDate date; date.GetYear() <= 3000; ++date, ++count) {
        ASSERT_EQ(count, DateModel::Number(date)) << date.GetString();
        DateModel::CheckValid(date, DWXDate(), -1);
    }
    EXPECT_EQ(1095727, count);  // 7.5 cycles of 400 years
    std::mt19937 random(400);
    std::vector<uint8_t> bytes(1 << 19);
    std::generate(bytes.begin(), bytes.end(), std::ref(random));
    FuzzInput input(bytes.data(), bytes.size());
    DateModel::Run(input);
    const DWXDate first, last(12, 31, INT_MAX);
    DateModel::CheckValid(first, last, INT_MIN);
    DateModel::CheckValid(last, first, 1000);
}

// Invalid values are reported with code 100 and severity 0, then stored; each
// report names the fields stored at the time of its check.
TEST(Date, ReportsNameTheDateAndStoreAnyway) {
    DateModel model;
    DWXDate date(0, 0, 0);
    date = DWXDate(2, 10, 2016);
    date.SetMonth(13);
    date.SetDay(30);
    date.SetYear(0);
    date.SetDayOfYear(400);
    date.SetDayOfYear(0);
    EXPECT_EQ(
        (Texts{Invalid("Month", 0, 0, 0), Invalid("Year", 0, 0, 0), Invalid("Day", 0, 0, 0),
               Invalid("Month", 13, 10, 2016), Invalid("Day", 13, 30, 2016),
               Invalid("Year", 13, 30, 0), Invalid("Day", 12, 65, 0), Invalid("Day", 1, 0, 0)}),
        std::exchange(DateModel::reports, {}));

    // The message format goes through translation before it is filled in.
    RTMessageCatalogue previous = RTSetMessageCatalogue([](const char* message) -> const char* {
        return strncmp(message, "Invalid Year", 12) == 0 ? "Jahr? %d/%d/%d" : nullptr;
    });
    DWXDate(7, 4, -3);
    RTSetMessageCatalogue(previous);
    EXPECT_EQ(Texts{"Jahr? 7/4/-3"}, DateModel::reports);
}

#if !defined(_WIN32)
TEST(Date, SetTodayReadsDayMonthYear) {
    DateModel model;
    DWXDate date;
    gTimeText = "31-2-2016";
    date.SetToday();
    EXPECT_EQ(Texts{Invalid("Day", 2, 31, 2016)}, std::exchange(DateModel::reports, {}));
    // A text without three numbers that fit an int leaves the date alone.
    for (const char* text :
         {"", "25-12", "25/12/2016", "1-1-4294967297", static_cast<const char*>(nullptr)}) {
        gTimeText = text;
        date.SetToday();
        EXPECT_STREQ("February 31, 2016", date.GetString()) << (text ? text : "null");
    }
    EXPECT_TRUE(DateModel::reports.empty());
}
#endif
