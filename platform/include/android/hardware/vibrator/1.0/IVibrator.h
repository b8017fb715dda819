// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <android/hardware/vibrator/1.0/types.h>
#include <android/hidl/base/1.0/IBase.h>

#include <cstdint>
#include <functional>
#include <string>

namespace android::hardware::vibrator::V1_0 {

/** Switches the motor, sets its strength and plays predefined effects. */
struct IVibrator : public ::android::hidl::base::V1_0::IBase {
    static const char* descriptor;

    virtual ::android::hardware::Return<::android::hardware::vibrator::V1_0::Status> on(
            uint32_t timeoutMs) = 0;
    virtual ::android::hardware::Return<::android::hardware::vibrator::V1_0::Status> off() = 0;
    virtual ::android::hardware::Return<bool> supportsAmplitudeControl() = 0;
    virtual ::android::hardware::Return<::android::hardware::vibrator::V1_0::Status> setAmplitude(
            uint8_t amplitude) = 0;

    using perform_cb = std::function<void(::android::hardware::vibrator::V1_0::Status status,
                                          uint32_t lengthMs)>;
    virtual ::android::hardware::Return<void> perform(
            Effect effect, ::android::hardware::vibrator::V1_0::EffectStrength strength,
            perform_cb _hidl_cb) = 0;

    ::android::hardware::Return<void> interfaceChain(interfaceChain_cb _hidl_cb) override;

    /** @return the object as this interface, nullptr when it does not implement it. */
    static ::android::hardware::Return<::android::sp<IVibrator>> castFrom(
            const ::android::sp<::android::hidl::base::V1_0::IBase>& parent);
    /** @return the registered object; every call of it fails when there is none to be reached. */
    static ::android::sp<IVibrator> getService(const std::string& serviceName = "default");
    /** @return OK, or the error that kept the object from being registered. */
    [[nodiscard]] ::android::status_t registerAsService(const std::string& serviceName = "default");
};

}  // namespace android::hardware::vibrator::V1_0
