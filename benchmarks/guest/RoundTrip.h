// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <sched.h>

#include <cstdio>
#include <ctime>

/**
 * Prints how many instructions a round trip takes, as "NAME<tab>INSTRUCTIONS": the user's and the
 * kernel's, of both processes. Only right in a machine whose clock counts instructions.
 */
template <typename Function>
void measure(const char* name, Function roundTrip) {
    constexpr int kCount = 5000;
    const auto now = [] {
        timespec time{};
        clock_gettime(CLOCK_MONOTONIC, &time);
        return static_cast<double>(time.tv_sec) * 1e9 + static_cast<double>(time.tv_nsec);
    };
    // What is done once, for the first calls, does not count.
    for (int i = 0; i < kCount / 5; ++i)
        roundTrip();
    const double start = now();
    for (int i = 0; i < kCount; ++i)
        roundTrip();
    std::printf("%s\t%.0f\n", name, (now() - start) / kCount);
}
