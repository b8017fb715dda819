// SPDX-License-Identifier: Apache-2.0
// A client that outlives the service: it looks the service up again when a call does not get there.
#include <vendor/velmora/hardware/vibrator/2.1/IDaxVibrator.h>

#include <cstdio>
#include <functional>

using ::android::sp;
using ::android::hardware::Return;
using ::android::hardware::vibrator::V1_0::Status;
using ::android::hardware::vibrator::V1_3::IVibrator;
using ::vendor::velmora::hardware::vibrator::V2_1::IDaxVibrator;

class Motor {
  public:
    /** Makes a call, if need be on a new service. @return whether the service answered OK. */
    bool call(const std::function<Return<Status>(IVibrator&)>& operation) {
        for (int attempt = 0; attempt < 2; ++attempt) {
            if (mService == nullptr) mService = IVibrator::getService();  // waits for it
            if (mService == nullptr) break;
            const Return<Status> answer = operation(*mService);
            if (answer.isOk()) return static_cast<Status>(answer) == Status::OK;
            mService = nullptr;  // the service has ended; its answer is lost
        }
        fprintf(stderr, "there is no vibrator service\n");
        return false;
    }
    /** @return the extended interface of the service; nullptr where it has none. */
    sp<IDaxVibrator> extended() const { return IDaxVibrator::castFrom(mService); }

  private:
    sp<IVibrator> mService;
};

int main() {
    Motor motor;
    if (!motor.call([](IVibrator& vibrator) { return vibrator.on(500); })) return 1;
    const sp<IDaxVibrator> extended = motor.extended();
    const bool isSet = extended != nullptr && extended->daxSetAmplitude(5000).withDefault(
                                                      Status::UNKNOWN_ERROR) == Status::OK;
    printf("the motor runs%s\n", isSet ? " at half strength" : "");
    return 0;
}
