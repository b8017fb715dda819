// SPDX-License-Identifier: Apache-2.0
#include "support/Answer.h"

namespace tests {
namespace {

struct InWords {
    std::string operator()(bool answer) const { return answer ? "true" : "false"; }
    std::string operator()(VibratorStatus status) const { return toString(status); }
    std::string operator()(const StatusAndNumber& answer) const {
        return "(" + (*this)(answer.first) + ", " + std::to_string(answer.second) + ")";
    }
    std::string operator()(const LadderAnswer& answer) const {
        std::string text = (*this)(answer.first) + " [";
        for (const uint32_t number : answer.second)
            text += " " + std::to_string(number);
        return text + " ]";
    }
};

}  // namespace

std::string Answer::inWords() const {
    if (!isOk) return "transport error";
    if (times != 1) return "answered " + std::to_string(times) + " times";
    return std::visit(InWords(), value);
}

}  // namespace tests
