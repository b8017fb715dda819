// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <vendor/velmora/hardware/vibrator/2.0/IDaxVibrator.h>
#include <vendor/velmora/hardware/vibrator/2.1/types.h>

#include <cstdint>
#include <functional>
#include <string>

namespace vendor::velmora::hardware::vibrator::V2_1 {

/** Adds the amplitude ladders; see interface/2.1. */
struct IDaxVibrator : public ::vendor::velmora::hardware::vibrator::V2_0::IDaxVibrator {
    static const char* descriptor;

    using daxGetAmplitudeList_cb = std::function<void(
            bool supported, const ::android::hardware::hidl_vec<uint32_t>& amplitudes)>;
    virtual ::android::hardware::Return<void> daxGetAmplitudeList(
            DaxAmplitudeType type, daxGetAmplitudeList_cb _hidl_cb) = 0;

    ::android::hardware::Return<void> interfaceChain(interfaceChain_cb _hidl_cb) override;

    /** @return the object as this interface, nullptr when it does not implement it. */
    static ::android::hardware::Return<::android::sp<IDaxVibrator>> castFrom(
            const ::android::sp<::android::hidl::base::V1_0::IBase>& parent);
    /** @return the registered object; every call of it fails when there is none to be reached. */
    static ::android::sp<IDaxVibrator> getService(const std::string& serviceName = "default");
    /** @return OK, or the error that kept the object from being registered. */
    [[nodiscard]] ::android::status_t registerAsService(const std::string& serviceName = "default");
};

}  // namespace vendor::velmora::hardware::vibrator::V2_1
