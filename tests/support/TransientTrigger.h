// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "support/RawNode.h"

#include <cerrno>
#include <chrono>
#include <string>
#include <thread>

/**
 * What the kernel's transient LED trigger does. The simulator and a real kernel are both held to
 * it, so that the one cannot stray from the other.
 *
 * @param directory the LED's, with a slash at the end; its timer must not be running.
 */
inline void expectTransientTrigger(const std::string& directory) {
    const auto put = [&](const char* leaf, const std::string& text) {
        return putNode(directory + leaf, text);
    };
    const auto get = [&](const char* leaf) { return getNode(directory + leaf); };
    const auto wait = [](int milliseconds) {
        std::this_thread::sleep_for(std::chrono::milliseconds(milliseconds));
    };

    const struct {
        const char* leaf;
        const char* text;
        int error;
        const char* after;
    } cases[] = {
            {"duration", "60", 0, "60\n"},
            {"duration", "-1\n", EINVAL, "60\n"},
            {"duration", "5\n\n", EINVAL, "60\n"},
            {"duration", "", 0, "60\n"},
            {"duration", "\n", EINVAL, "60\n"},
            {"duration", " 5", EINVAL, "60\n"},
            {"duration", "5 ", EINVAL, "60\n"},
            {"duration", "0x10", EINVAL, "60\n"},
            {"duration", "+5", 0, "5\n"},
            {"duration", "2147483647\n", 0, "2147483647\n"},
            {"duration", "18446744073709551615", 0, "18446744073709551615\n"},
            {"duration", "18446744073709551616", ERANGE, "18446744073709551615\n"},
            {"duration", "007", 0, "7\n"},
            {"state", "1\n", 0, "1\n"},
            {"state", "2", EINVAL, "1\n"},
            {"state", "0", 0, "0\n"},
            {"activate", "2", EINVAL, "0\n"},
            {"activate", "0", 0, "0\n"},
    };
    for (const auto& each : cases) {
        EXPECT_EQ(put(each.leaf, each.text), each.error) << each.leaf << ' ' << each.text;
        EXPECT_EQ(get(each.leaf), each.after) << each.leaf << ' ' << each.text;
    }

    EXPECT_EQ(put("duration", "0"), 0);
    EXPECT_EQ(put("activate", "1"), 0);
    EXPECT_EQ(get("activate"), "0\n") << "nothing runs without a duration";
    EXPECT_EQ(put("duration", "150"), 0);
    EXPECT_EQ(put("activate", "1"), 0);
    EXPECT_EQ(get("activate"), "1\n");
    EXPECT_EQ(put("duration", "100000"), 0);
    EXPECT_EQ(put("activate", "1"), 0);
    wait(300);
    EXPECT_EQ(get("activate"), "0\n") << "a running timer is neither prolonged nor replaced";
    EXPECT_EQ(get("duration"), "100000\n") << "kept for the next time";
    EXPECT_EQ(put("activate", "1"), 0);
    EXPECT_EQ(get("activate"), "1\n");
    EXPECT_EQ(put("activate", "0"), 0);
    EXPECT_EQ(get("activate"), "0\n") << "cancelled";
}
