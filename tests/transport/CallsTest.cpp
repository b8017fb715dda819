// SPDX-License-Identifier: Apache-2.0
#include "support/LogCapture.h"
#include "support/TransportTest.h"

#include <android/hidl/manager/1.2/IServiceManager.h>
#include <hidl/HidlBinderSupport.h>
#include <hidl/Host.h>
#include <hidl/ServiceManagement.h>
#include <utils/Errors.h>

#include <algorithm>
#include <atomic>
#include <chrono>
#include <csignal>
#include <ctime>
#include <filesystem>
#include <thread>

// Runs on sockets everywhere, and on the kernel's binder in a virtual machine.

namespace {

using ::android::sp;
using ::android::wp;
using ::android::hardware::hidl_death_recipient;
using ::android::hardware::hidl_string;
using ::android::hardware::Return;
using ::android::hidl::base::V1_0::IBase;
namespace vibrator = ::android::hardware::vibrator;
namespace host = ::android::hardware::host;
using V20 = ::vendor::velmora::hardware::vibrator::V2_0::IDaxVibrator;
using std::chrono::milliseconds;
using ::vendor::velmora::hardware::vibrator::V2_0::DaxHapticEnginePacket;

const std::vector<std::string> kChain = {"vendor.velmora.hardware.vibrator@2.1::IDaxVibrator",
                                         "vendor.velmora.hardware.vibrator@2.0::IDaxVibrator",
                                         "android.hardware.vibrator@1.3::IVibrator",
                                         "android.hardware.vibrator@1.2::IVibrator",
                                         "android.hardware.vibrator@1.1::IVibrator",
                                         "android.hardware.vibrator@1.0::IVibrator",
                                         "android.hidl.base@1.0::IBase"};

class CallsTest : public TransportTest {
  protected:
    void SetUp() override {
        serve();
        mClient = IDaxVibrator::getService();
        ASSERT_NE(mClient, nullptr);
    }

    sp<IDaxVibrator> mClient;
};

TEST_F(CallsTest, MessageThatIsTooLargeCostsOnlyItself) {
    std::vector<size_t> counts = {100'000};
    // Over sockets these packets fit; the message around them does not. The kernel takes more.
    if (!isKernel()) counts.insert(counts.end(), {4096, 4095});
    for (const size_t count : counts) {
        const std::vector<DaxHapticEnginePacket> packets(count);
        const Return<VibratorStatus> result = mClient->daxPerformHapticEngine(packets, 1);
        EXPECT_FALSE(result.isOk());
        EXPECT_FALSE(result.isDeadObject());
        EXPECT_EQ(result.description(),
                  "the message could not be delivered; it may be too large: over sockets, more "
                  "than 64 KiB");
    }
    EXPECT_TRUE(mClient->ping().isOk());
}

TEST_F(CallsTest, ListsGetThereWhole) {
    if (geteuid() != 0 && geteuid() != 1000) GTEST_SKIP() << "the daemon refuses the operation";
    std::vector<DaxHapticEnginePacket> packets(40);
    for (int i = 0; i < 40; ++i)
        packets[static_cast<size_t>(i)] = {i, 10000, 2 * i, -i};
    mClient->daxPerformHapticEngine(packets, 10000);
    EXPECT_NE(log().find(" 38 10000 76 -38 39 10000 78 -39\\n"), std::string::npos) << log();
}

TEST_F(CallsTest, BaseOperationsAnswerForTheObject) {
    EXPECT_TRUE(mClient->isRemote());
    std::vector<std::string> chain;
    const auto take = [&](const auto& names) { chain.assign(names.begin(), names.end()); };
    EXPECT_TRUE(mClient->interfaceChain(take).isOk());
    EXPECT_EQ(chain, kChain);
    std::string descriptor;
    EXPECT_TRUE(mClient->interfaceDescriptor([&](const auto& each) { descriptor = each; }).isOk());
    EXPECT_EQ(descriptor, kChain[0]);
    size_t hashes = 0;
    const auto count = [&](const auto& list) { hashes = list[0] == list[1] ? 0 : list.size(); };
    EXPECT_TRUE(mClient->getHashChain(count).isOk());
    EXPECT_EQ(hashes, kChain.size());
    int32_t pid = 0;
    EXPECT_TRUE(mClient->getDebugInfo([&](const auto& info) {
                           pid = info.pid;
                           EXPECT_EQ(info.ptr, 0U) << "no address leaves the process";
                       })
                        .isOk());
    EXPECT_EQ(pid, mServer.pid());
    EXPECT_TRUE(mClient->ping().isOk());
    EXPECT_TRUE(mClient->debug(nullptr, {"one", "", "three"}).isOk());
    EXPECT_EQ(mClient->perform_1_1({}, {}, nullptr).description(),
              "Null synchronous callback passed.");
}

TEST_F(CallsTest, ObjectIsFoundUnderEveryInterfaceOfItsChain) {
    const sp<vibrator::V1_0::IVibrator> oldest = vibrator::V1_0::IVibrator::getService();
    ASSERT_NE(oldest, nullptr);
    for (const Answer& answer :
         {call(*vibrator::V1_1::IVibrator::getService()),
          call(*vibrator::V1_2::IVibrator::getService()),
          call(*vibrator::V1_3::IVibrator::getService()), call(*V20::getService())}) {
        EXPECT_EQ(answer.inWords(), "(UNSUPPORTED_OPERATION, 0)");
    }
    const sp<IDaxVibrator> cast = IDaxVibrator::castFrom(oldest);
    ASSERT_NE(cast, nullptr);
    EXPECT_TRUE(call(*cast).isOk);
    const sp<android::hidl::manager::V1_0::IServiceManager> manager =
            android::hardware::defaultServiceManager();
    ASSERT_NE(manager, nullptr);
    EXPECT_EQ(sp<IDaxVibrator>(IDaxVibrator::castFrom(sp<IBase>(manager))), nullptr);

    // Under the name of an interface that it does not have.
    using Other = android::hidl::manager::V1_0::IServiceNotification;
    std::filesystem::create_symlink(kChain[0] + ".default",
                                    mDirectory.path() + "/" + Other::descriptor + ".wrong");
    if (isKernel()) {
        EXPECT_TRUE(android::hardware::defaultServiceManager1_2()->addWithChain(
                "wrong", mClient, {Other::descriptor}));
    }
    sp<IBase> found;
    std::string whyNot;
    EXPECT_EQ(host::findService(Other::descriptor, "wrong", &found, &whyNot), android::BAD_TYPE);
    EXPECT_EQ(found, nullptr);
    EXPECT_NE(whyNot.find("does not have the interface"), std::string::npos) << whyNot;

    // What a daemon that died in its start has left.
    std::filesystem::create_symlink(kChain[0] + ".default",
                                    mDirectory.path() + "/" + kChain[5] + ".default~");
    std::vector<std::string> names;
    const auto take = [&](const auto& list) { names.assign(list.begin(), list.end()); };
    for (const std::string& each : {kChain[0], kChain[5]}) {
        manager->listByInterface(each, take);
        EXPECT_EQ(names, std::vector<std::string>{"default"});
    }
    std::string first;
    manager->debugDump([&](const auto& infos) {
        ASSERT_NE(infos.size(), 0U);
        first = std::string(infos[0].interfaceName) + "/" + std::string(infos[0].instanceName) +
                " " + std::to_string(infos[0].pid);
    });
    EXPECT_EQ(first, kChain[5] + "/default " + std::to_string(isKernel() ? mServer.pid() : -1));
    manager->list(take);
    EXPECT_NE(std::find(names.begin(), names.end(), kChain[0] + "/default"), names.end());
}

TEST_F(CallsTest, ThreadsMayShareAnObject) {
    // Each leaves no reply behind: together they get more than a process can have at once.
    for (int i = 0; i < 1000 && !HasFailure(); ++i) {
        std::vector<std::thread> threads;
        for (int id = 0; id < 2; ++id) {
            threads.emplace_back([&] {
                // A reply that went astray would show: they differ in kind.
                EXPECT_EQ(call(*mClient).inWords(), "(UNSUPPORTED_OPERATION, 0)");
                size_t chain = 0;
                mClient->interfaceChain([&](const auto& names) { chain = names.size(); });
                EXPECT_EQ(chain, kChain.size());
            });
        }
        for (std::thread& thread : threads)
            thread.join();
    }
}

TEST_F(CallsTest, ClientsMayDieInACall) {
    // Until it answers, it may not have accepted the connection.
    EXPECT_TRUE(mClient->ping().isOk());
    const size_t before = descriptorsOf(mServer.pid());
    stopServer();
    for (int i = 0; i < 50; ++i) {
        Child client;
        client.startProgram({VIBRATORCTL, "off"});
        const std::string state = "/proc/" + std::to_string(client.pid()) + "/stat";
        // Asleep, it waits for the answer.
        EXPECT_TRUE(eventually([&] { return readFile(state).find(") S ") != std::string::npos; }));
    }
    ::kill(mServer.pid(), SIGCONT);
    EXPECT_TRUE(answers());
    // The connections of the dead have gone, and that of the client that has just asked.
    EXPECT_TRUE(eventually([&] { return descriptorsOf(mServer.pid()) <= before; }));
}

/** Remembers the news of a death. */
struct Recipient : hidl_death_recipient {
    void serviceDied(uint64_t cookie, const wp<IBase>& who) override {
        wasAlive = who.promote() != nullptr;
        lastCookie = cookie;
    }
    std::atomic<uint64_t> lastCookie = 0;
    std::atomic<bool> wasAlive = false;
};

TEST_F(CallsTest, DeathIsToldToThoseWhoAskedAndTheSuccessorIsFound) {
    const sp<Recipient> told = new Recipient;
    const sp<Recipient> untold = new Recipient;
    const std::vector<DaxHapticEnginePacket> tooMany(100'000);
    EXPECT_FALSE(mClient->daxPerformHapticEngine(tooMany, 1).isOk()) << "which is no death";
    EXPECT_TRUE(mClient->linkToDeath(untold, 7));
    EXPECT_TRUE(mClient->unlinkToDeath(untold));
    EXPECT_TRUE(mClient->linkToDeath(untold, 7)) << "whoever has given up the only link may";
    const sp<Recipient> toldOnly = new Recipient;
    const sp<IDaxVibrator> uncalled = IDaxVibrator::getService();
    EXPECT_TRUE(uncalled->linkToDeath(toldOnly, 43));
    EXPECT_TRUE(mClient->linkToDeath(told, 42));
    EXPECT_TRUE(mClient->unlinkToDeath(untold));
    EXPECT_FALSE(mClient->unlinkToDeath(untold));
    // A call is under way when the daemon dies.
    stopServer();
    std::thread killer([&] {
        std::this_thread::sleep_for(milliseconds(100));
        mServer.kill();
    });
    EXPECT_TRUE(mClient->ping().isDeadObject());
    killer.join();
    EXPECT_TRUE(eventually([&] { return told->lastCookie == 42; }));
    EXPECT_TRUE(told->wasAlive);
    EXPECT_EQ(untold->lastCookie, 0U);
    EXPECT_TRUE(mClient->ping().isDeadObject());
    EXPECT_FALSE(mClient->unlinkToDeath(told)) << "it has been told";
    EXPECT_FALSE(mClient->linkToDeath(told, 1)) << "it is too late";
    EXPECT_TRUE(eventually([&] { return toldOnly->lastCookie == 43; }));
    EXPECT_FALSE(uncalled->linkToDeath(toldOnly, 1)) << "the news says so, no call";
    const clock_t before = clock();
    std::this_thread::sleep_for(milliseconds(100));
    EXPECT_LT(clock() - before, CLOCKS_PER_SEC / 50) << "the death is news only once";
    EXPECT_EQ(mClient->off().withDefault(VibratorStatus::BAD_VALUE), VibratorStatus::BAD_VALUE);
    serve();
    EXPECT_TRUE(mClient->ping().isDeadObject()) << "a dead object stays dead";
}

/** Remembers the news of a registration. */
struct Notification : android::hidl::manager::V1_0::IServiceNotification {
    Return<void> onRegistration(const hidl_string& interface, const hidl_string& name,
                                bool preexisting) override {
        if (interface == IDaxVibrator::descriptor && name == "default") {
            ++(preexisting ? before : after);
        }
        return android::hardware::Void();
    }
    std::atomic<int> before = 0;
    std::atomic<int> after = 0;
};

TEST_F(CallsTest, RegistrationIsToldToThoseWhoAsked) {
    const sp<Notification> notification = new Notification;
    ASSERT_TRUE(IDaxVibrator::registerForNotifications("default", notification));
    EXPECT_TRUE(eventually([&] { return notification->before == 1; }));
    mServer.kill();
    // Over sockets it can be seen to go, which is no registration.
    std::filesystem::remove(mDirectory.path() + "/" + kChain[0] + ".default");
    if (!isKernel()) std::this_thread::sleep_for(milliseconds(120));
    serve();
    EXPECT_TRUE(eventually([&] { return notification->after == 1; }));
    std::this_thread::sleep_for(milliseconds(250));
    EXPECT_EQ(notification->after, 1) << "it is told once";
    const auto manager = android::hardware::defaultServiceManager1_2();
    EXPECT_FALSE(manager->registerForNotifications(kChain[0], "default", nullptr));
    EXPECT_FALSE(manager->unregisterForNotifications(kChain[0], "default", new Notification));
    EXPECT_FALSE(manager->unregisterForNotifications(kChain[1], "default", notification));
    EXPECT_TRUE(manager->unregisterForNotifications(kChain[0], "default", notification));
    EXPECT_FALSE(manager->unregisterForNotifications(kChain[0], "default", notification));
    EXPECT_TRUE(manager->registerForNotifications(kChain[0], "", notification));
    EXPECT_TRUE(manager->unregisterForNotifications("", "", notification));
}

TEST_F(CallsTest, SearchWaitsForAServiceThatIsToCome) {
    mServer.kill();
    ASSERT_TRUE(eventually([] { return IDaxVibrator::tryGetService() == nullptr; }));
    const std::string whyNot = kChain[0] + "/default is not there: " +
                               (isKernel() ? "/dev/hwbinder: the service manager does not know it"
                                           : mDirectory.path());
    sp<IBase> base;
    std::string said;
    EXPECT_EQ(host::findService(kChain[0], "default", &base, &said), android::NAME_NOT_FOUND);
    EXPECT_EQ(said.find(whyNot), 0U) << said;
    std::thread later([&] {
        std::this_thread::sleep_for(milliseconds(100));
        startDaemon(mServer);
    });
    const sp<IDaxVibrator> found = IDaxVibrator::getService();
    later.join();
    ASSERT_NE(found, nullptr);
    EXPECT_TRUE(found->ping().isOk());
}

TEST_F(CallsTest, CallsCanHaveATimeLimit) {
    host::setCallTimeout(milliseconds(200));
    const sp<IDaxVibrator> impatient = IDaxVibrator::getService();
    EXPECT_TRUE(impatient->ping().isOk());
    const auto full = android::hardware::getOrCreateCachedBinder(IDaxVibrator::getService().get());
    stopServer();
    // Signals do not end the call, nor do they make it take longer.
    std::signal(SIGALRM, [](int) {});
    ualarm(50'000, 50'000);
    const auto start = std::chrono::steady_clock::now();
    const Return<void> result = impatient->ping();
    EXPECT_LT(std::chrono::steady_clock::now() - start, milliseconds(900));
    // Calls that are not waited for, until they find no place.
    android::status_t sent = isKernel() ? android::TIMED_OUT : android::OK;
    while (sent == android::OK)
        sent = full->transact(1, {}, nullptr, TF_ONE_WAY);
    ualarm(0, 0);
    host::setCallTimeout(milliseconds(0));
    EXPECT_GE(std::chrono::steady_clock::now() - start, milliseconds(200));
    EXPECT_EQ(result.description(), "the service did not answer in time");
    EXPECT_EQ(sent, android::TIMED_OUT);
    ::kill(mServer.pid(), SIGCONT);
    EXPECT_TRUE(answers());
    // Else the late reply would be taken for that of the next call.
    if (!isKernel()) {
        EXPECT_TRUE(impatient->ping().isDeadObject());
        EXPECT_FALSE(impatient->linkToDeath(new Recipient, 1));
    }
}

TEST_F(CallsTest, ValueOfAFailedCallEndsTheProcess) {
    mServer.kill();
    const Return<VibratorStatus> failed = mClient->off();
    EXPECT_EQ(sp<IDaxVibrator>(IDaxVibrator::castFrom(sp<IBase>(mClient))), nullptr);
    LogCapture ownLog;
    const Return<sp<IDaxVibrator>> cast = IDaxVibrator::castFrom(sp<IBase>(mClient), true);
    EXPECT_TRUE(cast.isDeadObject());
    const std::string said = ownLog.takeText();
    EXPECT_EQ(said.find("E/hwbinder("), 0U) << said;
    EXPECT_NE(said.find("): no cast to " + kChain[0] + ": the service has gone"),
              std::string::npos);
    EXPECT_DEATH(static_cast<void>(sp<IBase>(cast)), "the value of a failed call was used");
    EXPECT_DEATH(static_cast<void>(static_cast<VibratorStatus>(failed)),
                 "F/hwbinder.*: the value of a failed call was used: the service has gone");
}

}  // namespace
