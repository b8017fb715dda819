// SPDX-License-Identifier: Apache-2.0
#include "Amplitude.h"
#include "Log.h"
#include "NodePathTable.h"
#include "Vibrator.h"

namespace vendor::velmora::hardware::vibrator::V2_1::implementation {

Return<Status> Vibrator::daxSetAmplitude(uint32_t amplitude) {
    if (checkCallerPermission() != kCallerPermitted) return Status::UNKNOWN_ERROR;
    if (!isAmplitude(amplitude)) {
        LOG_ERROR("daxSetAmplitude amplitude is abnormal %u", amplitude);
        return Status::BAD_VALUE;
    }
    return writeNode(THE_DEVICE_INTENSITY, static_cast<int>(amplitude));
}

Return<Status> Vibrator::daxSetForceTouchAmplitude(uint32_t amplitude) {
    if (checkCallerPermission() != kCallerPermitted) return Status::UNKNOWN_ERROR;
    if (!isAmplitude(amplitude)) {
        LOG_ERROR("daxSetForceTouchAmplitude amplitude is abnormal %u", amplitude);
        return Status::BAD_VALUE;
    }
    return writeNode(THE_DEVICE_FORCE_TOUCH_INTENSITY, static_cast<int>(amplitude));
}

Return<Status> Vibrator::daxSetFrequencyType(DaxFrequencyType type) {
    if (checkCallerPermission() != kCallerPermitted) return Status::UNKNOWN_ERROR;
    const auto number = static_cast<int32_t>(type);
    if (static_cast<uint32_t>(number) > static_cast<uint32_t>(DaxFrequencyType::TYPE_4)) {
        LOG_ERROR("daxSetFrequencyType is abnormal %d", number);
        return Status::BAD_VALUE;
    }
    return writeNode(THE_DEVICE_MULTI_FREQ, number);
}

}  // namespace vendor::velmora::hardware::vibrator::V2_1::implementation
