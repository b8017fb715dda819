// SPDX-License-Identifier: Apache-2.0
#include "AmplitudeLists.h"
#include "Log.h"
#include "MotorType.h"
#include "NodePathTable.h"
#include "Vibrator.h"

namespace vendor::velmora::hardware::vibrator::V2_1::implementation {

Return<void> Vibrator::daxGetAmplitudeList(DaxAmplitudeType type, daxGetAmplitudeList_cb _hidl_cb) {
    if (checkCallerPermission() != kCallerPermitted) {
        _hidl_cb(false, {});
        return Void();
    }
    int32_t motor = getMotorIndex();
    if (motor <= kMotorNone) {
        motor = getMotorIndexbyMethod();
        LOG_DEBUG("Vibrator motor type is NONE. but ran vib method fallback : %d", motor);
    }
    LOG_DEBUG("daxGetAmplitudeList type: %d : %d", static_cast<int>(type), motor);
    if (type > DaxAmplitudeType::TYPE_1) {
        LOG_ERROR("daxGetAmplitudeList is abnormal %d", static_cast<int>(type));
        _hidl_cb(false, {});
        return Void();
    }

    const bool hasIndex = isNodeExist(THE_DEVICE_HAPTIC_ENGINE_INDEX);
    LOG_DEBUG(hasIndex ? "daxGetAmplitudeList support index method"
                       : "daxGetAmplitudeList NOT support index method");
    AmplitudeList list = selectAmplitudeList(motor, type, hasIndex);
    if (list.empty()) {
        LOG_DEBUG("daxGetAmplitudeList false");
        _hidl_cb(false, {});
        return Void();
    }

    LOG_DEBUG("daxGetAmplitudeList list size: %d", static_cast<int>(list.size()));
    hidl_vec<uint32_t> reply;
    reply.setToExternal(list.data(), list.size());
    LOG_DEBUG("daxGetAmplitudeList list_outputsize size: %d", static_cast<int>(reply.size()));
    _hidl_cb(true, reply);
    return Void();
}

}  // namespace vendor::velmora::hardware::vibrator::V2_1::implementation
