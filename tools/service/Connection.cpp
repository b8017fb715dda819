// SPDX-License-Identifier: Apache-2.0
#include "service/Connection.h"

#include <hidl/Host.h>

#include <thread>

namespace host = ::android::hardware::host;

namespace vibratorctl {

::android::sp<IDaxVibrator> connect(const std::string& instance, std::chrono::milliseconds wait) {
    using std::chrono::steady_clock;
    for (const auto deadline = steady_clock::now() + wait;;) {
        ::android::sp<::android::hidl::base::V1_0::IBase> found;
        std::string whyNot;
        const auto status = host::findService(IDaxVibrator::descriptor, instance, &found, &whyNot);
        const bool isFound = status == ::android::OK;
        if (isFound) {
            if (auto vibrator = IDaxVibrator::castFrom(found).withDefault(nullptr)) return vibrator;
            whyNot = "the service has just ended";
        }
        if (steady_clock::now() >= deadline)
            throw Unreachable(whyNot, isFound || status == ::android::TIMED_OUT);
        std::this_thread::sleep_for(std::chrono::milliseconds(50));
    }
}

void setCallTimeout(std::chrono::milliseconds limit) {
    host::setCallTimeout(limit);
}

std::optional<Process> serverOf(IDaxVibrator& vibrator) {
    pid_t pid = 0;
    const auto result = vibrator.getDebugInfo([&](const auto& info) { pid = info.pid; });
    return result.isOk() && pid > 0 ? readProcess(pid) : std::nullopt;
}

Served describe(const std::optional<Process>& server) {
    constexpr const char* kManagers[] = {"none is needed", "answers", ""};
    constexpr const char* kStates[] = {"not needed", "answers", "silent"};
    std::string whyNoManager;
    const auto manager = static_cast<size_t>(host::managerState(&whyNoManager));
    const auto transport = host::transport();
    const auto& [kind, path, why] = transport;
    Served served{"a process that is not known",
                  transport.inWords(),
                  kManagers[manager] + whyNoManager,
                  {{"server", nullptr},
                   {"transport", {{"kind", kind}, {"path", path}, {"why", why}}},
                   {"manager", {{"state", kStates[manager]}}}}};
    if (!server) return served;
    served.server = server->inWords() + (server->program.empty() ? "" : ", " + server->program);
    served.members["server"] = {
            {"pid", server->pid}, {"uid", server->uid}, {"program", server->program}};
    return served;
}

}  // namespace vibratorctl
