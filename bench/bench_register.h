// Registration of the benchmark families, one function per source file.
#pragma once

namespace dwxbench {

void RegisterTreeBenchmarks();
void RegisterBase64Benchmarks();
void RegisterStringBenchmarks();
void RegisterContainerBenchmarks();
void RegisterDateBenchmarks();
void RegisterCmdLineBenchmarks();

}  // namespace dwxbench
