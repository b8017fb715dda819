// SPDX-License-Identifier: Apache-2.0
#include "Amplitude.h"
#include "HapticEngineText.h"
#include "Log.h"
#include "NodePathTable.h"
#include "TextNode.h"
#include "Vibrator.h"

#include <cerrno>

namespace vendor::velmora::hardware::vibrator::V2_1::implementation {

Return<Status> Vibrator::daxPerformHapticEngine(const hidl_vec<DaxHapticEnginePacket>& packets,
                                                uint32_t amplitude) {
    if (checkCallerPermission() != kCallerPermitted) return Status::UNKNOWN_ERROR;
    if (packets.size() > HapticEngineText::kMaxPackets) {
        LOG_ERROR("daxPerformHapticEngine packet size is exceed");
        return Status::BAD_VALUE;
    }
    if (!isAmplitude(amplitude)) {
        LOG_ERROR("daxPerformHapticEngine amplitude is abnormal %u", amplitude);
        return Status::BAD_VALUE;
    }

    HapticEngineText text;
    int32_t abnormal = 0;
    if (!text.build(packets, amplitude, &abnormal)) {
        LOG_ERROR("daxPerformHapticEngine value is abnormal %d", abnormal);
        return Status::BAD_VALUE;
    }
    LOG_DEBUG("daxPerformHapticEngine : %s", text.c_str());
    const auto written = writeTextNode(THE_DEVICE_HAPTIC_ENGINE, text.c_str(), text.length());
    if (!written) {
        LOG_ERROR("daxPerformHapticEngine is fail: %d", errno);
        return Status::UNKNOWN_ERROR;
    }
    if (*written != static_cast<ssize_t>(text.length())) {
        LOG_DEBUG("daxPerformHapticEngine UNKNOWN_ERROR");
        return Status::UNKNOWN_ERROR;
    }
    on(kEngineMs);
    LOG_DEBUG("daxPerformHapticEngine OK");
    return Status::OK;
}

}  // namespace vendor::velmora::hardware::vibrator::V2_1::implementation
