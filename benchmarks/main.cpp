// SPDX-License-Identifier: Apache-2.0

/**
 * Each subject "NAME" has a floor "NAME/floor", the least that any code doing the same would take.
 * scripts/bench runs them interleaved and prints the ratios.
 */
#include "PrivateSysfs.h"

#include <benchmark/benchmark.h>

#include <cstdio>
#include <cstdlib>

void registerOperations();

int main(int argc, char** argv) {
    // The log is not measured.
    setenv("ANDROID_LOG_TAGS", "*:S", 1);
    benchmark::Initialize(&argc, argv);
    if (benchmark::ReportUnrecognizedArguments(argc, argv)) return 2;
    if (enterPrivateSysfs()) {
        registerOperations();
    } else {
        std::perror("the operations are not measured, for want of a private /sys/class");
    }
    benchmark::RunSpecifiedBenchmarks();
    return 0;
}
