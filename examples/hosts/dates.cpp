// DWXDate: a calendar date with stepping and differences. Invalid values are
// reported through the error handler and stored all the same.
#include <dwxcore/dwxdate.h>
#include <services/utilhub.h>

#include <stdio.h>

static void OnReport(int code, int /*severity*/, const char* message) {
    printf("report %d: %s", code, message);
}

int main() {
    IMPSetErrorHandler(OnReport);
    DWXDate taken(7, 4, 2024);
    DWXDate shown = taken;
    shown.addDay(60);
    char text[40];
    printf("taken %s, ", taken.GetString(text));
    printf("shown %s, %d days later, day %d of the year\n", shown.GetString(text),
           shown.GetDifference(taken), shown.GetDayOfYear());
    printf("2024 is a leap year: %d\n", DWXDate::LeapYear(2024));

    DWXDate wrong(2, 30, 2023);  // reported, then kept
    printf("kept day %d\n", wrong.GetDay());
    return 0;
}
