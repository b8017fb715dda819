// SPDX-License-Identifier: Apache-2.0
#include "libhwbinder/Packet.h"
#include "libhwbinder/SocketConnection.h"
#include "support/LogCapture.h"
#include "support/TransportTest.h"
#include "transport/RawClient.h"

#include <android/hidl/manager/1.0/IServiceNotification.h>
#include <android/hidl/manager/1.2/IServiceManager.h>
#include <fcntl.h>
#include <hidl/HidlBinderSupport.h>
#include <hidl/HidlTransportSupport.h>
#include <hidl/ServiceManagement.h>
#include <hwbinder/BpHwBinder.h>
#include <hwbinder/Parcel.h>
#include <hwbinder/ProcessState.h>
#include <sys/file.h>
#include <sys/socket.h>
#include <sys/stat.h>
#include <unistd.h>

#include <algorithm>
#include <atomic>
#include <chrono>
#include <cstdlib>
#include <filesystem>
#include <thread>

// What a program has of the runtime in its own process: its threads, and what it publishes.

namespace {

using ::android::sp;
using ::android::wp;
using ::android::hardware::BpHwBinder;
using ::android::hardware::hidl_string;
using ::android::hardware::IBinder;
using ::android::hardware::ProcessState;
using ::android::hardware::Return;
using ::android::hidl::manager::V1_0::IServiceNotification;
using std::chrono::milliseconds;

/** Notes how many of its calls there are at once. */
struct Slow : IServiceNotification {
    Return<void> onRegistration(const hidl_string&, const hidl_string&, bool) override {
        most = std::max<int>(most, ++now);
        std::this_thread::sleep_for(milliseconds(20));
        --now;
        ++calls;
        return ::android::hardware::Void();
    }
    std::atomic<int> now = 0;
    std::atomic<int> most = 0;
    std::atomic<int> calls = 0;
};

class RuntimeTest : public TransportTest {};

size_t threadCount() {
    const std::filesystem::directory_iterator tasks("/proc/self/task");
    return static_cast<size_t>(std::distance(begin(tasks), end(tasks)));
}

TEST(RuntimeDeathTest, NothingIsServedOrWaitedForOnADeviceThatCannotBeUsed) {
    // In a program that is started anew: this one may have chosen its transport already.
    GTEST_FLAG_SET(death_test_style, "threadsafe");
    setenv("HWBINDER_DEVICE", "/dev/null", 1);
    EXPECT_EXIT(
            {
                alarm(3);  // Less than the patience with a device that can be used.
                auto& driver = android::hardware::ProcessState::self()->driver();
                if (driver.becomeContextManager(nullptr) != android::NO_INIT) _exit(3);
                std::thread([&] {
                    for (int i = 0; i < 300; ++i)
                        driver.serve();
                }).join();
                if (IDaxVibrator::getService() != nullptr) _exit(1);
                _exit((new Slow)->registerAsService("x") == android::NO_INIT ? 0 : 2);
            },
            ::testing::ExitedWithCode(0),
            "not registered: the service manager is not there: /dev/null: not a binder device");
    unsetenv("HWBINDER_DEVICE");
}

TEST_F(RuntimeTest, ObjectThatHasGoneIsNotGivenAgain) {
    sp<Slow> object = new Slow;
    const wp<Slow> kept = object;
    EXPECT_EQ(kept.promote(), object);
    object = nullptr;
    EXPECT_EQ(kept.promote(), nullptr);
    const sp<IBinder> proxy = ProcessState::self()->getStrongProxyForHandle(4'000'000'001);
    static_cast<void>(sp<IBinder>(new BpHwBinder(4'000'000'001)));
    EXPECT_EQ(ProcessState::self()->getStrongProxyForHandle(4'000'000'001), proxy)
            << "the end of another changes nothing";
    const sp<Slow> served = new Slow;
    const sp<IBinder> stub = android::hardware::getOrCreateCachedBinder(served.get());
    android::hardware::details::gBnMap->eraseIfEqual(served.get(), nullptr);
    EXPECT_EQ(android::hardware::getOrCreateCachedBinder(served.get()), stub);
}

TEST(SocketConnectionTest, WrongReplyIsAFailureAndAnEndOrOneThatIsTooLargeADeath) {
    android::hardware::Packet packet;
    packet.packStatus(android::OK);
    const std::string success(reinterpret_cast<const char*>(packet.bytes), packet.size);
    for (const std::string& last : {std::string(), std::string(packet.kMaxSize + 1, '\0')}) {
        int sockets[2];
        ASSERT_EQ(socketpair(AF_UNIX, SOCK_SEQPACKET, 0, sockets), 0);
        android::hardware::SocketConnection connection(android::UniqueFd{sockets[0]}, -1, 0);
        android::hardware::Parcel reply;
        for (const std::string& wrong : {success, std::string(17, '\0')}) {
            ASSERT_GT(send(sockets[1], wrong.data(), wrong.size(), 0), 0);
            EXPECT_EQ(connection.transact(1, {}, &reply, 0), android::FAILED_TRANSACTION);
        }
        android::hardware::Parcel objects;
        objects.writeStrongBinder(new BpHwBinder(4'000'000'003));
        EXPECT_EQ(connection.transact(1, objects, &reply, TF_ONE_WAY), android::FAILED_TRANSACTION);
        // Not closed: the request that nobody has read would be an error of its own.
        send(sockets[1], last.data(), last.size(), 0);
        EXPECT_EQ(connection.transact(1, {}, &reply, 0), android::DEAD_OBJECT);
        close(sockets[1]);
    }
}

struct Untold : IBinder::DeathRecipient {
    void binderDied(const wp<IBinder>&) override {}
};

TEST_F(RuntimeTest, DeathNoticeThatCannotBeHadIsRefusedEveryTime) {
    const sp<BpHwBinder> unknown = new BpHwBinder(4'000'000'000);
    const sp<Untold> recipient = new Untold;
    EXPECT_EQ(unknown->linkToDeath(recipient), android::DEAD_OBJECT);
    EXPECT_EQ(unknown->linkToDeath(recipient), android::DEAD_OBJECT);
    EXPECT_EQ(unknown->unlinkToDeath(recipient), android::NAME_NOT_FOUND);
    EXPECT_EQ(unknown->transact(1, {}, nullptr, 0), android::DEAD_OBJECT);
}

TEST_F(RuntimeTest, OneThreadServesHoweverManyJoin) {
    const sp<Slow> slow = new Slow;
    ASSERT_EQ(slow->registerAsService("slow"), android::OK);
    ProcessState::self()->startThreadPool();
    const size_t threads = threadCount();
    ProcessState::self()->startThreadPool();
    EXPECT_LE(threadCount(), threads);
    for (int i = 0; i < 2; ++i)
        std::thread(android::hardware::joinRpcThreadpool).detach();
    for (int i = 0; i < 6; ++i) {
        const auto client = IServiceNotification::tryGetService("slow");
        ASSERT_NE(client, nullptr);
        EXPECT_TRUE(client->onRegistration("", "", false).isOk());
        EXPECT_NE(client->registerAsService("another's"), android::OK);
    }
    EXPECT_TRUE(eventually([&] { return slow->calls == 6; }));
    EXPECT_EQ(slow->most, 1);
}

TEST_F(RuntimeTest, ConnectionThatAForkedChildHasTooIsDroppedAllTheSame) {
    const sp<Slow> object = new Slow;
    ASSERT_EQ(object->registerAsService("default"), android::OK);
    ProcessState::self()->startThreadPool();
    const RawClient client(mDirectory.path(), Slow::descriptor);
    ASSERT_TRUE(client.answersPing());
    const Child child([] { sleep(30); });
    // One without measure costs the connection; what comes after it must not find it again.
    for (int i = 0; i < 3; ++i)
        EXPECT_TRUE(client.send("", 0));
    for (int i = 0; i < 100; ++i)
        EXPECT_TRUE(RawClient(mDirectory.path(), Slow::descriptor).answersPing());
}

TEST_F(RuntimeTest, WhatIsWaitedForLongIsFoundSoonByAServerThatIsIdle) {
    const std::string lock =
            mDirectory.path() + "/" + IServiceNotification::descriptor + ".taken.lock";
    // All that one who has the name must do.
    const int first = open(lock.c_str(), O_RDWR | O_CREAT | O_CLOEXEC, 0600);
    ASSERT_EQ(flock(first, LOCK_EX), 0);
    const auto isServed = [] {
        const auto client = IServiceNotification::tryGetService("taken");
        return client != nullptr && client->ping().isOk();
    };
    android::hardware::configureRpcThreadpool(1, false);
    ProcessState::self()->startThreadPool();
    // Now it waits, with nothing to do.
    std::this_thread::sleep_for(milliseconds(50));
    LogCapture ownLog;
    const sp<Slow> second = new Slow;
    EXPECT_NE(second->registerAsService("taken"), android::OK);
    std::thread search([] { EXPECT_NE(IServiceNotification::getService("late"), nullptr); });
    // Long enough to show whether the tries get ever rarer.
    std::this_thread::sleep_for(milliseconds(1100));
    const auto start = std::chrono::steady_clock::now();
    close(first);
    EXPECT_TRUE(eventually(isServed));
    EXPECT_EQ(second->registerAsService("late"), android::OK);
    search.join();
    EXPECT_LT(std::chrono::steady_clock::now() - start, milliseconds(700));
    const std::string text = ownLog.takeText();
    const std::string waiting = std::string("): waiting; ") + Slow::descriptor + "/late is not";
    EXPECT_LT(text.find(waiting), text.size()) << text;
    EXPECT_EQ(text.find(waiting), text.rfind(waiting)) << "it is said once";
    const size_t taken = text.find(".taken is not registered yet: another process has the name");
    EXPECT_LT(text.find(".taken is registered now", taken), text.size()) << text;
}

TEST_F(RuntimeTest, WhatIsNoServiceIsNotRegistered) {
    auto& makers = android::hardware::details::getBnConstructorMap();
    const auto make = makers.get(Slow::descriptor, nullptr);
    makers.erase(Slow::descriptor);
    LogCapture ownLog;
    EXPECT_EQ((new Slow)->registerAsService("x"), android::UNKNOWN_ERROR);
    makers.set(Slow::descriptor, make);
    EXPECT_NE(ownLog.takeText().find("): no stub is known for android.hidl.manager@1.0::ISe"),
              std::string::npos);
    const auto manager = android::hardware::defaultServiceManager1_2();
    EXPECT_FALSE(manager->addWithChain("x", new Slow, {}).withDefault(true));
    EXPECT_FALSE(manager->addWithChain("x", nullptr, {"a@1.0::IA"}).withDefault(true));
    EXPECT_EQ((new Slow)->registerAsService("x"), android::OK);
    EXPECT_EQ(chmod(mDirectory.path().c_str(), 0777), 0) << "where it is not looked for";
    size_t count = 1;
    EXPECT_TRUE(manager->list([&](const auto& names) { count = names.size(); }).isOk());
    EXPECT_EQ(count, 0U);
}

TEST_F(RuntimeTest, WatchForServicesTakesOneThread) {
    const size_t before = threadCount();
    const auto manager = android::hardware::defaultServiceManager1_2();
    const sp<Slow> callback = new Slow;
    for (int i = 0; i < 20; ++i) {
        EXPECT_TRUE(manager->registerForNotifications("a@1.0::IA", "x", callback));
        EXPECT_TRUE(manager->unregisterForNotifications("a@1.0::IA", "x", callback));
    }
    // One more may be about to end.
    EXPECT_LE(threadCount(), before + 2);
    // Nor does one begin to serve where the caller is to do so.
    android::hardware::configureRpcThreadpool(1, true);
    ProcessState::self()->startThreadPool();
    EXPECT_TRUE(eventually([&] { return threadCount() == before; }));
}

}  // namespace
