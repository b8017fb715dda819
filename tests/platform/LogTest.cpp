// SPDX-License-Identifier: Apache-2.0
#include "liblog/LogFilter.h"
#include "support/LogCapture.h"

#include <android/log.h>
#include <fcntl.h>
#include <gtest/gtest.h>
#include <poll.h>
#include <sys/socket.h>
#include <sys/stat.h>
#include <unistd.h>

#include <cerrno>
#include <climits>
#include <functional>
#include <utility>
#include <vector>

/** What happens between a promise of room and the write. */
static std::function<void()> afterPoll = [] {};

/** Is called for poll. It has a name of its own since fortified headers define the other. */
int pollAndMore(pollfd* descriptors, nfds_t count, int milliseconds) __asm__("poll");
int pollAndMore(pollfd* descriptors, nfds_t count, int milliseconds) {
    const timespec limit{milliseconds / 1000, milliseconds % 1000 * 1'000'000L};
    const int result = ppoll(descriptors, count, milliseconds < 0 ? nullptr : &limit, nullptr);
    afterPoll();
    return result;
}

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
    struct stat info;
    ASSERT_EQ(fstat(STDERR_FILENO, &info), 0);
    const std::string journal = std::to_string(info.st_dev) + ":" + std::to_string(info.st_ino);
    setenv("JOURNAL_STREAM", journal.c_str(), 1);
    std::string levels;
    for (int priority = ANDROID_LOG_VERBOSE; priority <= ANDROID_LOG_FATAL; ++priority) {
        __android_log_print(priority, "T", "text");
        levels += log.takeText().substr(0, 4);
    }
    EXPECT_EQ(levels, "<7>V<7>D<6>I<4>W<3>E<2>F");
    setenv("JOURNAL_STREAM", (journal + "1").c_str(), 1);
    EXPECT_EQ(letterOf(ANDROID_LOG_ERROR), 'E') << "standard error is something else";
    unsetenv("JOURNAL_STREAM");
    // What is no priority of a line counts as debug.
    const int others[] = {ANDROID_LOG_UNKNOWN, ANDROID_LOG_DEFAULT, ANDROID_LOG_SILENT, -1, 99};
    for (const int priority : others)
        EXPECT_EQ(letterOf(priority), 'D') << priority;
}

TEST(LogTest, WhatATerminalCouldObeyIsEscaped) {
    const struct {
        const char* text;
        const char* shown;
    } cases[] = {
            {"a\nb\x1b[31m\x7f", R"(a\nb\x1b[31m\x7f)"},
            {"\xc2\xa0\xc3\xa9\xe2\x82\xac\xf0\x9f\x93\xb3", nullptr},
            {"\xe0\xa0\x80\xed\x9f\xbf\xee\x80\x80\xf4\x8f\xbf\xbf", nullptr},
            // U+0080 to U+009F, as such and in more bytes than they need.
            {"\xc2\x9b"
             "31m\x9b\xe0\x82\x9b",
             R"(\xc2\x9b31m\x9b\xe0\x82\x9b)"},
            {"\xc0\x8a\xc1\xbf\xf0\x80\x82\x9b", R"(\xc0\x8a\xc1\xbf\xf0\x80\x82\x9b)"},
            // No characters, and the beginnings of some.
            {"\xed\xa0\x80\xf4\x90\x80\x80\xf8", R"(\xed\xa0\x80\xf4\x90\x80\x80\xf8)"},
            {"\xff\xe2\x82\xf0\x9f\x93 \xc3", R"(\xff\xe2\x82\xf0\x9f\x93 \xc3)"},
    };
    LogCapture log;
    for (const auto& [text, shown] : cases) {
        __android_log_print(ANDROID_LOG_DEBUG, "T", "%s", text);
        const std::string line = log.takeText();
        EXPECT_EQ(line.substr(line.find("): ") + 3), std::string(shown ? shown : text) + "\n");
    }
}

TEST(LogTest, NoLineWaitsForItsReaderOrEndsTheProcess) {
    int full[2];
    int broken[2];
    int journal[2];
    ASSERT_EQ(pipe2(full, O_CLOEXEC) + pipe2(broken, O_CLOEXEC), 0);
    ASSERT_EQ(socketpair(AF_UNIX, SOCK_STREAM | SOCK_CLOEXEC, 0, journal), 0);
    const int terminal = posix_openpt(O_RDWR | O_NOCTTY | O_CLOEXEC);
    ASSERT_EQ(grantpt(terminal) + unlockpt(terminal), 0);
    const int shown = open(ptsname(terminal), O_RDWR | O_NOCTTY | O_CLOEXEC);
    const std::string self = "/proc/self/fd/" + std::to_string(full[1]);
    const int other = open(self.c_str(), O_WRONLY | O_NONBLOCK | O_CLOEXEC);
    const struct {
        int log;
        /** What another process could do then. */
        std::function<void()> afterPoll;
        int result;
    } cases[] = {
            {full[1],
             [&] {
                 const std::string page(4096, 'x');
                 while (write(other, page.data(), page.size()) > 0) {
                 }
             },
             -EAGAIN},
            {broken[1], [&] { close(std::exchange(broken[0], -1)); }, -EPIPE},
            {journal[1], [] {}, 1},
            {shown, [] {}, 1},
    };
    const auto print = [] { return __android_log_print(ANDROID_LOG_ERROR, "T", "text"); };
    const int before = dup(STDERR_FILENO);
    // Ends a line that waits, and the test.
    alarm(10);
    for (const auto& each : cases) {
        dup2(each.log, STDERR_FILENO);
        afterPoll = each.afterPoll;
        EXPECT_EQ(print(), each.result);
        while (print() == 1) {
        }
    }
    alarm(0);
    dup2(before, STDERR_FILENO);
    for (const int descriptor :
         {full[0], full[1], broken[1], journal[0], journal[1], terminal, shown, other, before})
        close(descriptor);
}

TEST(LogTest, LineHasTheBriefForm) {
    LogCapture log;
    const std::string pid = std::to_string(getpid());
    const std::string shown = std::string(pid.size() < 5 ? 5 - pid.size() : 0, ' ') + pid;
    errno = 33;
    EXPECT_EQ(__android_log_print(ANDROID_LOG_ERROR, "Tag", "%d of %s", 7, "nine"), 1);
    EXPECT_EQ(errno, 33);
    EXPECT_EQ(log.takeText(), "E/Tag     (" + shown + "): 7 of nine\n");
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
