// SPDX-License-Identifier: Apache-2.0
#include "service/Connection.h"

#include <hidl/Host.h>

#include <chrono>

namespace host = ::android::hardware::host;

namespace vibratorctl {

::android::sp<IDaxVibrator> connect(const std::string& instance) {
    ::android::sp<::android::hidl::base::V1_0::IBase> found;
    std::string whyNot;
    const auto status = host::findService(IDaxVibrator::descriptor, instance, &found, &whyNot);
    if (status != ::android::OK) throw Unreachable(whyNot, status == ::android::TIMED_OUT);
    ::android::sp<IDaxVibrator> vibrator = IDaxVibrator::castFrom(found).withDefault(nullptr);
    if (vibrator == nullptr) throw Unreachable("the service has just ended");
    return vibrator;
}

void setCallTimeout(std::chrono::milliseconds limit) {
    host::setCallTimeout(limit);
}

std::optional<Process> serverOf(IDaxVibrator& vibrator) {
    pid_t pid = 0;
    const auto result = vibrator.getDebugInfo([&](const auto& info) { pid = info.pid; });
    return result.isOk() && pid > 0 ? readProcess(pid) : std::nullopt;
}

Route findRoute() {
    Route route{host::transport(), {}, ""};
    route.manager = host::managerState(&route.whyNoManager);
    return route;
}

}  // namespace vibratorctl
