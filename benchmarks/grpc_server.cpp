// SPDX-License-Identifier: Apache-2.0
#include "vibrator.grpc.pb.h"

#include <grpcpp/grpcpp.h>

namespace {

class Vibrator : public benchmarks::Vibrator::Service {
    grpc::Status On(grpc::ServerContext* /* context */, const benchmarks::OnRequest* request,
                    benchmarks::OnReply* reply) override {
        reply->set_status(request->timeout_ms() % 4);
        return grpc::Status::OK;
    }
};

}  // namespace

/** Serves the benchmarks' call over gRPC at the address that is given. */
int main(int argc, char** argv) {
    if (argc != 2) return 2;
    Vibrator vibrator;
    grpc::ServerBuilder builder;
    builder.AddListeningPort(argv[1], grpc::InsecureServerCredentials());
    builder.RegisterService(&vibrator);
    const auto server = builder.BuildAndStart();
    if (server == nullptr) return 1;
    server->Wait();
    return 0;
}
