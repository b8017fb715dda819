// SPDX-License-Identifier: Apache-2.0

/** The real daemon, from exec to its first answer, beside the same by bare system calls. */
#include "support/Child.h"
#include "support/TemporaryDirectory.h"

#include <benchmark/benchmark.h>
#include <sys/socket.h>
#include <sys/un.h>
#include <vendor/velmora/hardware/vibrator/2.1/IDaxVibrator.h>

#include <chrono>
#include <cstdio>
#include <cstdlib>
#include <string>

namespace {

using ::vendor::velmora::hardware::vibrator::V2_1::IDaxVibrator;

/** Starts a program, again and again, and waits each time until it answers at the socket. */
template <typename Answers>
void start(benchmark::State& state, const char* program, const std::string& socket,
           Answers answers) {
    for (auto _ : state) {
        unlink(socket.c_str());
        const auto begin = std::chrono::steady_clock::now();
        const Child child([&] { execl(program, program, socket.c_str(), nullptr); });
        // A cheap check, since both processes share the processor.
        while (access(socket.c_str(), F_OK) != 0)
            usleep(20);
        if (!answers()) {
            state.SkipWithError("no answer");
            break;
        }
        // Not counting the program's end, at the end of the scope.
        const std::chrono::duration<double> time = std::chrono::steady_clock::now() - begin;
        state.SetIterationTime(time.count());
    }
}

void startUp(benchmark::State& state) {
    const TemporaryDirectory directory;
    setenv("HWBINDER_DIR", directory.path().c_str(), 1);
    start(state, SERVICE, directory.path() + "/" + IDaxVibrator::descriptor + ".default", [] {
        const android::sp<IDaxVibrator> vibrator = IDaxVibrator::tryGetService();
        return vibrator != nullptr && vibrator->off().isOk();
    });
}
BENCHMARK(startUp)->UseManualTime();

void startUpFloor(benchmark::State& state) {
    const TemporaryDirectory directory;
    sockaddr_un address{};
    address.sun_family = AF_UNIX;
    snprintf(address.sun_path, sizeof(address.sun_path), "%s/socket", directory.path().c_str());
    start(state, STARTUP_FLOOR, address.sun_path, [&] {
        const int client = socket(AF_UNIX, SOCK_SEQPACKET | SOCK_CLOEXEC, 0);
        char message[64] = {};
        const bool answered = connect(client, reinterpret_cast<const sockaddr*>(&address),
                                      sizeof(address)) == 0 &&
                              send(client, message, sizeof(message), 0) > 0 &&
                              recv(client, message, sizeof(message), 0) > 0;
        close(client);
        return answered;
    });
}
BENCHMARK(startUpFloor)->Name("startUp/floor")->UseManualTime();

}  // namespace
