// SPDX-License-Identifier: Apache-2.0
#include "support/LogCapture.h"

#include <sys/mman.h>
#include <unistd.h>

#include <sstream>

LogCapture::LogCapture() : mBefore(dup(STDERR_FILENO)), mFile(memfd_create("log", MFD_CLOEXEC)) {
    dup2(mFile, STDERR_FILENO);
}

LogCapture::~LogCapture() {
    dup2(mBefore, STDERR_FILENO);
    close(mBefore);
    close(mFile);
}

std::string LogCapture::takeText() {
    std::string text;
    char buffer[4096];
    for (ssize_t size; (size = pread(mFile, buffer, sizeof(buffer), mRead)) > 0; mRead += size) {
        text.append(buffer, static_cast<size_t>(size));
    }
    return text;
}

std::string cutDown(const std::string& log) {
    const std::string ownTag = "/QorVibrator-HAL2.1(";
    std::string all;
    std::istringstream lines(log);
    for (std::string line; std::getline(lines, line); all += line + "\n") {
        if (line.compare(1, ownTag.size(), ownTag) == 0) line.replace(1, line.find("): ") + 2, " ");
    }
    return all;
}
