// SPDX-License-Identifier: Apache-2.0
#include "Vibrator.h"

#include <android/log.h>
#include <hidl/HidlTransportSupport.h>
#include <utils/StrongPointer.h>

using ::vendor::velmora::hardware::vibrator::V2_1::IDaxVibrator;
using ::vendor::velmora::hardware::vibrator::V2_1::implementation::Vibrator;

int main() {
    __android_log_print(ANDROID_LOG_DEBUG, "vendor.velmora.hardware.vibrator@2.1-service",
                        "qor-vibrator-2-1 starts");
    const android::sp<IDaxVibrator> vibrator = new Vibrator();

    // One thread, this one: the steps of an operation are never interleaved with another's.
    android::hardware::configureRpcThreadpool(1, true);
    // A refused registration is not fatal: the process stays, unreachable, and init does not
    // start it over and over.
    [[maybe_unused]] const android::status_t status = vibrator->registerAsService("default");
    android::hardware::joinRpcThreadpool();
    return 0;
}
