// SPDX-License-Identifier: Apache-2.0
#include "NodePaths.h"
#include "support/TemporaryDirectory.h"
#include "support/VibratorPeer.h"

#include <gtest/gtest.h>
#include <hwbinder/IPCThreadState.h>

#include <cstdlib>
#include <fstream>
#include <new>
#include <vector>

namespace {
size_t allocations = 0;
}

// Not inlined, or the compiler would see malloc and free where it expects new and delete.
__attribute__((noinline)) void* operator new(size_t size) {
    ++allocations;
    void* memory = malloc(size);
    if (memory == nullptr) abort();
    return memory;
}
__attribute__((noinline)) void operator delete(void* memory) noexcept {
    free(memory);
}
__attribute__((noinline)) void operator delete(void* memory, size_t /* size */) noexcept {
    free(memory);
}

namespace vendor::velmora::hardware::vibrator::V2_1::implementation {
namespace {

/** @return how often a function allocates; its second run counts, the first sets things up. */
template <typename Function>
size_t allocationsOf(Function function) {
    function();
    const size_t before = allocations;
    function();
    return allocations - before;
}

TEST(AllocationTest, PrimitivesAllocateTheCopyOfThePathAndNothingElse) {
    setenv("ANDROID_LOG_TAGS", "*:S", 1);
    const TemporaryDirectory directory;
    const std::string node = directory.path() + "/a-node-with-a-long-path";
    std::ofstream(node) << "500\n";
    const android::sp<Vibrator> vibrator = new Vibrator;
    // The system user calls, whoever runs the test.
    android::hardware::IPCThreadState::self()->restoreCallingIdentity(int64_t{1000} << 32);
    EXPECT_EQ(allocationsOf([&] { VibratorPeer::writeNode(*vibrator, node, 7); }), 1U);
    EXPECT_EQ(allocationsOf([&] { VibratorPeer::readNode(*vibrator, node); }), 1U);
    EXPECT_EQ(allocationsOf([&] { VibratorPeer::isNodeExist(*vibrator, node); }), 1U);
    EXPECT_EQ(allocationsOf([&] { VibratorPeer::isNodeExistForRead(*vibrator, node); }), 1U);

    // The path of the node that starts the motor is copied; the text of the packets is not.
    THE_DEVICE_HAPTIC_ENGINE = node;
    const hidl_vec<DaxHapticEnginePacket> packets =
            std::vector<DaxHapticEnginePacket>(339, {1, 2, 3, 4});
    EXPECT_EQ(allocationsOf([&] { vibrator->daxPerformHapticEngine(packets, 5000); }), 1U);
    EXPECT_EQ(std::ifstream(node).peek(), '1');
}

}  // namespace
}  // namespace vendor::velmora::hardware::vibrator::V2_1::implementation
