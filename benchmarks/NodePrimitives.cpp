// SPDX-License-Identifier: Apache-2.0
#include "Vibrator.h"

#include <benchmark/benchmark.h>
#include <fcntl.h>
#include <unistd.h>

#include <cstdlib>
#include <string>

namespace {

using ::vendor::velmora::hardware::vibrator::V2_1::implementation::Status;
using ::vendor::velmora::hardware::vibrator::V2_1::implementation::Vibrator;

/** A file that is held in memory, as a node of sysfs is, and has a path about as long. */
class MemoryNode {
  public:
    MemoryNode() {
        const int file = mkstemp(mPath.data());
        if (file < 0 || write(file, "500\n", 4) != 4) abort();
        close(file);
    }
    MemoryNode(const MemoryNode&) = delete;
    MemoryNode& operator=(const MemoryNode&) = delete;
    ~MemoryNode() { unlink(mPath.c_str()); }

    const std::string& path() const { return mPath; }

  private:
    std::string mPath = "/dev/shm/vibrator-intensity-XXXXXX";
};

void writeNode(benchmark::State& state) {
    const MemoryNode node;
    const android::sp<Vibrator> vibrator = new Vibrator;
    for (auto _ : state) {
        if (vibrator->writeNode(node.path(), 500) != Status::OK) abort();
    }
}
BENCHMARK(writeNode);

void writeNodeFloor(benchmark::State& state) {
    const MemoryNode node;
    for (auto _ : state) {
        const int file = open(node.path().c_str(), O_RDWR);
        if (write(file, "500\n", 4) != 4) abort();
        close(file);
    }
}
BENCHMARK(writeNodeFloor)->Name("writeNode/floor");

void readNode(benchmark::State& state) {
    const MemoryNode node;
    const android::sp<Vibrator> vibrator = new Vibrator;
    for (auto _ : state) {
        if (vibrator->readNode(node.path()) != 500) abort();
    }
}
BENCHMARK(readNode);

void readNodeFloor(benchmark::State& state) {
    const MemoryNode node;
    for (auto _ : state) {
        char text[8];
        const int file = open(node.path().c_str(), O_RDONLY);
        if (read(file, text, 7) != 4) abort();
        benchmark::DoNotOptimize(text);
        close(file);
    }
}
BENCHMARK(readNodeFloor)->Name("readNode/floor");

}  // namespace
