// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <hwbinder/IPCThreadState.h>
#include <unistd.h>
#include <vendor/velmora/hardware/vibrator/2.1/IDaxVibrator.h>

#include <string>
#include <vector>

/**
 * An object whose answers tell which operation was called, and with what: a status is made of the
 * arguments, a number from a callback of the operation's number and the arguments, and of the nine
 * yes-or-no queries only the one whose number the last on() gave answers yes.
 */
class FakeVibrator : public ::vendor::velmora::hardware::vibrator::V2_1::IDaxVibrator {
  public:
    template <typename T>
    using Return = ::android::hardware::Return<T>;
    template <typename T>
    using hidl_vec = ::android::hardware::hidl_vec<T>;
    using Status = ::android::hardware::vibrator::V1_0::Status;
    using EffectStrength = ::android::hardware::vibrator::V1_0::EffectStrength;
    using DaxFolderStatus = ::vendor::velmora::hardware::vibrator::V2_0::DaxFolderStatus;
    using DaxFrequencyType = ::vendor::velmora::hardware::vibrator::V2_0::DaxFrequencyType;
    using DaxHapticEnginePacket =
            ::vendor::velmora::hardware::vibrator::V2_0::DaxHapticEnginePacket;
    using DaxAmplitudeType = ::vendor::velmora::hardware::vibrator::V2_1::DaxAmplitudeType;

    /** Arguments of on() that make it do something special. */
    static constexpr uint32_t kDie = 77777;
    static constexpr uint32_t kSleep = 88888;

    Return<Status> on(uint32_t timeoutMs) override {
        if (timeoutMs == kDie) _exit(0);
        if (timeoutMs == kSleep) usleep(200'000);
        mYes = timeoutMs;
        return status(timeoutMs);
    }
    Return<Status> off() override { return Status::UNSUPPORTED_OPERATION; }
    Return<bool> supportsAmplitudeControl() override { return yes(3); }
    Return<Status> setAmplitude(uint8_t amplitude) override { return status(amplitude); }
    Return<void> perform(::android::hardware::vibrator::V1_0::Effect effect,
                         EffectStrength strength, perform_cb cb) override {
        return answer(cb, 5, effect, strength);
    }
    Return<void> perform_1_1(::android::hardware::vibrator::V1_1::Effect_1_1 effect,
                             EffectStrength strength, perform_1_1_cb cb) override {
        return answer(cb, 6, effect, strength);
    }
    Return<void> perform_1_2(::android::hardware::vibrator::V1_2::Effect effect,
                             EffectStrength strength, perform_1_2_cb cb) override {
        return answer(cb, 7, effect, strength);
    }
    Return<bool> supportsExternalControl() override { return yes(8); }
    Return<Status> setExternalControl(bool enabled) override { return status(enabled ? 1 : 2); }
    Return<void> perform_1_3(::android::hardware::vibrator::V1_3::Effect effect,
                             EffectStrength strength, perform_1_3_cb cb) override {
        return answer(cb, 10, effect, strength);
    }
    Return<bool> daxSupportsAmplitudeControl() override { return yes(11); }
    Return<bool> daxSupportsForceTouchAmplitudeControl() override { return yes(12); }
    Return<bool> daxSupportsFrequencyControl() override { return yes(13); }
    Return<bool> daxSupportsHapticEngine() override { return yes(14); }
    Return<bool> daxSupportsPrebakedHapticPattern() override { return yes(15); }
    Return<bool> daxSupportsFolderStatusSetting() override { return yes(16); }
    Return<bool> daxSupportsEnhancedVelmoraHapticPattern() override { return yes(17); }
    Return<Status> daxSetAmplitude(uint32_t amplitude) override { return status(amplitude / 10); }
    Return<Status> daxSetForceTouchAmplitude(uint32_t amplitude) override {
        return status(amplitude / 100);
    }
    Return<Status> daxSetFrequencyType(DaxFrequencyType type) override {
        return status(static_cast<uint32_t>(type));
    }
    Return<Status> daxSetFolderStatus(DaxFolderStatus state) override {
        return status(static_cast<uint32_t>(state) + 2);
    }
    /** Tells who calls. */
    Return<void> daxGetNumberOfPrebakedHapticPattern(
            daxGetNumberOfPrebakedHapticPattern_cb cb) override {
        cb(Status::BAD_VALUE, ::android::hardware::IPCThreadState::self()->getCallingUid());
        return ::android::hardware::Void();
    }
    Return<Status> daxPerformHapticEngine(const hidl_vec<DaxHapticEnginePacket>& packets,
                                          uint32_t amplitude) override {
        uint32_t sum = amplitude;
        for (const DaxHapticEnginePacket& packet : packets) {
            sum += static_cast<uint32_t>(packet.param0 + 3 * packet.intensity + 5 * packet.param2 +
                                         7 * packet.param3);
        }
        return status(sum);
    }
    Return<Status> daxPerformPrebakedHapticPattern(uint32_t pattern, uint32_t amplitude,
                                                   bool repeat) override {
        return status(pattern * 2 + amplitude + (repeat ? 1 : 0));
    }
    /** Gives as many numbers as the type says. */
    Return<void> daxGetAmplitudeList(DaxAmplitudeType type, daxGetAmplitudeList_cb cb) override {
        std::vector<uint32_t> list(static_cast<uint32_t>(type));
        for (size_t i = 0; i < list.size(); ++i)
            list[i] = static_cast<uint32_t>(i * i);
        hidl_vec<uint32_t> reply;
        reply.setToExternal(list.data(), list.size());
        cb(!list.empty(), reply);
        return ::android::hardware::Void();
    }

    /** Gives a status of each kind, one after the other. */
    static Status status(uint32_t number) { return static_cast<Status>(number % 4); }

  private:
    bool yes(uint32_t query) const { return mYes == query; }

    template <typename Effect>
    Return<void> answer(const perform_cb& cb, uint32_t operation, Effect effect,
                        EffectStrength strength) {
        cb(Status::UNKNOWN_ERROR, operation * 1'000'000 + static_cast<uint32_t>(effect) * 1000 +
                                          static_cast<uint32_t>(strength));
        return ::android::hardware::Void();
    }

    uint32_t mYes = 0;
};
