// SPDX-License-Identifier: Apache-2.0
// A client that outlives the service: it looks the service up again when a call does not get there.
#include <vendor/velmora/hardware/vibrator/2.1/IDaxVibrator.h>

#include <cstdio>

using ::android::sp;
using ::android::hardware::vibrator::V1_0::Status;
using ::android::hardware::vibrator::V1_3::IVibrator;
using ::vendor::velmora::hardware::vibrator::V2_1::IDaxVibrator;

/** Runs the motor, if need be by a new service. @return the service that did; nullptr for none. */
sp<IVibrator> run(sp<IVibrator> service, uint32_t ms) {
    for (int attempt = 0; attempt < 2; ++attempt) {
        if (service == nullptr) service = IVibrator::getService();  // waits for it
        if (service == nullptr) break;
        const auto answer = service->on(ms);
        if (answer.isOk()) return static_cast<Status>(answer) == Status::OK ? service : nullptr;
        service = nullptr;  // it has ended; its answer is lost
    }
    return nullptr;
}

int main() {
    const sp<IVibrator> service = run(nullptr, 500);
    if (service == nullptr) return 1;
    const sp<IDaxVibrator> extended = IDaxVibrator::castFrom(service);  // nullptr where it has none
    const bool isSet = extended != nullptr && extended->daxSetAmplitude(5000).withDefault(
                                                      Status::UNKNOWN_ERROR) == Status::OK;
    printf("the motor runs%s\n", isSet ? " at half strength" : "");
}
