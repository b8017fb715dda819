// SPDX-License-Identifier: Apache-2.0
#include "LogFilter.h"

#include <android/log.h>

#include <cctype>

namespace android::log {
namespace {

/** @return the priority that a letter stands for, ANDROID_LOG_UNKNOWN for none. */
int priorityOf(char letter) {
    constexpr std::string_view kLetters = "VDIWEFS";
    const size_t index =
            kLetters.find(static_cast<char>(std::toupper(static_cast<unsigned char>(letter))));
    return index == std::string_view::npos ? ANDROID_LOG_UNKNOWN
                                           : ANDROID_LOG_VERBOSE + static_cast<int>(index);
}

}  // namespace

LogFilter::LogFilter(std::string_view rules) {
    constexpr std::string_view kSeparators = " \t\n,";
    for (size_t start = rules.find_first_not_of(kSeparators); start != std::string_view::npos;
         start = rules.find_first_not_of(kSeparators, start)) {
        const std::string_view rule =
                rules.substr(start, rules.find_first_of(kSeparators, start) - start);
        add(rule);
        start += rule.size();
    }
}

void LogFilter::add(std::string_view rule) {
    const std::string_view tag = rule.substr(0, rule.find(':'));
    int priority = tag == "*" ? ANDROID_LOG_DEBUG : ANDROID_LOG_VERBOSE;
    if (tag.size() != rule.size()) {
        const std::string_view letter = rule.substr(tag.size() + 1);
        priority = letter.size() == 1 ? priorityOf(letter[0]) : ANDROID_LOG_UNKNOWN;
    }
    if (tag.empty() || priority == ANDROID_LOG_UNKNOWN) {
        if (mFirstBadRule.empty()) mFirstBadRule = rule;
    } else if (tag == "*") {
        mOthers = priority;
    } else {
        mRules.push_back({std::string(tag), priority});
    }
}

}  // namespace android::log
