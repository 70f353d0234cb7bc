// DWXDate::GetDifference of dates a thousand years apart against the
// reference date library's sys_days subtraction. Both sides start from a
// stored year, month and day, as a DWXDate holds them.
#include "bench_register.h"

#include <dwxcore/dwxdate.h>

#include <benchmark/benchmark.h>

#include <vector>

#if DWXBENCH_HAVE_DATE
#include <date/date.h>
#endif

namespace dwxbench {
namespace {

constexpr int kPairs = 1024;

struct Ymd {
    int year;
    int month;
    int day;
};

// The earlier date of each pair; the later one is a thousand years on.
const std::vector<Ymd>& Dates() {
    static const std::vector<Ymd> dates = [] {
        std::vector<Ymd> list;
        for (int i = 0; i < kPairs; ++i) {
            list.push_back({1000 + (i * 7) % 1000, 1 + i % 12, 1 + (i * 5) % 28});
        }
        return list;
    }();
    return dates;
}

void DifferenceOurs(benchmark::State& state) {
    std::vector<DWXDate> early;
    std::vector<DWXDate> late;
    for (const Ymd& d : Dates()) {
        early.emplace_back(d.month, d.day, d.year);
        late.emplace_back(d.month, d.day, d.year + 1000);
    }
    for (auto _ : state) {
        long sum = 0;
        for (int i = 0; i < kPairs; ++i) {
            sum += late[i].GetDifference(early[i]);
        }
        benchmark::DoNotOptimize(sum);
    }
    state.SetItemsProcessed(state.iterations() * kPairs);
}

#if DWXBENCH_HAVE_DATE
void DifferenceDate(benchmark::State& state) {
    std::vector<date::year_month_day> early;
    std::vector<date::year_month_day> late;
    for (const Ymd& d : Dates()) {
        early.emplace_back(date::year{d.year}, date::month(d.month), date::day(d.day));
        late.emplace_back(date::year{d.year + 1000}, date::month(d.month), date::day(d.day));
    }
    for (auto _ : state) {
        long sum = 0;
        for (int i = 0; i < kPairs; ++i) {
            sum += (date::sys_days(late[i]) - date::sys_days(early[i])).count();
        }
        benchmark::DoNotOptimize(sum);
    }
    state.SetItemsProcessed(state.iterations() * kPairs);
}
#endif

}  // namespace

void RegisterDateBenchmarks() {
    benchmark::RegisterBenchmark("DateDifference/ours", DifferenceOurs)
        ->Unit(benchmark::kMicrosecond);
#if DWXBENCH_HAVE_DATE
    benchmark::RegisterBenchmark("DateDifference/date", DifferenceDate)
        ->Unit(benchmark::kMicrosecond);
#endif
}

}  // namespace dwxbench
