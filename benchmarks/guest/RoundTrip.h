// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <sched.h>

#include <algorithm>
#include <cstdio>
#include <ctime>
#include <iterator>

/**
 * Prints how many instructions a round trip takes, in user and kernel code of both processes, as
 * "NAME<tab>INSTRUCTIONS". Correct only in a machine whose clock counts instructions.
 */
template <typename Function>
void measure(const char* name, Function roundTrip) {
    constexpr int kRounds = 21;
    constexpr int kCount = 500;
    const auto now = [] {
        timespec time{};
        clock_gettime(CLOCK_MONOTONIC, &time);
        return static_cast<double>(time.tv_sec) * 1e9 + static_cast<double>(time.tv_nsec);
    };
    // The median of many rounds: during the first thousands of calls of two processes the scheduler
    // may switch between them at other places, which takes up to a sixth less or more.
    double times[kRounds];
    for (double& time : times) {
        const double start = now();
        for (int i = 0; i < kCount; ++i)
            roundTrip();
        time = now() - start;
    }
    std::sort(std::begin(times), std::end(times));
    std::printf("%s\t%.0f\n", name, times[kRounds / 2] / kCount);
}
