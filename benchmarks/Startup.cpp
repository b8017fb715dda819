// SPDX-License-Identifier: Apache-2.0

/** The real daemon, from exec to its first answer. */
#include "Child.h"
#include "support/TemporaryDirectory.h"

#include <benchmark/benchmark.h>
#include <vendor/velmora/hardware/vibrator/2.1/IDaxVibrator.h>

#include <cstdlib>

namespace {

using ::vendor::velmora::hardware::vibrator::V2_1::IDaxVibrator;

void startUp(benchmark::State& state) {
    const TemporaryDirectory directory;
    setenv("HWBINDER_DIR", directory.path().c_str(), 1);
    for (auto _ : state) {
        const Child daemon([] { execl(SERVICE, SERVICE, nullptr); });
        while (!IDaxVibrator::getService()->off().isOk())
            usleep(20);
    }
}
BENCHMARK(startUp)->UseRealTime();

/** A program that does nothing, from exec to its end. */
void startUpFloor(benchmark::State& state) {
    for (auto _ : state) {
        const pid_t pid = fork();
        if (pid == 0) {
            execl("/bin/true", "/bin/true", nullptr);
            _exit(1);
        }
        waitpid(pid, nullptr, 0);
    }
}
BENCHMARK(startUpFloor)->Name("startUp/floor")->UseRealTime();

}  // namespace
