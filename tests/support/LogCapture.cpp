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

Lines LogCapture::takeLines() {
    return cutDown(takeText());
}

Lines cutDown(const std::string& log) {
    const std::string ownTag = "/QorVibrator-HAL2.1(";
    Lines lines;
    std::istringstream text(log);
    for (std::string line; std::getline(text, line);) {
        const size_t message = line.find("): ") + 3;
        const bool isOwn = line.compare(1, ownTag.size(), ownTag) == 0;
        lines.push_back(isOwn ? line[0] + (" " + line.substr(message)) : line);
    }
    return lines;
}
