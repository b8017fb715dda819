// SPDX-License-Identifier: Apache-2.0
#include "Amplitude.h"
#include "Log.h"
#include "NodePathTable.h"
#include "Vibrator.h"

#include <cstring>

namespace vendor::velmora::hardware::vibrator::V2_1::implementation {

Return<Status> Vibrator::on(uint32_t timeoutMs) {
    const auto timeout = static_cast<int32_t>(timeoutMs);
    if (DriverMode == kTimedOutputMode) return writeNode(THE_DEVICE_ENABLE, timeout);

    if (writeNode(THE_DEVICE_STATE, 1) != Status::OK) {
        LOG_ERROR("THE_DEVICE_STATE is impossible");
        return Status::UNKNOWN_ERROR;
    }
    if (writeNode(THE_DEVICE_DURATION, timeout) != Status::OK) {
        LOG_ERROR("THE_DEVICE_DURATION is impossible");
        return Status::UNKNOWN_ERROR;
    }
    if (writeNode(THE_DEVICE_ACTIVATE, 1) != Status::OK) {
        LOG_ERROR("THE_DEVICE_ACTIVATE is impossible");
        return Status::UNKNOWN_ERROR;
    }
    return Status::OK;
}

Return<Status> Vibrator::off() {
    if (DriverMode == kTimedOutputMode) return writeNode(THE_DEVICE_ENABLE, 0);

    if (writeNode(THE_DEVICE_ACTIVATE, 0) != Status::OK) {
        LOG_ERROR("THE_DEVICE_ACTIVATE is impossible");
        return Status::UNKNOWN_ERROR;
    }
    return Status::OK;
}

Return<bool> Vibrator::isVibrating() {
    const int32_t remaining =
            readNode(DriverMode == kLedTriggerMode ? THE_DEVICE_DURATION : THE_DEVICE_ENABLE);
    LOG_DEBUG(remaining > 0 ? "isVibrating : true" : "isVibrating : false");
    return remaining > 0;
}

Return<bool> Vibrator::supportsAmplitudeControl() {
    const bool supports = daxSupportsAmplitudeControl();
    if (supports) {
        LOG_DEBUG("supportsAmplitudeControl is possible");
    } else {
        LOG_ERROR("supportsAmplitudeControl is impossible");
    }
    return supports;
}

Return<Status> Vibrator::setAmplitude(uint8_t amplitude) {
    if (!daxSupportsAmplitudeControl()) {
        LOG_ERROR("setAmplitude is impossible because of intensity");
        return Status::UNSUPPORTED_OPERATION;
    }
    if (amplitude == 0) {
        LOG_ERROR("setAmplitude amplitude is BAD_VALUE %u", amplitude);
        return Status::BAD_VALUE;
    }

    const long intensity = intensityOf(amplitude);
    LOG_DEBUG("Setting amplitude to: %ld", intensity);
    int error = 0;
    if (writeNumber(THE_DEVICE_INTENSITY, static_cast<int>(intensity), &error) != Status::OK) {
        LOG_ERROR("Failed to set amplitude (%d): %s", error, strerror(error));
        return Status::UNKNOWN_ERROR;
    }
    return Status::OK;
}

}  // namespace vendor::velmora::hardware::vibrator::V2_1::implementation
