// SPDX-License-Identifier: Apache-2.0
#include "transport/TransportTest.h"

#include <cstdint>
#include <cstring>
#include <thread>

namespace {

using ::android::sp;
using ::android::hidl::base::V1_0::IBase;
namespace vibrator = ::android::hardware::vibrator;
using V20 = ::vendor::velmora::hardware::vibrator::V2_0::IDaxVibrator;

class CallsTest : public TransportTest {
  protected:
    CallsTest() {
        serve();
        mClient = IDaxVibrator::getService();
    }

    sp<IDaxVibrator> mClient;
};

TEST_F(CallsTest, MessageThatIsTooLargeCostsOnlyItself) {
    const std::vector<::vendor::velmora::hardware::vibrator::V2_0::DaxHapticEnginePacket> packets(
            4096);
    const auto request = mClient->daxPerformHapticEngine(packets, 1);
    EXPECT_FALSE(request.isOk());
    EXPECT_FALSE(request.isDeadObject());
    EXPECT_EQ(request.description(), "the arguments are too large");
    EXPECT_TRUE(mClient->ping().isOk());
}

TEST_F(CallsTest, BaseOperationsHaveThePlatformsDefaults) {
    const std::vector<std::string> expected = {"vendor.velmora.hardware.vibrator@2.1::IDaxVibrator",
                                               "vendor.velmora.hardware.vibrator@2.0::IDaxVibrator",
                                               "android.hardware.vibrator@1.3::IVibrator",
                                               "android.hardware.vibrator@1.2::IVibrator",
                                               "android.hardware.vibrator@1.1::IVibrator",
                                               "android.hardware.vibrator@1.0::IVibrator",
                                               "android.hidl.base@1.0::IBase"};
    const sp<IDaxVibrator> local = new Vibrator;
    EXPECT_FALSE(local->isRemote());
    EXPECT_TRUE(mClient->isRemote());
    for (const sp<IDaxVibrator>& object : {local, mClient}) {
        std::vector<std::string> chain;
        EXPECT_TRUE(object->interfaceChain([&](const auto& descriptors) {
                              for (const auto& each : descriptors)
                                  chain.emplace_back(each);
                          }).isOk());
        EXPECT_EQ(chain, expected);
        EXPECT_TRUE(object->interfaceDescriptor([&](const auto& descriptor) {
                              EXPECT_EQ(std::string(descriptor), expected[0]);
                          }).isOk());
        EXPECT_TRUE(object->getHashChain([&](const auto& hashes) {
                              ASSERT_EQ(hashes.size(), expected.size());
                              for (const auto& hash : hashes)
                                  EXPECT_EQ(hash.elements[31], 0);
                          }).isOk());
        EXPECT_TRUE(object->getDebugInfo([](const auto& info) {
                              EXPECT_EQ(info.pid, -1);
                              EXPECT_EQ(info.ptr, 0U);
                          }).isOk());
        EXPECT_TRUE(object->ping().isOk());
        EXPECT_TRUE(object->setHALInstrumentation().isOk());
        EXPECT_TRUE(object->notifySyspropsChanged().isOk());
        EXPECT_TRUE(object->debug({}, {"one", ""}).isOk());
    }
    const sp<android::hardware::hidl_death_recipient> recipient =
            new android::hardware::hidl_death_recipient;
    EXPECT_TRUE(local->linkToDeath(recipient, 0));
    EXPECT_TRUE(local->unlinkToDeath(recipient));
    EXPECT_FALSE(local->linkToDeath(nullptr, 0));
    // No news of a death will come from another process.
    EXPECT_FALSE(mClient->linkToDeath(recipient, 0));
}

TEST_F(CallsTest, ObjectIsFoundUnderEveryInterfaceOfItsChain) {
    const sp<vibrator::V1_0::IVibrator> oldest = vibrator::V1_0::IVibrator::getService();
    EXPECT_TRUE(oldest->ping().isOk());
    for (const Answer& answer :
         {call(*vibrator::V1_1::IVibrator::getService()),
          call(*vibrator::V1_2::IVibrator::getService()),
          call(*vibrator::V1_3::IVibrator::getService()), call(*V20::getService())}) {
        EXPECT_EQ(answer.inWords(), "(UNSUPPORTED_OPERATION, 0)");
    }
    const sp<IDaxVibrator> cast = IDaxVibrator::castFrom(oldest);
    ASSERT_NE(cast.get(), nullptr);
    EXPECT_TRUE(cast->isRemote());
    EXPECT_TRUE(call(*cast).isOk);
}

TEST_F(CallsTest, CastsTellWhatAnObjectIs) {
    const sp<IDaxVibrator> local = new Vibrator;
    const sp<IBase> base = local;
    EXPECT_EQ(sp<IDaxVibrator>(IDaxVibrator::castFrom(base)), local);
    EXPECT_EQ(sp<vibrator::V1_0::IVibrator>(vibrator::V1_0::IVibrator::castFrom(base)).get(),
              local.get());
    EXPECT_EQ(sp<IDaxVibrator>(IDaxVibrator::castFrom(new IBase)).get(), nullptr);
    EXPECT_EQ(sp<IDaxVibrator>(IDaxVibrator::castFrom(nullptr)).get(), nullptr);
    mServer.kill();
    EXPECT_FALSE(IDaxVibrator::castFrom(mClient).isOk());
}

TEST_F(CallsTest, ThreadsMayShareAnObject) {
    std::vector<std::thread> threads;
    for (uint32_t id = 0; id < 4; ++id) {
        threads.emplace_back([&, id] {
            for (int i = 0; i < 500; ++i) {
                // A reply that went astray would show: they differ in kind.
                if (id % 2 == 0) {
                    ASSERT_EQ(call(*mClient).inWords(), "(UNSUPPORTED_OPERATION, 0)");
                } else {
                    size_t chain = 0;
                    mClient->interfaceChain([&](const auto& names) { chain = names.size(); });
                    ASSERT_EQ(chain, 7U);
                }
            }
        });
    }
    for (std::thread& thread : threads)
        thread.join();
}

/** The place of an operation in the virtual table, as the ABI encodes it in a member pointer. */
template <typename Method>
size_t slotOf(Method method) {
    static_assert(sizeof(method) == 2 * sizeof(uintptr_t));
    uintptr_t words[2];
    memcpy(words, &method, sizeof(words));
#ifdef __aarch64__
    return words[0] / sizeof(void*);
#else
    return (words[0] - 1) / sizeof(void*);
#endif
}

TEST(InterfaceTest, OperationsKeepTheirSlots) {
    using I = ::vendor::velmora::hardware::vibrator::V2_1::IDaxVibrator;
    const size_t base[] = {
            slotOf(&I::isRemote),
            slotOf(static_cast<android::hardware::Return<void> (I::*)(I::interfaceChain_cb)>(
                    &I::interfaceChain)),
            slotOf(&I::debug),
            slotOf(&I::interfaceDescriptor),
            slotOf(&I::getHashChain),
            slotOf(&I::setHALInstrumentation),
            slotOf(&I::linkToDeath),
            slotOf(&I::ping),
            slotOf(&I::getDebugInfo),
            slotOf(&I::notifySyspropsChanged),
            slotOf(&I::unlinkToDeath),
    };
    for (size_t i = 0; i < std::size(base); ++i)
        EXPECT_EQ(base[i], i);
    // Two slots of the destructor lie between.
    const size_t operations[] = {
            slotOf(&I::on),
            slotOf(&I::off),
            slotOf(&I::supportsAmplitudeControl),
            slotOf(&I::setAmplitude),
            slotOf(&I::perform),
            slotOf(&I::perform_1_1),
            slotOf(&I::perform_1_2),
            slotOf(&I::supportsExternalControl),
            slotOf(&I::setExternalControl),
            slotOf(&I::perform_1_3),
            slotOf(&I::daxSupportsAmplitudeControl),
            slotOf(&I::daxSupportsForceTouchAmplitudeControl),
            slotOf(&I::daxSupportsFrequencyControl),
            slotOf(&I::daxSupportsHapticEngine),
            slotOf(&I::daxSupportsPrebakedHapticPattern),
            slotOf(&I::daxSupportsFolderStatusSetting),
            slotOf(&I::daxSupportsEnhancedVelmoraHapticPattern),
            slotOf(&I::daxSetAmplitude),
            slotOf(&I::daxSetForceTouchAmplitude),
            slotOf(&I::daxSetFrequencyType),
            slotOf(&I::daxSetFolderStatus),
            slotOf(&I::daxGetNumberOfPrebakedHapticPattern),
            slotOf(&I::daxPerformHapticEngine),
            slotOf(&I::daxPerformPrebakedHapticPattern),
            slotOf(&I::daxGetAmplitudeList),
    };
    for (size_t i = 0; i < std::size(operations); ++i)
        EXPECT_EQ(operations[i], 13 + i) << i;
}

}  // namespace
