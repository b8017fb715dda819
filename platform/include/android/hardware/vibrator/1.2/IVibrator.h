// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <android/hardware/vibrator/1.1/IVibrator.h>
#include <android/hardware/vibrator/1.2/types.h>

#include <cstdint>
#include <functional>
#include <string>

namespace android::hardware::vibrator::V1_2 {

/** Adds the effects of 1.2. */
struct IVibrator : public ::android::hardware::vibrator::V1_1::IVibrator {
    static const char* descriptor;

    using perform_1_2_cb = std::function<void(::android::hardware::vibrator::V1_0::Status status,
                                              uint32_t lengthMs)>;
    virtual ::android::hardware::Return<void> perform_1_2(
            Effect effect, ::android::hardware::vibrator::V1_0::EffectStrength strength,
            perform_1_2_cb _hidl_cb) = 0;

    ::android::hardware::Return<void> interfaceChain(interfaceChain_cb _hidl_cb) override;

    /** @return the object as this interface, nullptr when it does not implement it. */
    static ::android::hardware::Return<::android::sp<IVibrator>> castFrom(
            const ::android::sp<::android::hidl::base::V1_0::IBase>& parent);
    /** @return the registered object; every call of it fails when there is none to be reached. */
    static ::android::sp<IVibrator> getService(const std::string& serviceName = "default");
    /** @return OK, or the error that kept the object from being registered. */
    [[nodiscard]] ::android::status_t registerAsService(const std::string& serviceName = "default");
};

}  // namespace android::hardware::vibrator::V1_2
