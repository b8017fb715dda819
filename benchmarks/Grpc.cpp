// SPDX-License-Identifier: Apache-2.0

/** The same call over gRPC on a Unix socket. */
#include "support/Child.h"
#include "support/TemporaryDirectory.h"
#include "vibrator.grpc.pb.h"

#include <benchmark/benchmark.h>
#include <grpcpp/grpcpp.h>

#include <chrono>
#include <cstdlib>

namespace {

void callOverGrpc(benchmark::State& state) {
    const TemporaryDirectory directory;
    const std::string address = "unix:" + directory.path() + "/socket";
    const Child server([&] { execl(GRPC_SERVER, GRPC_SERVER, address.c_str(), nullptr); });
    // Retries soon, so that the server is there before the measurement begins.
    grpc::ChannelArguments arguments;
    arguments.SetInt(GRPC_ARG_INITIAL_RECONNECT_BACKOFF_MS, 10);
    arguments.SetInt(GRPC_ARG_MIN_RECONNECT_BACKOFF_MS, 10);
    const auto channel =
            grpc::CreateCustomChannel(address, grpc::InsecureChannelCredentials(), arguments);
    if (!channel->WaitForConnected(std::chrono::system_clock::now() + std::chrono::seconds(10))) {
        abort();
    }
    const auto vibrator = benchmarks::Vibrator::NewStub(channel);
    benchmarks::OnRequest request;
    request.set_timeout_ms(6);
    for (auto _ : state) {
        grpc::ClientContext context;
        benchmarks::OnReply reply;
        if (!vibrator->On(&context, request, &reply).ok() || reply.status() != 2) abort();
    }
}
BENCHMARK(callOverGrpc)->Name("call/grpc")->UseRealTime();

}  // namespace
