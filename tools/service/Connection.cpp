// SPDX-License-Identifier: Apache-2.0
#include "service/Connection.h"

#include <hidl/Host.h>

#include <chrono>
#include <fstream>

namespace host = ::android::hardware::host;

namespace vibratorctl {

::android::sp<IDaxVibrator> connect(const std::string& instance) {
    ::android::sp<IDaxVibrator> vibrator = IDaxVibrator::tryGetService(instance);
    if (vibrator == nullptr)
        throw Unreachable(host::lookupError(IDaxVibrator::descriptor, instance));
    return vibrator;
}

void setCallTimeout(uint32_t seconds) {
    host::setCallTimeout(std::chrono::seconds(seconds));
}

Description describe(const ::android::sp<IDaxVibrator>& vibrator) {
    Description description{host::transportDescription(), host::serviceManagerDescription(), ""};
    if (vibrator == nullptr) return description;
    description.server = "a process that is not known";
    int32_t pid = 0;
    const auto result = vibrator->getDebugInfo([&](const auto& info) { pid = info.pid; });
    if (!result.isOk() || pid <= 0) return description;
    std::string program;
    std::getline(std::ifstream("/proc/" + std::to_string(pid) + "/cmdline"), program, '\0');
    description.server = "process " + std::to_string(pid) + (program.empty() ? "" : ", " + program);
    return description;
}

}  // namespace vibratorctl
