// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <android/log.h>

#include <string>
#include <string_view>
#include <vector>

namespace android::log {

/**
 * The least priority that each tag must have for its lines to be shown. Written as rules between
 * blanks or commas: "TAG:P" with P one of V, D, I, W, E, F, S (silent), "*:P" for all other tags,
 * and "TAG" alone for V, "*" alone for D. Without a rule everything is shown.
 */
class LogFilter {
  public:
    explicit LogFilter(std::string_view rules);

    bool shows(int priority, const char* tag) const {
        for (const Rule& rule : mRules) {
            if (rule.tag == tag) return priority >= rule.priority;
        }
        return priority >= mOthers;
    }

    /** @return the first rule that is not understood, and so ignored; empty when there is none. */
    const std::string& firstBadRule() const { return mFirstBadRule; }

  private:
    struct Rule {
        std::string tag;
        int priority;
    };

    void add(std::string_view rule);

    std::vector<Rule> mRules;
    int mOthers = ANDROID_LOG_VERBOSE;
    std::string mFirstBadRule;
};

}  // namespace android::log
