// SPDX-License-Identifier: Apache-2.0

/** Each operation, in process, beside the bare system calls that it makes. */
#include "support/Operations.h"

#include "PrivateSysfs.h"
#include "Vibrator.h"

#include <benchmark/benchmark.h>
#include <fcntl.h>
#include <unistd.h>

#include <cstdlib>
#include <fstream>
#include <memory>

namespace {

using namespace ::vendor::velmora::hardware::vibrator::V2_1::implementation;
using simulator::Layout;

const std::string kDirectory = simulator::sysfsDirectory(Layout::kLedTrigger);

/** Makes the nodes anew, as the operation expects them. */
void prepare(const Operation& operation) {
    simulator::Features features;
    for (const std::string& name : simulator::featureNames())
        features.names.insert(name);
    if (simulator::createDriver("", Layout::kLedTrigger, features) != 0) abort();
    std::ofstream(kDirectory + "motor_type") << operation.motor;
}

void runOperation(benchmark::State& state, const Operation& operation) {
    prepare(operation);
    const android::sp<Vibrator> vibrator = new Vibrator;
    if (operation.call(*vibrator).inWords() != operation.answer) {
        state.SkipWithError("the answer is not the operation's");
        return;
    }
    prepare(operation);
    for (auto _ : state) {
        benchmark::DoNotOptimize(operation.call(*vibrator));
    }
}

void runFloor(benchmark::State& state, const Operation& operation) {
    prepare(operation);
    std::vector<std::string> paths;
    for (const Access& access : operation.accesses)
        paths.push_back(kDirectory + access.leaf);
    for (auto _ : state) {
        for (size_t i = 0; i < paths.size(); ++i) {
            const Access& access = operation.accesses[i];
            const int file = open(paths[i].c_str(), access.mode);
            char text[512];
            if (access.kind == Access::kRead && read(file, text, access.size) < 0) abort();
            if (access.kind == Access::kWrite &&
                write(file, access.text.data(), access.text.size()) < 0) {
                abort();
            }
            close(file);
        }
    }
}

}  // namespace

void registerOperations() {
    for (const Operation& operation : allOperations(Layout::kLedTrigger)) {
        const std::string name = "operation/" + operation.name;
        benchmark::RegisterBenchmark(name.c_str(), runOperation, operation);
        benchmark::RegisterBenchmark((name + "/floor").c_str(), runFloor, operation);
    }
}
