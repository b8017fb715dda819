// SPDX-License-Identifier: Apache-2.0
#include "NodePathTable.h"
#include "Vibrator.h"
#include "support/LogCapture.h"
#include "support/TemporaryDirectory.h"

#include <gtest/gtest.h>
#include <hwbinder/IPCThreadState.h>

#include <atomic>
#include <cerrno>
#include <cstdlib>
#include <filesystem>
#include <fstream>
#include <new>
#include <vector>

namespace {
std::atomic<size_t> allocations = 0;
}

// Not inlined, or the compiler would see malloc and free where it expects new and delete.
__attribute__((noinline)) void* operator new(size_t size) {
    ++allocations;
    void* memory = malloc(size);
    if (memory == nullptr) abort();
    return memory;
}
/** Without this one AddressSanitizer's is called, whose memory must not go to the free() below. */
__attribute__((noinline)) void* operator new(size_t size,
                                             const std::nothrow_t& /* tag */) noexcept {
    return operator new(size);
}
/** Changes errno, as nothing keeps the C library from doing. */
__attribute__((noinline)) void operator delete(void* memory) noexcept {
    free(memory);
    errno = EDOM;
}
__attribute__((noinline)) void operator delete(void* memory, size_t /* size */) noexcept {
    operator delete(memory);
}

namespace vendor::velmora::hardware::vibrator::V2_1::implementation {
namespace {

/** A service object on files of the real system, with long paths. */
class RealNodeTest : public ::testing::Test {
  protected:
    RealNodeTest() {
        // The system user calls, whoever runs the test.
        android::hardware::IPCThreadState::self()->restoreCallingIdentity(int64_t{1000} << 32);
        std::ofstream(mNode) << "10000\n";
    }

    TemporaryDirectory mDirectory;
    std::string mNode = mDirectory.path() + "/a-node-with-a-long-path";
    LogCapture mLog;
    android::sp<Vibrator> mVibrator = new Vibrator;
};

TEST_F(RealNodeTest, OnlyTheCopiesOfPathsAreAllocated) {
    /** How many times a function allocates, the first time aside. */
    const auto allocationsOf = [](const auto& function) {
        function();
        const size_t before = allocations;
        function();
        return allocations - before;
    };
    THE_DEVICE_INTENSITY = THE_DEVICE_HAPTIC_ENGINE_NUM_WAVES = THE_DEVICE_HAPTIC_ENGINE = mNode;
    EXPECT_EQ(allocationsOf([&] { mVibrator->daxSetAmplitude(7); }), 1U);
    EXPECT_EQ(allocationsOf([&] { mVibrator->daxSupportsAmplitudeControl(); }), 1U);
    const auto ignore = [](Status, uint32_t) {};
    EXPECT_EQ(allocationsOf([&] { mVibrator->daxGetNumberOfPrebakedHapticPattern(ignore); }), 1U);
    // The path of the node that starts the motor is copied; the text of the packets is not.
    const hidl_vec<DaxHapticEnginePacket> packets =
            std::vector<DaxHapticEnginePacket>(339, {1, 2, 3, 4});
    EXPECT_EQ(allocationsOf([&] { mVibrator->daxPerformHapticEngine(packets, 5000); }), 1U);
    EXPECT_EQ(std::ifstream(mNode).peek(), '1');
}

TEST_F(RealNodeTest, ErrnoIsThatOfTheWrite) {
    THE_DEVICE_INTENSITY = "/dev/../dev/../dev/../dev/full";
    EXPECT_EQ(Status(mVibrator->setAmplitude(1)), Status::UNKNOWN_ERROR);
    const std::string log = cutDown(mLog.takeText());
    EXPECT_NE(log.find("E Failed to set amplitude (28): No space left on device\n"),
              std::string::npos)
            << log;
}

TEST_F(RealNodeTest, WhateverStandsInANodesPlaceIsJudgedByTheKernel) {
    const std::string dangling = mDirectory.path() + "/dangling";
    std::filesystem::create_symlink("nowhere", dangling);
    const std::pair<std::string, Status> cases[] = {
            {mNode, Status::OK},
            {"/dev/null", Status::OK},
            {"/dev/full", Status::UNKNOWN_ERROR},
            {dangling, Status::UNKNOWN_ERROR},
            {mDirectory.path(), Status::UNKNOWN_ERROR},
            {std::string(5000, 'x'), Status::UNKNOWN_ERROR},
    };
    for (const auto& [path, status] : cases) {
        THE_DEVICE_INTENSITY = path;
        EXPECT_EQ(Status(mVibrator->daxSetAmplitude(5)), status) << path;
    }
    EXPECT_FALSE(std::filesystem::exists(mDirectory.path() + "/nowhere")) << "never created";
    std::string first;
    std::string second;
    std::ifstream(mNode) >> first >> second;
    EXPECT_EQ(first + "," + second, "5,000") << "neither emptied nor appended to";
}

}  // namespace
}  // namespace vendor::velmora::hardware::vibrator::V2_1::implementation
