// SPDX-License-Identifier: Apache-2.0

/**
 * Replaces the C library's open, read, write and close. Calls for the driver's nodes go to the
 * simulated driver below $VIBRATOR_SIM_DIR, all others to the kernel. It is preloaded into a daemon
 * or linked into a test, whose own code does not change.
 */
#undef _FORTIFY_SOURCE
#include "Faults.h"
#include "SimulatedDriver.h"
#include "TraceFile.h"
#include "TraceLine.h"

#include <fcntl.h>
#include <sys/syscall.h>
#include <unistd.h>

#include <algorithm>
#include <atomic>
#include <cerrno>
#include <cstdarg>
#include <cstdint>
#include <cstdlib>
#include <cstring>
#include <map>
#include <mutex>
#include <utility>

namespace {

using simulator::Node;

int kernelClose(int file) {
    return static_cast<int>(syscall(SYS_close, file));
}

/** An open node; its descriptor is that of the file that holds its state. */
struct OpenNode {
    Node node;
    /** What it showed at the first read; later reads continue in it. */
    std::string shown;
    size_t offset = 0;
};

std::mutex sMutex;
/** How many nodes are open, known without the lock. */
std::atomic<size_t> sOpenCount{0};

/** @return the nodes that are open in this process, by descriptor. */
std::map<int, OpenNode>& openNodes() {
    // Never destroyed: other threads and destructors may use files until the very end.
    static auto* const nodes = new std::map<int, OpenNode>;
    return *nodes;
}

/** Sets the node of a descriptor; an empty one removes it. */
void setOpenNode(int file, std::optional<OpenNode> node) {
    // What was there is destroyed without the lock: that closes a folder, and close takes the lock.
    std::map<int, OpenNode>::node_type before;
    const std::lock_guard<std::mutex> lock(sMutex);
    before = openNodes().extract(file);
    if (node) openNodes().emplace(file, std::move(*node));
    sOpenCount = openNodes().size();
}

/** @return the node behind a descriptor, nullptr where it is something else. */
OpenNode* findOpenNode(int file) {
    if (sOpenCount == 0) return nullptr;
    const std::lock_guard<std::mutex> lock(sMutex);
    const auto entry = openNodes().find(file);
    return entry == openNodes().end() ? nullptr : &entry->second;
}

/** Turns a result or negative errno into a system call's; success leaves errno unchanged. */
template <typename Call>
auto answer(Call call) {
    const int before = errno;
    const auto result = call();
    errno = result < 0 ? static_cast<int>(-result) : before;
    return std::max<decltype(call())>(result, -1);
}

/**
 * Performs and traces an access, unless a fault makes it fail.
 *
 * @param action gets the most bytes that it may move, less than SIZE_MAX where a fault cuts it
 *     short; returns the result, or a negative errno.
 * @param shown where a read puts its bytes.
 */
template <typename Action>
ssize_t simulate(const OpenNode& open, const std::string& name, const std::string& argument,
                 Action action, const void* shown = nullptr) {
    const auto fault = simulator::takeFault(*open.node.directory, open.node.leaf(), name);
    const ssize_t result =
            fault && fault->error != 0 ? -fault->error : action(fault ? fault->bytes : SIZE_MAX);
    std::string bytes;
    if (shown != nullptr && result >= 0)
        bytes = model::quote({static_cast<const char*>(shown), static_cast<size_t>(result)});
    simulator::trace(*open.node.directory, open.node.path, name + argument, result, bytes);
    return result;
}

int simulateOpen(const Node& node, int flags) {
    if (!simulator::isMarked(*node.directory)) return -ENOENT;
    const OpenNode open{node, {}};
    int file = -1;
    const ssize_t result = simulate(open, "open", ' ' + model::accessMode(flags), [&](size_t) {
        file = simulator::openNode(node, flags);
        return std::min(file, 0);
    });
    if (result < 0) return static_cast<int>(result);
    setOpenNode(file, open);
    return file;
}

ssize_t simulateRead(OpenNode& open, void* buffer, size_t size) {
    const auto read = [&](size_t most) {
        if (open.offset == 0) open.shown = simulator::show(open.node);
        const size_t length = std::min({size, most, open.shown.size() - open.offset});
        memcpy(buffer, open.shown.data() + open.offset, length);
        open.offset += length;
        return static_cast<ssize_t>(length);
    };
    return simulate(open, "read", ' ' + std::to_string(size), read, buffer);
}

ssize_t simulateWrite(const OpenNode& open, const void* buffer, size_t size) {
    const std::string bytes(static_cast<const char*>(buffer), size);
    return simulate(open, "write", ' ' + model::quote(bytes), [&](size_t most) {
        // A driver that gets only a part does not take the value.
        return most < SIZE_MAX ? static_cast<ssize_t>(std::min(size, most))
                               : simulator::store(open.node, bytes);
    });
}

int simulateClose(int file, const OpenNode& open) {
    const ssize_t result = simulate(open, "close", "", [](size_t) { return 0; });
    setOpenNode(file, std::nullopt);
    kernelClose(file);
    return static_cast<int>(result);
}

/** @return whether a path, which may be nullptr, is a node's; then *node is that node. */
bool isNode(const char* path, Node* node) {
    const char* directory = getenv("VIBRATOR_SIM_DIR");
    return directory != nullptr && *directory != '\0' && path != nullptr &&
           simulator::findNode(directory, path, node);
}

}  // namespace

extern "C" {

// NOLINTBEGIN(readability-inconsistent-declaration-parameter-name): the C library's names are
// reserved ones.

int open(const char* path, int flags, ...) {
    Node node;
    if (isNode(path, &node)) return answer([&] { return simulateOpen(node, flags); });
    mode_t mode = 0;
    if ((flags & O_CREAT) != 0 || (flags & O_TMPFILE) == O_TMPFILE) {
        va_list arguments;
        va_start(arguments, flags);
        mode = va_arg(arguments, mode_t);  // NOLINT(clang-analyzer-valist.Uninitialized): it is not
        va_end(arguments);
    }
    return static_cast<int>(syscall(SYS_openat, AT_FDCWD, path, flags | O_LARGEFILE, mode));
}

ssize_t read(int file, void* buffer, size_t size) {
    OpenNode* node = findOpenNode(file);
    return node == nullptr ? syscall(SYS_read, file, buffer, size)
                           : answer([&] { return simulateRead(*node, buffer, size); });
}

// What a program that checks its buffers calls in place of read.
ssize_t __read_chk(int file, void* buffer, size_t size, size_t room);
ssize_t __read_chk(int file, void* buffer, size_t size, size_t room) {
    if (size > room) abort();
    return read(file, buffer, size);
}

ssize_t write(int file, const void* buffer, size_t size) {
    const OpenNode* node = findOpenNode(file);
    return node == nullptr ? syscall(SYS_write, file, buffer, size)
                           : answer([&] { return simulateWrite(*node, buffer, size); });
}

int close(int file) {
    const OpenNode* node = findOpenNode(file);
    return node == nullptr ? kernelClose(file) : answer([&] { return simulateClose(file, *node); });
}

// NOLINTEND(readability-inconsistent-declaration-parameter-name)

}  // extern "C"
