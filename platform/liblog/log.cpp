// SPDX-License-Identifier: Apache-2.0
#include "LogFilter.h"

#include <android/log.h>
#include <fcntl.h>
#include <poll.h>
#include <sys/stat.h>
#include <unistd.h>

#include <algorithm>
#include <cerrno>
#include <climits>
#include <csignal>
#include <cstdarg>
#include <cstdint>
#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <ctime>
#include <mutex>
#include <string>

namespace android::log {
namespace {

/** Longest message; the rest of a longer one is cut off, as the system log does. */
constexpr size_t kMaxMessage = 1024;
constexpr size_t kMaxTag = 64;

/**
 * Keeps descriptor 2 occupied. Were it free, the next file opened would get it, and every log line
 * would be written into that file.
 */
void occupyStandardError() {
    if (fcntl(STDERR_FILENO, F_GETFD) != -1) return;
    const int null = open("/dev/null", O_WRONLY);
    if (null == STDERR_FILENO) return;
    dup2(null, STDERR_FILENO);
    close(null);
}

const LogFilter& filter() {
    static const LogFilter instance = [] {
        occupyStandardError();
        const char* rules = getenv("ANDROID_LOG_TAGS");
        LogFilter parsed(rules == nullptr ? "" : rules);
        if (!parsed.firstBadRule().empty()) {
            dprintf(STDERR_FILENO,
                    "ANDROID_LOG_TAGS: \"%s\" is no rule of the form TAG[:VDIWEFS]\n",
                    parsed.firstBadRule().c_str());
        }
        return parsed;
    }();
    return instance;
}

/**
 * @return the length of the UTF-8 sequence at the beginning of a text; 0 where that is a control
 *     character, of U+0080 to U+009F too, or is not UTF-8.
 */
size_t printableLength(const char* text) {
    const auto lead = static_cast<unsigned char>(*text);
    if (lead < 0x80) return lead >= 0x20 && lead != 0x7f ? 1 : 0;
    if (lead < 0xc0 || lead >= 0xf8) return 0;
    const size_t length = lead >= 0xf0 ? 4 : lead >= 0xe0 ? 3 : 2;
    uint32_t character = lead & (0x7fU >> length);
    for (size_t i = 1; i < length; ++i) {
        const auto next = static_cast<unsigned char>(text[i]);
        if ((next & 0xc0) != 0x80) return 0;
        character = character << 6 | (next & 0x3f);
    }
    // A longer sequence than the character needs could hide a control character.
    constexpr uint32_t kMin[] = {0, 0, 0xa0, 0x800, 0x10000};
    const bool isSurrogate = character >= 0xd800 && character <= 0xdfff;
    return character >= kMin[length] && character <= 0x10ffff && !isSurrogate ? length : 0;
}

/** Copies text, escaping control characters and what is not UTF-8. @return the end of the copy. */
char* escape(const char* text, char* out) {
    constexpr char kHex[] = "0123456789abcdef";
    while (*text != '\0') {
        const size_t length = printableLength(text);
        if (length > 0) {
            out = std::copy_n(text, length, out);
            text += length;
            continue;
        }
        const auto byte = static_cast<unsigned char>(*text++);
        *out++ = '\\';
        if (byte == '\n') {
            *out++ = 'n';
        } else {
            *out++ = 'x';
            *out++ = kHex[byte >> 4];
            *out++ = kHex[byte & 15];
        }
    }
    return out;
}

/**
 * @return standard error or, where that is a terminal or a pipe, the same opened anew: a write to a
 *     terminal that is stopped, or to a pipe that another process has just filled, waits although
 *     poll has promised room, and standard error cannot be told not to wait without telling all who
 *     share it.
 */
int logDescriptor() {
    struct stat info;
    if (fstat(STDERR_FILENO, &info) != 0) return STDERR_FILENO;
    if (!S_ISCHR(info.st_mode) && !S_ISFIFO(info.st_mode)) return STDERR_FILENO;
    static std::mutex mutex;
    static int opened = -1;
    static dev_t device = 0;
    static ino_t number = 0;
    const std::lock_guard<std::mutex> lock(mutex);
    if (opened < 0 || device != info.st_dev || number != info.st_ino) {
        if (opened >= 0) close(opened);
        opened = open("/proc/self/fd/2", O_WRONLY | O_NONBLOCK | O_NOCTTY | O_CLOEXEC);
        device = info.st_dev;
        number = info.st_ino;
    }
    return opened >= 0 ? opened : STDERR_FILENO;
}

/** @return whether standard error is systemd's journal, as it tells the programs that it starts. */
bool isJournal() {
    const char* stream = getenv("JOURNAL_STREAM");
    struct stat info;
    if (stream == nullptr || fstat(STDERR_FILENO, &info) != 0) return false;
    return std::to_string(info.st_dev) + ":" + std::to_string(info.st_ino) == stream;
}

/** Writes without waiting for a slow reader, or being killed by SIGPIPE when it has gone. */
int writeLine(const char* line, size_t length) {
    const int descriptor = logDescriptor();
    pollfd reader{descriptor, POLLOUT, 0};
    if (poll(&reader, 1, 0) != 1 || reader.revents != POLLOUT) return -EAGAIN;

    sigset_t pipeSignal;
    sigset_t before;
    sigemptyset(&pipeSignal);
    sigaddset(&pipeSignal, SIGPIPE);
    pthread_sigmask(SIG_BLOCK, &pipeSignal, &before);
    const int result = write(descriptor, line, length) < 0 ? -errno : 1;
    if (result == -EPIPE && sigismember(&before, SIGPIPE) == 0) {
        const timespec now{0, 0};
        sigtimedwait(&pipeSignal, nullptr, &now);
    }
    pthread_sigmask(SIG_SETMASK, &before, nullptr);
    return result;
}

int printLine(int priority, const char* tag, const char* format, va_list arguments) {
    char message[kMaxMessage];
    // NOLINTNEXTLINE(clang-analyzer-valist.Uninitialized): the caller has started it
    vsnprintf(message, sizeof(message), format, arguments);

    constexpr char kLetters[] = "??VDIWEFS";
    // The journal takes syslog's level from the beginning of a line, and removes it.
    constexpr char kLevels[] = "??7764322";
    char line[kMaxTag + 32 + 4 * kMaxMessage];
    const char level[] = {'<', kLevels[priority], '>', '\0'};
    const int prefix = snprintf(line, kMaxTag + 31, "%s%c/%-8.*s(%5d): ", isJournal() ? level : "",
                                kLetters[priority], static_cast<int>(kMaxTag), tag, getpid());
    char* end = escape(message, line + prefix);
    // A pipe takes so much in one piece, or nothing of it.
    if (end - line >= PIPE_BUF) end = line + PIPE_BUF - 1;
    *end++ = '\n';
    return writeLine(line, static_cast<size_t>(end - line));
}

}  // namespace
}  // namespace android::log

int __android_log_print(int prio, const char* tag, const char* fmt, ...) {
    if (prio < ANDROID_LOG_VERBOSE || prio > ANDROID_LOG_FATAL) prio = ANDROID_LOG_DEBUG;
    if (!android::log::filter().shows(prio, tag)) return 0;

    const int error = errno;
    va_list arguments;
    va_start(arguments, fmt);
    const int result = android::log::printLine(prio, tag, fmt, arguments);
    va_end(arguments);
    errno = error;
    return result;
}
