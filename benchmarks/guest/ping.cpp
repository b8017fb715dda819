// SPDX-License-Identifier: Apache-2.0

/**
 * Calls of the daemon: a ping, and an operation that does not access the driver. The environment
 * selects the transport; the argument is its name in the rows.
 */
#include "RoundTrip.h"

#include <vendor/velmora/hardware/vibrator/2.1/IDaxVibrator.h>

#include <cstdlib>
#include <string>

using ::android::hardware::vibrator::V1_0::EffectStrength;
using ::android::hardware::vibrator::V1_0::Status;
using ::android::hardware::vibrator::V1_1::Effect_1_1;
using ::vendor::velmora::hardware::vibrator::V2_1::IDaxVibrator;

int main(int argc, char** argv) {
    if (argc != 2) {
        std::fprintf(stderr, "usage: guest-ping TRANSPORT\n");
        return 2;
    }
    const std::string transport = argv[1];
    const ::android::sp<IDaxVibrator> vibrator = IDaxVibrator::getService();
    if (vibrator == nullptr || !vibrator->ping().isOk()) {
        std::fprintf(stderr, "guest-ping: the vibrator's service does not answer\n");
        return 1;
    }
    measure((transport + ", ping").c_str(), [&] {
        if (!vibrator->ping().isOk()) abort();
    });
    measure((transport + ", call").c_str(), [&] {
        Status answer = Status::OK;
        vibrator->perform_1_1(Effect_1_1::CLICK, EffectStrength::LIGHT,
                              [&](Status status, uint32_t /* lengthMs */) { answer = status; });
        if (answer != Status::UNSUPPORTED_OPERATION) abort();
    });
    return 0;
}
