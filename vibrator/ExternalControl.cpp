// SPDX-License-Identifier: Apache-2.0
#include "Log.h"
#include "NodePathTable.h"
#include "Vibrator.h"

namespace vendor::velmora::hardware::vibrator::V2_1::implementation {

Return<bool> Vibrator::supportsExternalControl() {
    return isNodeExist(THE_DEVICE_EXT_CONTROL);
}

Return<Status> Vibrator::setExternalControl(bool enabled) {
    if (isVibrating()) {
        LOG_DEBUG("setExternalControl external control while vibrating. Not supported");
        return Status::UNSUPPORTED_OPERATION;
    }
    LOG_DEBUG(enabled ? "setExternalControl external control set as true"
                      : "setExternalControl external control set as false");
    if (writeNode(THE_DEVICE_EXT_CONTROL, enabled ? 1 : 0) != Status::OK) {
        LOG_ERROR("THE_DEVICE_EXT_CONTROL is impossible");
        return Status::UNSUPPORTED_OPERATION;
    }
    return Status::OK;
}

}  // namespace vendor::velmora::hardware::vibrator::V2_1::implementation
