// DWXCmdLine on a 50-argument vector, for reference: seven options with six
// values each after the program name.
#include "bench_register.h"

#include <dwxcore/dwxcmdline.h>

#include <benchmark/benchmark.h>

#include <string>
#include <vector>

namespace dwxbench {
namespace {

void ParseOurs(benchmark::State& state) {
    std::vector<std::string> words{"program"};
    for (int option = 0; option < 7; ++option) {
        words.push_back("-option" + std::to_string(option));
        for (int value = 0; value < 6; ++value) {
            words.push_back("value" + std::to_string(option * 6 + value));
        }
    }
    std::vector<const char*> vector;
    for (const std::string& word : words) {
        vector.push_back(word.c_str());
    }
    for (auto _ : state) {
        DWXCmdLine line(static_cast<int>(vector.size()), vector.data());
        benchmark::DoNotOptimize(&line);
    }
    state.counters["arguments"] = static_cast<double>(vector.size());
}

}  // namespace

void RegisterCmdLineBenchmarks() {
    benchmark::RegisterBenchmark("CmdLine/ours", ParseOurs)->Unit(benchmark::kMicrosecond);
}

}  // namespace dwxbench
