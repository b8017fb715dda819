// SPDX-License-Identifier: Apache-2.0
#include "liblog/LogFilter.h"
#include "support/LogCapture.h"

#include <android/log.h>
#include <gtest/gtest.h>
#include <unistd.h>

#include <cerrno>
#include <climits>

namespace {

using android::log::LogFilter;

TEST(LogFilterTest, RulesDecideByTagAndPriority) {
    const struct {
        const char* rules;
        int priority;
        const char* tag;
        bool shown;
    } cases[] = {
            {"", ANDROID_LOG_VERBOSE, "A", true},
            {"*:S", ANDROID_LOG_FATAL, "A", false},
            {"*:S A:D", ANDROID_LOG_DEBUG, "A", true},
            {"*:S A:D", ANDROID_LOG_VERBOSE, "A", false},
            {"*:S A:D", ANDROID_LOG_FATAL, "AB", false},
            {"A:w,*:e", ANDROID_LOG_WARN, "A", true},
            {"A:w,*:e", ANDROID_LOG_WARN, "B", false},
            {"A:w,*:e", ANDROID_LOG_ERROR, "B", true},
            {"*:I A", ANDROID_LOG_VERBOSE, "A", true},
            {"*", ANDROID_LOG_VERBOSE, "A", false},
            {"*", ANDROID_LOG_DEBUG, "A", true},
            {"  A:S\t", ANDROID_LOG_FATAL, "A", false},
            {"A:F", ANDROID_LOG_ERROR, "A", false},
            {"A:W *:I", ANDROID_LOG_INFO, "A", false},
            {"A:W *:I", ANDROID_LOG_INFO, "B", true},
            {"*:S\nA:V\tB:S", ANDROID_LOG_VERBOSE, "A", true},
    };
    for (const auto& [rules, priority, tag, shown] : cases) {
        EXPECT_EQ(LogFilter(rules).shows(priority, tag), shown) << rules << ' ' << tag;
        EXPECT_EQ(LogFilter(rules).firstBadRule(), "");
    }
    for (const char* bad : {"A:", "A:X", "A:DD", ":D", "A:3"}) {
        EXPECT_EQ(LogFilter(std::string("B:E ") + bad + " C:!").firstBadRule(), bad);
        EXPECT_FALSE(LogFilter(std::string("B:E ") + bad).shows(ANDROID_LOG_WARN, "B"));
    }
}

TEST(LogTest, PriorityIsALetter) {
    LogCapture log;
    const auto letterOf = [&](int priority) {
        EXPECT_EQ(__android_log_print(priority, "T", "text"), 1);
        return log.takeText()[0];
    };
    std::string letters;
    for (int priority = ANDROID_LOG_VERBOSE; priority <= ANDROID_LOG_FATAL; ++priority)
        letters += letterOf(priority);
    EXPECT_EQ(letters, "VDIWEF");
    // What is no priority of a line counts as debug.
    const int others[] = {ANDROID_LOG_UNKNOWN, ANDROID_LOG_DEFAULT, ANDROID_LOG_SILENT, -1, 99};
    for (const int priority : others)
        EXPECT_EQ(letterOf(priority), 'D') << priority;
}

TEST(LogTest, LineHasTheBriefForm) {
    LogCapture log;
    const std::string pid = std::to_string(getpid());
    const std::string shown = std::string(pid.size() < 5 ? 5 - pid.size() : 0, ' ') + pid;
    errno = 33;
    EXPECT_EQ(__android_log_print(ANDROID_LOG_ERROR, "Tag", "%d of %s", 7, "nine"), 1);
    EXPECT_EQ(errno, 33);
    EXPECT_EQ(log.takeText(), "E/Tag     (" + shown + "): 7 of nine\n");
    __android_log_print(ANDROID_LOG_DEBUG, "QorVibrator-HAL2.1", "a\nb\x1b[31m\x7f\xc3\xa9");
    EXPECT_EQ(log.takeText(), "D/QorVibrator-HAL2.1(" + shown + "): a\\nb\\x1b[31m\\x7f\xc3\xa9\n");
    const size_t room = PIPE_BUF - ("D/T       (" + shown + "): ").size();
    __android_log_print(ANDROID_LOG_DEBUG, "T", "%s%s", std::string(room / 4, '\1').c_str(),
                        std::string(room % 4, 'x').c_str());
    EXPECT_EQ(log.takeText().size(), size_t{PIPE_BUF}) << "what a pipe takes in one piece";
    __android_log_print(ANDROID_LOG_DEBUG, "T", "%s", std::string(5000, '\n').c_str());
    const std::string longest = log.takeText();
    EXPECT_EQ(longest.size() - longest.find("): ") - 3, 2 * 1023 + 1U) << longest;
    __android_log_print(ANDROID_LOG_DEBUG, std::string(100, 'x').c_str(), "\1");
    EXPECT_EQ(log.takeText(), "D/" + std::string(64, 'x') + "(" + shown + "): \\x01\n");
}

}  // namespace
