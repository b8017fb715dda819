// SPDX-License-Identifier: Apache-2.0
#include "kernel/RawBinder.h"
#include "kernel/Services.h"

#include <gtest/gtest.h>

/** The life of the service manager, the daemon and its clients on the kernel's binder. */
namespace {

constexpr char kService[] = "vendor.velmora.hardware.vibrator@2.1::IDaxVibrator";

bool isAnswered(RawBinder& client) {
    const uint32_t handle = client.get(kService);
    return handle != 0 && client.call(handle, raw::kPing, RawParcel(raw::kBase)).isOk();
}

TEST(ServicesTest, ManagerMayComeLate) {
    Services services;
    services.startDaemon();
    sleep(2);
    ASSERT_TRUE(services.daemon.isAlive()) << readFile(Services::kDaemonLog);
    ASSERT_TRUE(services.startManager());
    RawBinder client;
    EXPECT_TRUE(eventually([&] { return isAnswered(client); })) << readFile(Services::kDaemonLog);
}

TEST(ServicesTest, DaemonMayDieAndHaveASuccessor) {
    Services services;
    ASSERT_TRUE(services.startManager());
    services.startDaemon();
    RawBinder client;
    ASSERT_TRUE(eventually([&] { return isAnswered(client); })) << readFile(Services::kDaemonLog);
    const uint32_t first = client.get(kService);
    services.daemon.kill();
    EXPECT_EQ(client.call(first, raw::kPing, RawParcel(raw::kBase)).kind, RawAnswer::kDead);
    EXPECT_TRUE(eventually([&] { return client.get(kService) == 0; }));
    services.startDaemon();
    EXPECT_TRUE(eventually([&] { return isAnswered(client); })) << readFile(Services::kDaemonLog);
}

TEST(ServicesTest, EveryUserIsServed) {
    Services services;
    ASSERT_TRUE(services.startManager());
    services.startDaemon();
    RawBinder client;
    ASSERT_TRUE(eventually([&] { return isAnswered(client); })) << readFile(Services::kDaemonLog);
    for (const uid_t uid : {0U, 1000U, 2000U, 10123U}) {
        for (const char* word : {"status", "off", "supports"}) {
            const Outcome outcome = runProgram({"/bin/vibratorctl", word}, uid);
            EXPECT_EQ(outcome.exitCode, 0) << word << " as " << uid << ": " << outcome.errors;
        }
    }
}

}  // namespace
