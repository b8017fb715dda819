// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <android/hardware/vibrator/1.3/IVibrator.h>
#include <vendor/velmora/hardware/vibrator/2.0/types.h>

#include <cstdint>
#include <functional>
#include <string>

namespace vendor::velmora::hardware::vibrator::V2_0 {

/** The extended vibrator; see interface/2.0 for what each operation does. */
struct IDaxVibrator : public ::android::hardware::vibrator::V1_3::IVibrator {
    static const char* descriptor;

    virtual ::android::hardware::Return<bool> daxSupportsAmplitudeControl() = 0;
    virtual ::android::hardware::Return<bool> daxSupportsForceTouchAmplitudeControl() = 0;
    virtual ::android::hardware::Return<bool> daxSupportsFrequencyControl() = 0;
    virtual ::android::hardware::Return<bool> daxSupportsHapticEngine() = 0;
    virtual ::android::hardware::Return<bool> daxSupportsPrebakedHapticPattern() = 0;
    virtual ::android::hardware::Return<bool> daxSupportsFolderStatusSetting() = 0;
    virtual ::android::hardware::Return<bool> daxSupportsEnhancedVelmoraHapticPattern() = 0;
    virtual ::android::hardware::Return<::android::hardware::vibrator::V1_0::Status>
    daxSetAmplitude(uint32_t amplitude) = 0;
    virtual ::android::hardware::Return<::android::hardware::vibrator::V1_0::Status>
    daxSetForceTouchAmplitude(uint32_t amplitude) = 0;
    virtual ::android::hardware::Return<::android::hardware::vibrator::V1_0::Status>
    daxSetFrequencyType(DaxFrequencyType type) = 0;
    virtual ::android::hardware::Return<::android::hardware::vibrator::V1_0::Status>
    daxSetFolderStatus(DaxFolderStatus status) = 0;

    using daxGetNumberOfPrebakedHapticPattern_cb =
            std::function<void(::android::hardware::vibrator::V1_0::Status status, uint32_t count)>;
    virtual ::android::hardware::Return<void> daxGetNumberOfPrebakedHapticPattern(
            daxGetNumberOfPrebakedHapticPattern_cb _hidl_cb) = 0;

    virtual ::android::hardware::Return<::android::hardware::vibrator::V1_0::Status>
    daxPerformHapticEngine(const ::android::hardware::hidl_vec<DaxHapticEnginePacket>& packets,
                           uint32_t amplitude) = 0;
    virtual ::android::hardware::Return<::android::hardware::vibrator::V1_0::Status>
    daxPerformPrebakedHapticPattern(uint32_t pattern, uint32_t amplitude, bool repeat) = 0;

    ::android::hardware::Return<void> interfaceChain(interfaceChain_cb _hidl_cb) override;

    /** @return the object as this interface, nullptr when it does not implement it. */
    static ::android::hardware::Return<::android::sp<IDaxVibrator>> castFrom(
            const ::android::sp<::android::hidl::base::V1_0::IBase>& parent);
    /** @return the registered object; every call of it fails when there is none to be reached. */
    static ::android::sp<IDaxVibrator> getService(const std::string& serviceName = "default");
    /** @return OK, or the error that kept the object from being registered. */
    [[nodiscard]] ::android::status_t registerAsService(const std::string& serviceName = "default");
};

}  // namespace vendor::velmora::hardware::vibrator::V2_0
