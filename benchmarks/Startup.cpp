// SPDX-License-Identifier: Apache-2.0

/** The real daemon, from exec to its first answer. */
#include "Child.h"
#include "support/TemporaryDirectory.h"

#include <benchmark/benchmark.h>
#include <vendor/velmora/hardware/vibrator/2.1/IDaxVibrator.h>

#include <chrono>
#include <cstdlib>
#include <string>

namespace {

using ::vendor::velmora::hardware::vibrator::V2_1::IDaxVibrator;

void startUp(benchmark::State& state) {
    const TemporaryDirectory directory;
    setenv("HWBINDER_DIR", directory.path().c_str(), 1);
    const std::string socket = directory.path() + "/" + IDaxVibrator::descriptor + ".default";
    for (auto _ : state) {
        unlink(socket.c_str());
        const auto start = std::chrono::steady_clock::now();
        const Child daemon([] { execl(SERVICE, SERVICE, nullptr); });
        // A cheap check, since both processes share the processor.
        while (access(socket.c_str(), F_OK) != 0)
            usleep(20);
        for (android::sp<IDaxVibrator> vibrator; vibrator == nullptr || !vibrator->off().isOk();)
            vibrator = IDaxVibrator::tryGetService();
        // Not counting the daemon's end, at the end of the scope.
        const std::chrono::duration<double> time = std::chrono::steady_clock::now() - start;
        state.SetIterationTime(time.count());
    }
}
BENCHMARK(startUp)->UseManualTime();

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
