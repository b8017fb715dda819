// SPDX-License-Identifier: Apache-2.0
#include "hwservicemanager/ServiceManager.h"
#include "libhwbinder/Driver.h"
#include "support/LogCapture.h"

#include <android/hidl/manager/1.0/BpHwServiceNotification.h>
#include <gtest/gtest.h>

#include <list>
#include <string>
#include <vector>

namespace {

using ::android::sp;
using Caller = ::android::hardware::CallerIdentity;
using ::android::hardware::getOrCreateCachedBinder;
using ::android::hardware::hidl_death_recipient;
using ::android::hardware::hidl_string;
using ::android::hardware::Return;
using ::android::hardware::ServiceManager;
using Notification = ::android::hidl::manager::V1_0::IServiceNotification;
using ::android::hidl::manager::V1_0::BpHwServiceNotification;

/** An object to register, and to be told of others. */
struct Object : Notification {
    Return<void> onRegistration(const hidl_string& interface, const hidl_string& name,
                                bool preexisting) override {
        news.push_back(std::string(interface) + "/" + std::string(name) +
                       (preexisting ? " before" : ""));
        return ::android::hardware::Void();
    }
    std::vector<std::string> news;
};

/** A proxy of an object as if that were of another process, whose end the test decides. */
struct Remote : BpHwServiceNotification {
    explicit Remote(const sp<Object>& object)
        : BpHwServiceNotification(getOrCreateCachedBinder(object.get())) {}
    Return<bool> linkToDeath(const sp<hidl_death_recipient>& recipient, uint64_t) override {
        if (isAlive) recipients.push_back(recipient);
        return isAlive;
    }
    Return<bool> unlinkToDeath(const sp<hidl_death_recipient>& recipient) override {
        recipients.remove(recipient);
        return true;
    }
    void die() {
        isAlive = false;
        for (const auto& recipient : std::list(recipients))
            recipient->serviceDied(0, nullptr);
    }
    bool isAlive = true;
    std::list<sp<hidl_death_recipient>> recipients;
};

/** An object that does not say which interfaces it has. */
struct Silent : Object {
    Return<void> interfaceChain(interfaceChain_cb) override {
        return ::android::hardware::Status::fromExceptionCode(-1);
    }
};

constexpr char kInterface[] = "android.hidl.manager@1.0::IServiceNotification";
constexpr uid_t kNobody = 54321;

class ServiceManagerTest : public ::testing::Test {
  protected:
    std::vector<std::string> names() {
        std::vector<std::string> result;
        mManager->list([&](const auto& list) { result.assign(list.begin(), list.end()); });
        return result;
    }
    bool knows(const char* name) {
        return sp<ServiceManager::IBase>(mManager->get(kInterface, name)) != nullptr;
    }

    const sp<ServiceManager> mManager = new ServiceManager;
    const sp<Object> mObject = new Object;
};

TEST_F(ServiceManagerTest, OnlySomeMayAdd) {
    LogCapture log;
    for (const uid_t uid : {0U, 1000U, getuid(), kNobody}) {
        const bool isAllowed = uid != kNobody;
        const std::string name = "of" + std::to_string(uid);
        const Caller caller(uid, 7);
        EXPECT_EQ(mManager->add(name, mObject).withDefault(false), isAllowed) << uid;
        EXPECT_EQ(mManager->addWithChain(name, mObject, {kInterface}).withDefault(false),
                  isAllowed);
        EXPECT_EQ(knows(name.c_str()), isAllowed);
        const std::string text = log.takeText();
        const std::string said = isAllowed ? "/" + name + " of process 7"
                                           : "uid 54321 may not add a service \"of54321\"";
        EXPECT_NE(text.find(said + "\n"), std::string::npos) << text;
    }
    EXPECT_FALSE(mManager->add("", mObject).withDefault(true));
    EXPECT_FALSE(mManager->add("none", nullptr).withDefault(true));
    EXPECT_FALSE(mManager->add("none", new Silent).withDefault(true));
    EXPECT_FALSE(mManager->addWithChain("none", nullptr, {kInterface}).withDefault(true));
    EXPECT_FALSE(mManager->addWithChain("none", mObject, {}).withDefault(true));
    const sp<Remote> gone = new Remote(mObject);
    gone->die();
    EXPECT_FALSE(mManager->addWithChain("none", gone, {kInterface}).withDefault(true));
    EXPECT_FALSE(mManager->registerForNotifications(kInterface, "", gone).withDefault(true));
}

TEST_F(ServiceManagerTest, DeathTakesAwayAllThatAProcessHad) {
    const Caller caller(0, 7);
    const sp<Remote> remote = new Remote(mObject);
    EXPECT_TRUE(mManager->addWithChain("one", remote, {kInterface}));
    EXPECT_TRUE(mManager->addWithChain("two", remote, {kInterface}));
    EXPECT_TRUE(mManager->registerForNotifications(kInterface, "", remote));
    EXPECT_EQ(remote->recipients.size(), 3U);
    // Each call comes with a proxy of its own.
    EXPECT_TRUE(mManager->unregisterForNotifications(kInterface, "", new Remote(mObject)));
    EXPECT_TRUE(mManager->tryUnregister(kInterface, "one", new Remote(mObject)));
    EXPECT_TRUE(mManager->add("two", new Object));
    EXPECT_TRUE(remote->recipients.empty()) << "the death is of no interest any more";

    EXPECT_TRUE(mManager->addWithChain("three", remote, {kInterface, "a@1.0::IA"}));
    EXPECT_TRUE(mManager->registerForNotifications("b@1.0::IB", "", remote));
    remote->die();
    EXPECT_EQ(names(), std::vector<std::string>{std::string(kInterface) + "/two"});
    EXPECT_FALSE(mManager->unregisterForNotifications("", "", new Remote(mObject)));
}

TEST_F(ServiceManagerTest, BinderOfAnotherInterfaceIsNoListener) {
    const auto listener = [](::android::hidl::base::V1_0::IBase* object) {
        return ::android::hardware::fromBinder<Notification, BpHwServiceNotification, void>(
                getOrCreateCachedBinder(object));
    };
    EXPECT_EQ(listener(mObject.get()), mObject);
    EXPECT_EQ(listener(mManager.get()), nullptr);
    using ::android::hidl::base::V1_0::IBase;
    EXPECT_EQ(sp<Notification>(Notification::castFrom(sp<IBase>(mObject))), mObject);
    EXPECT_EQ(sp<Notification>(Notification::castFrom(sp<IBase>(mManager))), nullptr);
    EXPECT_EQ(sp<Notification>(Notification::castFrom(sp<IBase>())), nullptr);
}

TEST_F(ServiceManagerTest, LastOneAddedHasTheNamesAndOnlyItsProcessTakesThemAway) {
    const sp<Object> second = new Object;
    const Caller caller(0, 7);
    EXPECT_TRUE(mManager->addWithChain("default", mObject, {kInterface, "a@1.0::IA"}));
    EXPECT_TRUE(mManager->addWithChain("default", second,
                                       {kInterface, ServiceManager::IBase::descriptor}));
    EXPECT_EQ(names(), (std::vector<std::string>{"a@1.0::IA/default",
                                                 std::string(kInterface) + "/default"}));
    EXPECT_EQ(sp<ServiceManager::IBase>(mManager->get(kInterface, "default")), second);
    EXPECT_EQ(sp<ServiceManager::IBase>(mManager->get("a@1.0::IA", "default")), mObject);
    EXPECT_FALSE(mManager->tryUnregister(kInterface, "default", mObject)) << "it has lost the name";
    EXPECT_FALSE(mManager->tryUnregister(kInterface, "default", nullptr));
    EXPECT_FALSE(mManager->tryUnregister(kInterface, "other", second));
    {
        const Caller another(0, 8);
        EXPECT_FALSE(mManager->tryUnregister(kInterface, "default", second));
    }
    EXPECT_TRUE(mManager->tryUnregister("a@1.0::IA", "default", mObject));
    EXPECT_TRUE(knows("default"));
    EXPECT_TRUE(mManager->tryUnregister(kInterface, "default", second));
    EXPECT_TRUE(names().empty());
    using Transport = ServiceManager::Transport;
    EXPECT_EQ(mManager->getTransport(kInterface, "default").withDefault(Transport::EMPTY),
              Transport::HWBINDER)
            << "it may come again";
}

TEST_F(ServiceManagerTest, ListenersHearOfWhatTheyAskedFor) {
    const sp<Object> all = new Object;
    const sp<Object> one = new Object;
    const Caller caller(0, 7);
    EXPECT_TRUE(mManager->add("first", mObject));
    EXPECT_TRUE(mManager->registerForNotifications(kInterface, "", all));
    EXPECT_TRUE(mManager->registerForNotifications(kInterface, "second", one));
    EXPECT_TRUE(mManager->registerForNotifications("a@1.0::IA", "", one));
    EXPECT_TRUE(mManager->add("second", mObject));
    EXPECT_FALSE(mManager->unregisterForNotifications(kInterface, "second", all));
    EXPECT_FALSE(mManager->unregisterForNotifications(kInterface, "second", nullptr));
    EXPECT_TRUE(mManager->unregisterForNotifications(kInterface, "second", one));
    EXPECT_TRUE(mManager->add("second", mObject));
    EXPECT_TRUE(mManager->unregisterForNotifications("", "", all));
    EXPECT_TRUE(mManager->add("second", mObject));
    const std::string name = kInterface;
    EXPECT_EQ(all->news, (std::vector<std::string>{name + "/first before", name + "/second",
                                                   name + "/second"}));
    EXPECT_EQ(one->news, std::vector<std::string>{name + "/second"});
}

TEST_F(ServiceManagerTest, OneUserCannotMakeItGrow) {
    const Caller caller(kNobody, 7);
    EXPECT_FALSE(mManager->registerForNotifications("", "", mObject));
    EXPECT_FALSE(mManager->registerForNotifications("a", "", nullptr));
    const std::string tooLong(1025, 'x');
    EXPECT_FALSE(mManager->registerForNotifications(tooLong, "", mObject));
    EXPECT_FALSE(mManager->registerForNotifications("a", tooLong, mObject));
    EXPECT_TRUE(mManager->registerForNotifications(tooLong.substr(1), "", mObject));
    for (int i = 1; i < 64; ++i)
        EXPECT_TRUE(mManager->registerForNotifications("a", "", mObject)) << i;
    EXPECT_FALSE(mManager->registerForNotifications("a", "", mObject));
    const Caller another(kNobody + 1, 8);
    EXPECT_TRUE(mManager->registerForNotifications("a", "", mObject));
}

}  // namespace
