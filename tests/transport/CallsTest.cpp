// SPDX-License-Identifier: Apache-2.0
#include "transport/TransportTest.h"

#include <cstdint>
#include <cstring>
#include <thread>

namespace {

using ::android::sp;
using ::android::hardware::hidl_vec;
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

TEST_F(CallsTest, EveryOperationReachesItsOwnWithItsArguments) {
    EXPECT_EQ(Status(mClient->on(4294967293U)), Status::UNKNOWN_ERROR);
    EXPECT_EQ(Status(mClient->off()), Status::UNSUPPORTED_OPERATION);
    EXPECT_EQ(Status(mClient->setAmplitude(254)), Status::BAD_VALUE);
    EXPECT_EQ(Status(mClient->setExternalControl(true)), Status::UNKNOWN_ERROR);
    EXPECT_EQ(Status(mClient->setExternalControl(false)), Status::BAD_VALUE);
    EXPECT_EQ(Status(mClient->daxSetAmplitude(25)), Status::BAD_VALUE);
    EXPECT_EQ(Status(mClient->daxSetForceTouchAmplitude(300)), Status::UNSUPPORTED_OPERATION);
    EXPECT_EQ(Status(mClient->daxSetFrequencyType(FakeVibrator::DaxFrequencyType::TYPE_3)),
              Status::UNSUPPORTED_OPERATION);
    EXPECT_EQ(Status(mClient->daxSetFolderStatus(FakeVibrator::DaxFolderStatus::FOLDER_CLOSE)),
              Status::UNSUPPORTED_OPERATION);
    EXPECT_EQ(Status(mClient->daxPerformHapticEngine({{1, 2, 3, 4}, {-5, 6, -7, 8}}, 10)),
              FakeVibrator::status(10 + 1 + 6 + 15 + 28 - 5 + 18 - 35 + 56));
    EXPECT_EQ(Status(mClient->daxPerformPrebakedHapticPattern(1, 4, true)),
              Status::UNSUPPORTED_OPERATION);
    EXPECT_EQ(Status(mClient->daxPerformPrebakedHapticPattern(1, 4, false)), Status::BAD_VALUE);

    uint32_t number = 0;
    const auto take = [&](Status status, uint32_t answered) {
        EXPECT_EQ(status, Status::UNKNOWN_ERROR);
        number = answered;
    };
    const auto strong = FakeVibrator::EffectStrength::STRONG;
    EXPECT_TRUE(mClient->perform(vibrator::V1_0::Effect::DOUBLE_CLICK, strong, take).isOk());
    EXPECT_EQ(number, 5001002U);
    EXPECT_TRUE(mClient->perform_1_1(vibrator::V1_1::Effect_1_1::TICK, strong, take).isOk());
    EXPECT_EQ(number, 6002002U);
    EXPECT_TRUE(mClient->perform_1_2(vibrator::V1_2::Effect::RINGTONE_15, strong, take).isOk());
    EXPECT_EQ(number, 7020002U);
    EXPECT_TRUE(mClient->perform_1_3(vibrator::V1_3::Effect::TEXTURE_TICK, strong, take).isOk());
    EXPECT_EQ(number, 10021002U);
}

TEST_F(CallsTest, EachQueryHasItsOwnAnswer) {
    using Query = ::android::hardware::Return<bool> (IDaxVibrator::*)();
    const std::pair<uint32_t, Query> queries[] = {
            {3, &IDaxVibrator::supportsAmplitudeControl},
            {8, &IDaxVibrator::supportsExternalControl},
            {11, &IDaxVibrator::daxSupportsAmplitudeControl},
            {12, &IDaxVibrator::daxSupportsForceTouchAmplitudeControl},
            {13, &IDaxVibrator::daxSupportsFrequencyControl},
            {14, &IDaxVibrator::daxSupportsHapticEngine},
            {15, &IDaxVibrator::daxSupportsPrebakedHapticPattern},
            {16, &IDaxVibrator::daxSupportsFolderStatusSetting},
            {17, &IDaxVibrator::daxSupportsEnhancedVelmoraHapticPattern},
    };
    for (const auto& [yes, unused] : queries) {
        ASSERT_TRUE(mClient->on(yes).isOk());
        for (const auto& [number, query] : queries) {
            EXPECT_EQ(bool((*mClient.*query)()), number == yes) << yes << ' ' << number;
        }
    }
}

TEST_F(CallsTest, ListsArriveWhole) {
    for (const uint32_t count : {0U, 1U, 6U, 5000U}) {
        int answers = 0;
        const auto result =
                mClient->daxGetAmplitudeList(static_cast<FakeVibrator::DaxAmplitudeType>(count),
                                             [&](bool supported, const hidl_vec<uint32_t>& list) {
                                                 ++answers;
                                                 EXPECT_EQ(supported, count > 0);
                                                 ASSERT_EQ(list.size(), count);
                                                 for (uint32_t i = 0; i < count; ++i)
                                                     ASSERT_EQ(list[i], i * i);
                                             });
        EXPECT_TRUE(result.isOk());
        EXPECT_EQ(answers, 1);
    }
}

TEST_F(CallsTest, MessageThatIsTooLargeCostsOnlyItself) {
    const std::vector<FakeVibrator::DaxHapticEnginePacket> packets(4096);
    const auto request = mClient->daxPerformHapticEngine(packets, 1);
    EXPECT_FALSE(request.isOk());
    EXPECT_FALSE(request.isDeadObject());
    EXPECT_EQ(request.description(), "the arguments are too large");

    const auto reply = mClient->daxGetAmplitudeList(
            static_cast<FakeVibrator::DaxAmplitudeType>(20000),
            [](bool, const hidl_vec<uint32_t>&) { FAIL() << "there is no answer"; });
    EXPECT_FALSE(reply.isOk());
    EXPECT_EQ(reply.description(), "the message is too large");
    EXPECT_TRUE(mClient->on(1).isOk());
}

TEST_F(CallsTest, BaseOperationsHaveThePlatformsDefaults) {
    const std::vector<std::string> expected = {"vendor.velmora.hardware.vibrator@2.1::IDaxVibrator",
                                               "vendor.velmora.hardware.vibrator@2.0::IDaxVibrator",
                                               "android.hardware.vibrator@1.3::IVibrator",
                                               "android.hardware.vibrator@1.2::IVibrator",
                                               "android.hardware.vibrator@1.1::IVibrator",
                                               "android.hardware.vibrator@1.0::IVibrator",
                                               "android.hidl.base@1.0::IBase"};
    const sp<IDaxVibrator> local = new FakeVibrator;
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
    EXPECT_EQ(Status(oldest->on(5)), Status::UNKNOWN_ERROR);
    EXPECT_EQ(Status(vibrator::V1_1::IVibrator::getService()->on(5)), Status::UNKNOWN_ERROR);
    EXPECT_EQ(Status(vibrator::V1_2::IVibrator::getService()->on(5)), Status::UNKNOWN_ERROR);
    EXPECT_EQ(Status(vibrator::V1_3::IVibrator::getService()->on(5)), Status::UNKNOWN_ERROR);
    EXPECT_EQ(Status(V20::getService()->daxSetAmplitude(10)), Status::UNKNOWN_ERROR);

    const sp<IDaxVibrator> cast = IDaxVibrator::castFrom(oldest);
    ASSERT_NE(cast.get(), nullptr);
    EXPECT_TRUE(cast->isRemote());
    EXPECT_EQ(Status(cast->daxSetAmplitude(10)), Status::UNKNOWN_ERROR);
}

TEST_F(CallsTest, CastsTellWhatAnObjectIs) {
    const sp<IDaxVibrator> local = new FakeVibrator;
    const sp<IBase> base = local;
    EXPECT_EQ(sp<IDaxVibrator>(IDaxVibrator::castFrom(base)), local);
    EXPECT_EQ(sp<vibrator::V1_0::IVibrator>(vibrator::V1_0::IVibrator::castFrom(base)).get(),
              local.get());
    EXPECT_EQ(sp<IDaxVibrator>(IDaxVibrator::castFrom(new IBase)).get(), nullptr);
    EXPECT_EQ(sp<IDaxVibrator>(IDaxVibrator::castFrom(nullptr)).get(), nullptr);
    mServer.kill();
    EXPECT_FALSE(IDaxVibrator::castFrom(mClient).isOk());
}

TEST_F(CallsTest, CallerIsWhoTheKernelSays) {
    if (geteuid() != 0) GTEST_SKIP() << "only root can become somebody else";
    for (const uid_t uid : {0U, 1000U, 2000U, 10123U}) {
        EXPECT_EQ(runAs(uid,
                        [uid] {
                            uint32_t seen = 1;
                            IDaxVibrator::getService()->daxGetNumberOfPrebakedHapticPattern(
                                    [&](Status, uint32_t caller) { seen = caller; });
                            return seen == uid ? 0 : 1;
                        }),
                  0)
                << uid;
    }
}

TEST_F(CallsTest, ThreadsMayShareAnObject) {
    std::vector<std::thread> threads;
    for (uint32_t id = 0; id < 4; ++id) {
        threads.emplace_back([&, id] {
            for (int i = 0; i < 500; ++i) {
                ASSERT_EQ(Status(mClient->daxSetFrequencyType(
                                  static_cast<FakeVibrator::DaxFrequencyType>(id))),
                          FakeVibrator::status(id));
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
