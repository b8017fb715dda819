// SPDX-License-Identifier: Apache-2.0
#include "PrebakedPatterns.h"

#include "Amplitude.h"
#include "Log.h"
#include "NodePathTable.h"
#include "TextNode.h"
#include "Vibrator.h"

#include <cerrno>
#include <cstdio>

namespace vendor::velmora::hardware::vibrator::V2_1::implementation {
namespace {

/** Plays a pattern once. */
Status playPattern(Vibrator& vibrator, uint32_t pattern, uint32_t amplitude) {
    LOG_DEBUG("daxPerformPrebakedHapticPattern one shoot starts");
    if (vibrator.writeNode(THE_DEVICE_INTENSITY, static_cast<int>(amplitude)) != Status::OK) {
        LOG_DEBUG("daxPerformPrebakedHapticPattern intensity write fail");
        return Status::UNKNOWN_ERROR;
    }
    if (vibrator.writeNode(THE_DEVICE_HAPTIC_ENGINE_INDEX, static_cast<int>(pattern)) !=
        Status::OK) {
        LOG_DEBUG("daxPerformPrebakedHapticPattern pattern write fail");
        return Status::UNKNOWN_ERROR;
    }
    if (pattern == 0) return Status::OK;
    if (vibrator.on(kPatternMs) == Status::UNKNOWN_ERROR) {
        LOG_DEBUG("daxPerformPrebakedHapticPattern on fail");
        return Status::UNKNOWN_ERROR;
    }
    LOG_DEBUG("daxPerformPrebakedHapticPattern one shoot end");
    return Status::OK;
}

/** Has the driver's queue repeat a pattern. */
Status queuePattern(Vibrator& vibrator, uint32_t pattern, uint32_t amplitude) {
    LOG_DEBUG("daxPerformPrebakedHapticPattern repeat starts");
    char queue[32] = {};
    const int length = snprintf(queue, sizeof(queue), "%d.%d, 10, 0~", static_cast<int>(pattern),
                                static_cast<int>(amplitude / 100));
    LOG_DEBUG("daxPerformPrebakedHapticPattern : %s , %d", queue, length);
    if (vibrator.writeNode(THE_DEVICE_HAPTIC_ENGINE_INDEX, kQueueIndex) != Status::OK) {
        LOG_DEBUG("daxPerformPrebakedHapticPattern write 0xFFFE fail");
        return Status::UNKNOWN_ERROR;
    }
    // The driver wants the terminating zero byte too.
    const auto size = static_cast<size_t>(length) + 1;
    const auto written = writeTextNode(THE_DEVICE_HAPTIC_PLAYBACK_QUEUE, queue, size);
    if (!written) {
        LOG_ERROR("daxPerformPrebakedHapticPattern is fail: %d", errno);
        return Status::UNKNOWN_ERROR;
    }
    LOG_DEBUG("ret : %d", static_cast<int>(*written));
    if (*written != static_cast<ssize_t>(size)) {
        LOG_DEBUG("daxPerformPrebakedHapticPattern repeat error");
        return Status::UNKNOWN_ERROR;
    }
    if (vibrator.on(kPatternMs) == Status::UNKNOWN_ERROR) {
        LOG_DEBUG("daxPerformPrebakedHapticPattern on Trigger fail");
        return Status::UNKNOWN_ERROR;
    }
    LOG_DEBUG("daxPerformPrebakedHapticPattern end");
    return Status::OK;
}

}  // namespace

Return<void> Vibrator::daxGetNumberOfPrebakedHapticPattern(
        daxGetNumberOfPrebakedHapticPattern_cb _hidl_cb) {
    if (checkCallerPermission() != kCallerPermitted) {
        _hidl_cb(Status::UNKNOWN_ERROR, 0);
        return Void();
    }
    if (!isNodeExistForRead(THE_DEVICE_HAPTIC_ENGINE_NUM_WAVES)) {
        LOG_DEBUG("daxGetNumberOfPrebakedHapticPattern unsupports");
        _hidl_cb(Status::UNSUPPORTED_OPERATION, 0);
        return Void();
    }
    const std::optional<int32_t> count = readNumber(THE_DEVICE_HAPTIC_ENGINE_NUM_WAVES);
    LOG_DEBUG("daxGetNumberOfPrebakedHapticPattern value : %u",
              static_cast<uint32_t>(count.value_or(kReadFailed)));
    if (count) {
        _hidl_cb(Status::OK, static_cast<uint32_t>(*count));
    } else {
        _hidl_cb(Status::UNKNOWN_ERROR, 0);
    }
    return Void();
}

Return<Status> Vibrator::daxPerformPrebakedHapticPattern(uint32_t pattern, uint32_t amplitude,
                                                         bool repeat) {
    LOG_DEBUG("daxPerformPrebakedHapticPattern pattern : %d, amplitude : %d",
              static_cast<int>(pattern), static_cast<int>(amplitude));
    if (checkCallerPermission() != kCallerPermitted) return Status::UNKNOWN_ERROR;
    if (!isAmplitude(amplitude)) {
        LOG_ERROR("daxPerformPrebakedHapticPattern amplitude is abnormal %u", amplitude);
        return Status::BAD_VALUE;
    }
    return repeat ? queuePattern(*this, pattern, amplitude)
                  : playPattern(*this, pattern, amplitude);
}

}  // namespace vendor::velmora::hardware::vibrator::V2_1::implementation
