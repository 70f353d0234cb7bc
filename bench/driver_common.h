// Measurement for the whole-process read drivers: each driver reads one file
// once, frees what it read, and prints one JSON line with the CPU and wall
// time of the read, the CPU time of the free, and the peak resident size of
// the whole process, so that memory is compared process against process.
#pragma once

#include <stdio.h>
#include <stdlib.h>
#include <sys/resource.h>
#include <time.h>
#include <unistd.h>

namespace dwxbench {

inline double CpuSeconds() {
    struct rusage usage;
    getrusage(RUSAGE_SELF, &usage);
    return static_cast<double>(usage.ru_utime.tv_sec + usage.ru_stime.tv_sec) +
           static_cast<double>(usage.ru_utime.tv_usec + usage.ru_stime.tv_usec) / 1e6;
}

inline double WallSeconds() {
    struct timespec now;
    clock_gettime(CLOCK_MONOTONIC, &now);
    return static_cast<double>(now.tv_sec) + static_cast<double>(now.tv_nsec) / 1e9;
}

inline long PeakKilobytes() {
    struct rusage usage;
    getrusage(RUSAGE_SELF, &usage);
    return usage.ru_maxrss;  // kilobytes on Linux
}

// Times one read and then the release of what it built. `read` returns the
// number of items it saw (lines or nodes), or -1 when it failed; `check`
// runs between the two, untimed (it may print a count to stderr); `release`
// frees everything the read built.
template <typename Read, typename Check, typename Release>
int RunDriver(const char* driver, const char* path, Read read, Check check, Release release) {
    double cpu = CpuSeconds();
    double wall = WallSeconds();
    long items = read(path);
    cpu = CpuSeconds() - cpu;
    wall = WallSeconds() - wall;
    if (items < 0) {
        fprintf(stderr, "%s: cannot read %s\n", driver, path);
        return 1;
    }
    // For profiling the read alone: leave before the checks and teardown.
    const char* quit = getenv("DWXBENCH_EXIT_AFTER_READ");
    if (quit && *quit == '1') {
        fflush(stdout);
        _exit(0);
    }
    check();
    double freeCpu = CpuSeconds();
    release();
    freeCpu = CpuSeconds() - freeCpu;
    printf(
        "{\"driver\": \"%s\", \"cpu_s\": %.6f, \"wall_s\": %.6f, \"free_cpu_s\": %.6f, "
        "\"maxrss_kb\": %ld, \"items\": %ld}\n",
        driver, cpu, wall, freeCpu, PeakKilobytes(), items);
    return 0;
}

}  // namespace dwxbench
