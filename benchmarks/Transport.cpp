// SPDX-License-Identifier: Apache-2.0
#include "support/FakeVibrator.h"

#include <benchmark/benchmark.h>
#include <hidl/HidlTransportSupport.h>
#include <sys/socket.h>
#include <sys/wait.h>
#include <unistd.h>

#include <csignal>
#include <cstdlib>
#include <filesystem>
#include <string>

namespace {

using ::vendor::velmora::hardware::vibrator::V2_1::IDaxVibrator;

/** A child process, killed in the end. */
class Child {
  public:
    template <typename Function>
    explicit Child(Function function) : mPid(fork()) {
        if (mPid == 0) {
            function();
            _exit(0);
        }
    }
    Child(const Child&) = delete;
    Child& operator=(const Child&) = delete;
    ~Child() {
        kill(mPid, SIGKILL);
        waitpid(mPid, nullptr, 0);
    }

  private:
    pid_t mPid;
};

void call(benchmark::State& state) {
    char directory[] = "/tmp/vibrator-bench-XXXXXX";
    if (mkdtemp(directory) == nullptr) abort();
    setenv("HWBINDER_DIR", directory, 1);
    {
        const Child server([] {
            const android::sp<IDaxVibrator> vibrator = new FakeVibrator;
            if (vibrator->registerAsService() != android::OK) _exit(1);
            android::hardware::joinRpcThreadpool();
        });
        android::sp<IDaxVibrator> vibrator;
        do {
            vibrator = IDaxVibrator::getService();
        } while (!vibrator->ping().isOk());
        for (auto _ : state) {
            if (vibrator->on(6) != FakeVibrator::Status::BAD_VALUE) abort();
        }
    }
    std::filesystem::remove_all(directory);
}
BENCHMARK(call)->UseRealTime();

/** Messages of the same sizes to and fro, and nothing else. */
void callFloor(benchmark::State& state) {
    constexpr size_t kRequest = 64;
    constexpr size_t kReply = 16;
    int sockets[2];
    if (socketpair(AF_UNIX, SOCK_SEQPACKET, 0, sockets) != 0) abort();
    const Child echo([&] {
        char message[kRequest];
        while (recv(sockets[1], message, sizeof(message), 0) > 0) {
            if (send(sockets[1], message, kReply, 0) < 0) _exit(1);
        }
    });
    char message[kRequest] = {};
    for (auto _ : state) {
        if (send(sockets[0], message, kRequest, 0) != kRequest ||
            recv(sockets[0], message, kRequest, 0) != kReply) {
            abort();
        }
    }
    close(sockets[0]);
    close(sockets[1]);
}
BENCHMARK(callFloor)->Name("call/floor")->UseRealTime();

}  // namespace
