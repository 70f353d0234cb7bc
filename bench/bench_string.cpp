// DWXString: a million single-character appends to a new string against
// std::string, and Format against snprintf into a buffer and into a
// std::string sized by a first snprintf.
#include "bench_register.h"

#include <dwxcore/dwxstring.h>

#include <benchmark/benchmark.h>

#include <stdio.h>

#include <string>

namespace dwxbench {
namespace {

constexpr int kAppends = 1 << 20;

char CharAt(int i) {
    return static_cast<char>('a' + (i & 15));
}

void AppendOurs(benchmark::State& state) {
    for (auto _ : state) {
        DWXString text;
        for (int i = 0; i < kAppends; ++i) {
            text += CharAt(i);
        }
        benchmark::DoNotOptimize(text.GetLength());
    }
    state.SetItemsProcessed(state.iterations() * kAppends);
}

void AppendStd(benchmark::State& state) {
    for (auto _ : state) {
        std::string text;
        for (int i = 0; i < kAppends; ++i) {
            text += CharAt(i);
        }
        benchmark::DoNotOptimize(text.data());
    }
    state.SetItemsProcessed(state.iterations() * kAppends);
}

// One short formatted line with a text, an integer and a double.
#define DWXBENCH_FORMAT "%s[%d] = %.3f;"
const char* const kKey = "window.width";

void FormatOurs(benchmark::State& state) {
    int i = 0;
    for (auto _ : state) {
        DWXString text;
        text.Format(DWXBENCH_FORMAT, kKey, i, i * 0.5);
        benchmark::DoNotOptimize(text.GetLength());
        ++i;
    }
}

void FormatSnprintf(benchmark::State& state) {
    int i = 0;
    for (auto _ : state) {
        char text[128];
        int length = snprintf(text, sizeof text, DWXBENCH_FORMAT, kKey, i, i * 0.5);
        benchmark::DoNotOptimize(length);
        benchmark::DoNotOptimize(text);
        ++i;
    }
}

void FormatStdString(benchmark::State& state) {
    int i = 0;
    for (auto _ : state) {
        std::string text;
        int length = snprintf(nullptr, 0, DWXBENCH_FORMAT, kKey, i, i * 0.5);
        text.resize(static_cast<size_t>(length));
        snprintf(&text[0], text.size() + 1, DWXBENCH_FORMAT, kKey, i, i * 0.5);
        benchmark::DoNotOptimize(text.data());
        ++i;
    }
}

}  // namespace

void RegisterStringBenchmarks() {
    benchmark::RegisterBenchmark("StringAppend/ours", AppendOurs)->Unit(benchmark::kMillisecond);
    benchmark::RegisterBenchmark("StringAppend/std", AppendStd)->Unit(benchmark::kMillisecond);
    benchmark::RegisterBenchmark("StringFormat/ours", FormatOurs);
    benchmark::RegisterBenchmark("StringFormat/snprintf", FormatSnprintf);
    benchmark::RegisterBenchmark("StringFormat/std", FormatStdString);
}

}  // namespace dwxbench
