// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <fcntl.h>
#include <sys/types.h>
#include <unistd.h>

#include <cerrno>
#include <cstddef>

namespace vendor::velmora::hardware::vibrator::V2_1::implementation {

/** Issues a system call again for as long as a signal interrupts it. */
template <typename Call>
auto retryInterrupted(Call call) {
    auto result = call();
    while (result == -1 && errno == EINTR)
        result = call();
    return result;
}

enum class NodeMode { kRead, kReadWrite };

/**
 * One access of a node: opens it, does one transfer, and closes it when it goes out of scope. The
 * driver sees each transfer as one value, so a short one is never continued.
 */
class NodeFile {
  public:
    /** Opens a node, and never creates it. */
    NodeFile(const char* path, NodeMode mode)
        : mDescriptor(retryInterrupted([=] {
              // With flags that the compiler does not know, open would become another function
              // where the C library checks its callers.
              return mode == NodeMode::kRead ? open(path, O_RDONLY) : open(path, O_RDWR);
          })) {}
    NodeFile(const NodeFile&) = delete;
    NodeFile& operator=(const NodeFile&) = delete;
    ~NodeFile() { shut(); }

    /** @return whether the node could be opened; if not, errno says why. */
    bool isOpen() const { return mDescriptor >= 0; }

    /** @return the number of bytes read, or -1 with errno. */
    ssize_t receive(char* buffer, size_t size) const {
        return retryInterrupted([=] { return read(mDescriptor, buffer, size); });
    }
    /** @return the number of bytes written, or -1 with errno. */
    ssize_t send(const char* text, size_t size) const {
        return retryInterrupted([=] { return write(mDescriptor, text, size); });
    }

    /** Closes the node. */
    void shut() {
        if (mDescriptor >= 0) close(mDescriptor);
        mDescriptor = -1;
    }

  private:
    int mDescriptor;
};

}  // namespace vendor::velmora::hardware::vibrator::V2_1::implementation
