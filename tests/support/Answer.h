// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <vendor/velmora/hardware/vibrator/2.1/IDaxVibrator.h>

#include <string>
#include <utility>
#include <variant>

namespace tests {

using IDaxVibrator = ::vendor::velmora::hardware::vibrator::V2_1::IDaxVibrator;
using VibratorStatus = ::android::hardware::vibrator::V1_0::Status;
using StatusAndNumber = std::pair<VibratorStatus, uint32_t>;
using LadderAnswer = std::pair<bool, ::android::hardware::hidl_vec<uint32_t>>;

/** What an operation has answered. */
struct Answer {
    std::variant<bool, VibratorStatus, StatusAndNumber, LadderAnswer> value;
    /** How often it was given, by callback or as the result. */
    int times = 0;
    /** Whether the transport's part of the result was OK. */
    bool isOk = false;

    /** @return the value, like "OK" or "(OK, 20)"; what is wrong where it is no proper answer. */
    std::string inWords() const;
};

/** @return the answer of an operation that returns it. */
template <typename T>
Answer answerOf(const ::android::hardware::Return<T>& result) {
    if (!result.isOk()) return {};
    return {static_cast<T>(result), 1, true};
}

/** @return what an operation calls back with. */
template <typename Operation>
Answer answerTo(Operation operation) {
    Answer answer;
    const ::android::hardware::Return<void> result = operation([&](const auto&... given) {
        answer.value = std::pair(given...);
        ++answer.times;
    });
    answer.isOk = result.isOk();
    return answer;
}

}  // namespace tests
