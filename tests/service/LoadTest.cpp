// SPDX-License-Identifier: Apache-2.0
#include "support/DaemonTest.h"

#include <sys/wait.h>
#include <unistd.h>

#include <chrono>
#include <csignal>
#include <fstream>
#include <random>
#include <set>
#include <thread>

namespace {

using ::android::hardware::hidl_vec;
using Status = ::android::hardware::vibrator::V1_0::Status;
using ::vendor::velmora::hardware::vibrator::V2_1::DaxAmplitudeType;

constexpr uint32_t kClients = 64;
constexpr uint32_t kSurvivors = 43;
constexpr uint32_t kCallsEach = 464;
/** Each call of on has a number of its own: this many times the client's, and the call's. */
constexpr uint32_t kClientsMark = 10'000'000;

/** Makes the client's next call. @return whether the answer was the right one. */
bool makeCall(IDaxVibrator& vibrator, bool permitted, uint32_t client, uint32_t call) {
    if (call % 2 == 0) {
        const Status status =
                vibrator.on(client * kClientsMark + call).withDefault(Status::BAD_VALUE);
        return status == Status::OK;
    }
    bool right = false;
    const auto take = [&](bool supported, const hidl_vec<uint32_t>& list) {
        right = supported == permitted && list.size() == (permitted ? 6U : 0U);
    };
    return vibrator.daxGetAmplitudeList(DaxAmplitudeType::TYPE_0, take).isOk() && right;
}

/** Starts a process, as one of several users, that makes calls. */
pid_t spawn(uint32_t client, uint32_t calls) {
    const uid_t uids[] = {0, 1000, 2000, 10123};
    const uid_t uid = geteuid() == 0 ? uids[client % 4] : geteuid();
    const pid_t pid = fork();
    if (pid != 0) return pid;
    if (uid != geteuid() && setuid(uid) != 0) _exit(2);
    const auto vibrator = IDaxVibrator::getService();
    for (uint32_t call = 1; call <= calls; ++call) {
        if (!makeCall(*vibrator, uid == 0 || uid == 1000, client, call)) _exit(1);
    }
    _exit(0);
}

class LoadTest : public DaemonTest {};

TEST_F(LoadTest, ManyClientsGetTheirOwnAnswersAndEachCallActsOnce) {
    createDriver();
    start();
    waitpid(spawn(0, 1000), nullptr, 0);
    const size_t descriptors = descriptorsOf(mServer.pid());
    [[maybe_unused]] const size_t memory = mServer.residentKiB();
    std::vector<pid_t> survivors;
    std::vector<pid_t> doomed;
    for (uint32_t client = 1; client <= kSurvivors; ++client)
        survivors.push_back(spawn(client, kCallsEach));
    for (uint32_t client = kSurvivors + 1; client <= kClients; ++client)
        doomed.push_back(spawn(client, kClientsMark));

    // The doomed die one after the other, at moments that nobody has chosen.
    std::mt19937 random(std::random_device{}());
    for (const pid_t pid : doomed) {
        std::this_thread::sleep_for(std::chrono::microseconds(random() % 100'000));
        kill(pid, SIGKILL);
        waitpid(pid, nullptr, 0);
    }
    for (const pid_t pid : survivors) {
        int status = -1;
        waitpid(pid, &status, 0);
        EXPECT_EQ(status, 0) << "a call got another answer than its own";
    }
    EXPECT_TRUE(eventually([&] { return descriptorsOf(mServer.pid()) <= descriptors; }));
#ifndef SANITIZED  // a sanitizer keeps what has been freed
    EXPECT_LE(mServer.residentKiB(), memory + 256);
#endif
    std::multiset<unsigned long> acted;
    const std::string write = "duration write \"";
    std::ifstream trace(mDirectory.path() + "/trace");
    for (std::string line; std::getline(trace, line);) {
        const size_t at = line.find(write);
        if (at != std::string::npos) acted.insert(std::stoul(line.substr(at + write.size())));
    }
    for (uint32_t client = 1; client <= kSurvivors; ++client) {
        for (uint32_t call = 2; call <= kCallsEach; call += 2)
            ASSERT_EQ(acted.count(client * kClientsMark + call), 1U) << client << " " << call;
    }
}

}  // namespace
