// SPDX-License-Identifier: Apache-2.0

/** Each operation, in process, compared with the bare system calls that it makes. */
#include "support/Operations.h"

#include "PrivateSysfs.h"
#include "SimulatedDriver.h"
#include "Vibrator.h"

#include <benchmark/benchmark.h>
#include <fcntl.h>
#include <hwbinder/IPCThreadState.h>
#include <private/android_filesystem_config.h>
#include <unistd.h>

#include <cstdlib>
#include <memory>

namespace {

using namespace ::vendor::velmora::hardware::vibrator::V2_1::implementation;
using namespace tests;
using model::Layout;

const std::string kDirectory = model::sysfsDirectory(Layout::kLedTrigger);

/** Makes the nodes anew, as the operation expects them. @return its accesses of nodes. */
Steps prepare(const Operation& operation) {
    if (simulator::createNodes(std::string(), Layout::kLedTrigger, {}) != 0) abort();
    Steps steps = parseSteps(Layout::kLedTrigger, operation.steps);
    prepareNodes("", Layout::kLedTrigger, steps);
    Steps accesses;
    for (const Step* access : accessesOf(steps))
        accesses.push_back(*access);
    return accesses;
}

void runOperation(benchmark::State& state, const Operation& operation) {
    // A call that is served has a caller; without one the process would be asked for its uid.
    using ::android::hardware::IPCThreadState;
    IPCThreadState::self()->restoreCallingIdentity(
            IPCThreadState::identityToken(AID_SYSTEM, getpid()));
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
    struct Access {
        Step::Kind kind;
        std::string path;
        int mode;
        std::string bytes;
        size_t size;
    };
    std::vector<Access> accesses;
    for (const Step& step : prepare(operation)) {
        accesses.push_back({step.kind, kDirectory + step.leaf, step.readsOnly ? O_RDONLY : O_RDWR,
                            step.bytes(), step.size});
    }
    for (auto _ : state) {
        for (const Access& access : accesses) {
            const int file = open(access.path.c_str(), access.mode);
            char text[512];
            if (access.kind == Step::kRead && read(file, text, access.size) < 0) abort();
            if (access.kind == Step::kWrite &&
                write(file, access.bytes.data(), access.bytes.size()) < 0) {
                abort();
            }
            close(file);
        }
    }
}

}  // namespace

void registerOperations() {
    for (const Operation& operation : allOperations()) {
        const std::string name = "operation/" + operation.name();
        benchmark::RegisterBenchmark(name.c_str(), runOperation, operation);
        benchmark::RegisterBenchmark((name + "/floor").c_str(), runFloor, operation);
    }
}
