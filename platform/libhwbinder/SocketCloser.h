// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "SocketClients.h"

#include <condition_variable>
#include <mutex>
#include <thread>
#include <vector>

namespace android::hardware {

/**
 * Closes connections in a thread of its own. Descriptors that a client has sent along are closed
 * with its connection, and to close one may take seconds.
 */
class SocketCloser {
  public:
    /** @param wake an eventfd that is written to after each connection. */
    explicit SocketCloser(int wake) : mWake(wake) {}
    ~SocketCloser();
    SocketCloser(const SocketCloser&) = delete;
    SocketCloser& operator=(const SocketCloser&) = delete;

    /** Starts the thread, unless it runs. */
    void start();
    /** Begins to close the connection of a client, which lives until it is taken back. */
    void close(SocketClient* client);
    /** @return the clients whose connections are closed by now. */
    std::vector<SocketClient*> takeClosed();

  private:
    void run();

    const int mWake;
    std::thread mThread;
    std::mutex mMutex;
    std::condition_variable mHasWork;
    bool mIsEnding = false;
    std::vector<SocketClient*> mToClose;
    std::vector<SocketClient*> mClosed;
};

}  // namespace android::hardware
