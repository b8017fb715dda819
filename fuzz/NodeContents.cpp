// SPDX-License-Identifier: Apache-2.0
#include "MotorType.h"
#include "NodePathTable.h"
#include "Vibrator.h"

#include <sys/mman.h>
#include <unistd.h>

#include <cstdint>
#include <cstdio>
#include <cstdlib>
#include <optional>
#include <string>

using namespace ::vendor::velmora::hardware::vibrator::V2_1::implementation;

namespace {

/** @return the part of a node's text that a reader gets, without one final newline. */
std::string textOf(const std::string& content, size_t most) {
    std::string text = content.substr(0, most);
    if (!text.empty() && text.back() == '\n') text.pop_back();
    return text.substr(0, text.find('\0'));
}

std::optional<int32_t> numberOf(const std::string& content) {
    int32_t number = 0;
    if (sscanf(content.substr(0, 7).c_str(), "%d", &number) == 1) return number;
    return std::nullopt;
}

int32_t motorOf(const std::string& content) {
    const std::string text = textOf(content, 31);
    for (int32_t type = 1; type < kMotorTypeCount; ++type) {
        if (text == MotorTypeNames[type]) return type;
    }
    return 0;
}

}  // namespace

/** The input is the content of a node. Compares with the simplest way to read it. */
extern "C" int LLVMFuzzerTestOneInput(const uint8_t* data, size_t size) {
    [[maybe_unused]] static const int quiet = setenv("ANDROID_LOG_TAGS", "*:S", 1);
    static const ::android::sp<Vibrator> vibrator = new Vibrator;
    static const int file = memfd_create("node", 0);
    static const std::string node = "/proc/self/fd/" + std::to_string(file);
    THE_DEVICE_MOTOR_TYPE = THE_DEVICE_EVENT_CMD = THE_DEVICE_HAPTIC_ENGINE_NUM_WAVES = node;
    const std::string content(reinterpret_cast<const char*>(data), size);
    if (ftruncate(file, 0) != 0 || pwrite(file, data, size, 0) != static_cast<ssize_t>(size))
        abort();

    const std::optional<int32_t> number = numberOf(content);
    if (vibrator->readNode(node) != number.value_or(-1)) abort();
    int answers = 0;
    vibrator->daxGetNumberOfPrebakedHapticPattern([&](Status status, uint32_t count) {
        if ((status == Status::OK) != number.has_value()) abort();
        if (count != static_cast<uint32_t>(number.value_or(0))) abort();
        ++answers;
    });
    if (answers != 1) abort();

    if (vibrator->getMotorIndex() != motorOf(content)) abort();
    const bool enhanced = vibrator->daxSupportsEnhancedVelmoraHapticPattern();
    if (enhanced != (textOf(content, 31) == "LINEAR_1040")) abort();
    const bool folds = vibrator->daxSupportsFolderStatusSetting();
    if (folds != (textOf(content, 511).find_first_of("DFLO") != std::string::npos)) abort();
    return 0;
}
