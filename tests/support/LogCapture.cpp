// SPDX-License-Identifier: Apache-2.0
#include "support/LogCapture.h"

#include <sys/mman.h>
#include <unistd.h>

#include <regex>
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

Lines LogCapture::takeLines() {
    return cutDown(takeText());
}

Lines cutDown(const std::string& log) {
    static const std::regex kOwnLine("([A-Z])/QorVibrator-HAL2\\.1\\( *[0-9]+\\): (.*)");
    Lines lines;
    std::istringstream text(log);
    for (std::string line; std::getline(text, line);) {
        lines.push_back(std::regex_replace(line, kOwnLine, "$1 $2"));
    }
    return lines;
}
