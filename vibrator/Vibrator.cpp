// SPDX-License-Identifier: Apache-2.0
#include "Vibrator.h"

#include "Log.h"
#include "NodePathTable.h"

namespace vendor::velmora::hardware::vibrator::V2_1::implementation {

Vibrator::Vibrator() {
    LOG_DEBUG("!@QOR VIB HAL init");
    if (isNodeExist(THE_DEVICE_ENABLE)) {
        LOG_DEBUG("Vibrator using timed_output");
        setDriverMode(kTimedOutputMode);
    } else if (isNodeExist(THE_DEVICE_ACTIVATE) && isNodeExist(THE_DEVICE_DURATION) &&
               isNodeExist(THE_DEVICE_STATE)) {
        LOG_DEBUG("Vibrator using LED trigger");
        setDriverMode(kLedTriggerMode);
    } else {
        LOG_DEBUG("Vibrator driver does not exist. Remove VIB HAL or Setup Vibrator Driver");
    }
    logNodePathTable();
}

}  // namespace vendor::velmora::hardware::vibrator::V2_1::implementation
