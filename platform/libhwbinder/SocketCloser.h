// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "SocketClients.h"

#include <condition_variable>
#include <mutex>
#include <vector>

namespace android::hardware {

/**
 * Closes connections in a thread of its own. Descriptors that a client has sent along are closed
 * with its connection, and to close one may take seconds. Lives as long as its process.
 */
class SocketCloser {
  public:
    /** @param wake an eventfd that is written to after each connection. */
    explicit SocketCloser(int wake) : mWake(wake) {}

    /** Starts the thread, which never ends. */
    void start();
    /** Begins to close the connection of a client, which lives until it is taken back. */
    void close(SocketClient* client);
    /** @return the clients whose connections are closed by now. */
    std::vector<SocketClient*> takeClosed();

  private:
    void run();

    const int mWake;
    std::mutex mMutex;
    std::condition_variable mHasWork;
    std::vector<SocketClient*> mToClose;
    std::vector<SocketClient*> mClosed;
};

}  // namespace android::hardware
