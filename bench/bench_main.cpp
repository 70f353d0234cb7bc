// The micro-benchmarks: each pair registers our contender and the peer's under
// one family name ("Base64Encode/ours", "Base64Encode/openssl"); a peer whose
// library was not found at configure time is simply not registered.
#include "bench_register.h"

#include <benchmark/benchmark.h>

#include <malloc.h>

int main(int argc, char** argv) {
    // Large blocks come from the heap and stay there after free, so that an
    // iteration reuses the pages of the one before it instead of faulting in
    // fresh ones: the codecs and containers are measured, not the kernel.
    // The setting holds for every contender alike.
    mallopt(M_MMAP_MAX, 0);
    mallopt(M_TRIM_THRESHOLD, 1 << 30);

    dwxbench::RegisterTreeBenchmarks();
    dwxbench::RegisterBase64Benchmarks();
    dwxbench::RegisterStringBenchmarks();
    dwxbench::RegisterContainerBenchmarks();
    dwxbench::RegisterDateBenchmarks();
    dwxbench::RegisterCmdLineBenchmarks();

    benchmark::Initialize(&argc, argv);
    if (benchmark::ReportUnrecognizedArguments(argc, argv)) {
        return 1;
    }
    benchmark::RunSpecifiedBenchmarks();
    benchmark::Shutdown();
    return 0;
}
