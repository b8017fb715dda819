// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <fcntl.h>
#include <gtest/gtest.h>
#include <unistd.h>

#include <cerrno>
#include <string>

/** Writes to a node in one go, as any program would. @return 0, or the errno. */
inline int putNode(const std::string& path, const std::string& text) {
    const int file = open(path.c_str(), O_RDWR);
    if (file < 0) return errno;
    const ssize_t size = write(file, text.data(), text.size());
    const int error = size < 0 ? errno : 0;
    close(file);
    return error;
}

/** @return what a node holds; empty where it cannot be read. */
inline std::string getNode(const std::string& path) {
    const int file = open(path.c_str(), O_RDONLY);
    if (file < 0) return {};
    char text[4096];
    const ssize_t size = read(file, text, sizeof(text));
    // A second read finds the end.
    EXPECT_EQ(read(file, text + size, sizeof(text) - static_cast<size_t>(size)), 0);
    close(file);
    return {text, static_cast<size_t>(size)};
}
