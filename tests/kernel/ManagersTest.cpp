// SPDX-License-Identifier: Apache-2.0
#include "hwservicemanager/ServiceManager.h"
#include "libhwbinder/Driver.h"
#include "support/Process.h"

#include <android/hidl/manager/1.0/BnHwServiceManager.h>
#include <gtest/gtest.h>
#include <hidl/HidlTransportSupport.h>
#include <hwbinder/ProcessState.h>

/** A service whose managers come, go and are of several versions, on a binder device of its own. */
namespace {

using ::android::sp;
using ::android::hidl::manager::V1_0::BnHwServiceManager;
namespace hardware = ::android::hardware;

/** Knows the operations of manager 1.0 alone, since only their stub receives its calls. */
TEST(ManagersTest, DISABLED_OfVersion1_0) {
    const sp<BnHwServiceManager> manager = new BnHwServiceManager(new hardware::ServiceManager);
    ASSERT_EQ(hardware::ProcessState::self()->driver().becomeContextManager(manager), android::OK);
    hardware::configureRpcThreadpool(1, true);
    hardware::joinRpcThreadpool();
}

TEST(ManagersTest, ServiceIsFoundWithEachManagerThatComes) {
    const auto onDevice = [](const std::string& command) -> std::vector<std::string> {
        return {"/bin/sh", "-c", "exec env HWBINDER_DEVICE=/dev/binder " + command};
    };
    Child daemon;
    daemon.startProgram(onDevice(SERVICE), "/tmp/daemon");
    const std::string older =
            "binder-tests --gtest_also_run_disabled_tests --gtest_filter=*DISABLED_OfVersion1_0";
    for (const std::string& command : {older, std::string("hwservicemanager"), older}) {
        Child manager;
        manager.startProgram(onDevice(command), "/tmp/manager");
        EXPECT_TRUE(eventually([&] {
            return runProgram(onDevice(VIBRATORCTL " off")).exitCode == 0;
        })) << readFile("/tmp/daemon")
            << readFile("/tmp/manager");
        EXPECT_TRUE(daemon.isAlive());
    }
}

}  // namespace
