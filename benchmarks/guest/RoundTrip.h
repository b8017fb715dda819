// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <sched.h>

#include <cstdio>
#include <ctime>

/**
 * Prints how many instructions a round trip takes, in user and kernel code of both processes, as
 * "NAME<tab>INSTRUCTIONS". Correct only in a machine whose clock counts instructions.
 */
template <typename Function>
void measure(const char* name, Function roundTrip) {
    constexpr int kCount = 5000;
    const auto now = [] {
        timespec time{};
        clock_gettime(CLOCK_MONOTONIC, &time);
        return static_cast<double>(time.tv_sec) * 1e9 + static_cast<double>(time.tv_nsec);
    };
    // The first calls are not counted, since they also set things up.
    for (int i = 0; i < kCount / 5; ++i)
        roundTrip();
    const double start = now();
    for (int i = 0; i < kCount; ++i)
        roundTrip();
    std::printf("%s\t%.0f\n", name, (now() - start) / kCount);
}
