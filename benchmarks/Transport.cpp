// SPDX-License-Identifier: Apache-2.0

/** A call from one process to another, compared with the least that any transport takes. */
#include "support/Child.h"
#include "support/TemporaryDirectory.h"

#include <benchmark/benchmark.h>
#include <sys/socket.h>
#include <vendor/velmora/hardware/vibrator/2.1/IDaxVibrator.h>

#include <cstdlib>
#include <memory>
#include <vector>

namespace {

using ::android::hardware::vibrator::V1_0::EffectStrength;
using ::android::hardware::vibrator::V1_0::Status;
using ::android::hardware::vibrator::V1_1::Effect_1_1;
using ::vendor::velmora::hardware::vibrator::V2_1::IDaxVibrator;

/** The daemon, and a directory for its socket. */
class Server {
  public:
    Server() {
        setenv("HWBINDER_DIR", mDirectory.path().c_str(), 1);
        mChild.emplace_back(new Child([] { execl(SERVICE, SERVICE, nullptr); }));
        while (IDaxVibrator::tryGetService() == nullptr) {
        }
    }

  private:
    TemporaryDirectory mDirectory;
    std::vector<std::unique_ptr<Child>> mChild;
};

/** Calls an operation that does not access the driver. */
void callOnce(IDaxVibrator& vibrator) {
    Status answer = Status::OK;
    vibrator.perform_1_1(Effect_1_1::CLICK, EffectStrength::LIGHT,
                         [&](Status status, uint32_t /* lengthMs */) { answer = status; });
    if (answer != Status::UNSUPPORTED_OPERATION) abort();
}

void call(benchmark::State& state) {
    const Server server;
    const auto vibrator = IDaxVibrator::tryGetService();
    for (auto _ : state)
        callOnce(*vibrator);
}
BENCHMARK(call)->UseRealTime();

/** Calls by a number of connected clients, one after the other. */
void callOfManyClients(benchmark::State& state) {
    const Server server;
    std::vector<android::sp<IDaxVibrator>> clients;
    for (int64_t i = 0; i < state.range(0); ++i) {
        clients.push_back(IDaxVibrator::tryGetService());
        callOnce(*clients.back());
    }
    size_t next = 0;
    for (auto _ : state) {
        callOnce(*clients[next]);
        next = (next + 1) % clients.size();
    }
}
BENCHMARK(callOfManyClients)->Name("clients")->Arg(1)->Arg(64)->UseRealTime();

/** Calls to a daemon that has already answered a number of calls. */
void callAfterManyCalls(benchmark::State& state) {
    const Server server;
    const auto vibrator = IDaxVibrator::tryGetService();
    for (int64_t i = 0; i < state.range(0); ++i)
        callOnce(*vibrator);
    for (auto _ : state)
        callOnce(*vibrator);
}
BENCHMARK(callAfterManyCalls)->Name("calls")->Arg(1)->Arg(100'000)->UseRealTime();

/** Only messages of the same sizes in both directions. */
void callFloor(benchmark::State& state) {
    constexpr size_t kRequest = 72;
    constexpr size_t kReply = 32;
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
