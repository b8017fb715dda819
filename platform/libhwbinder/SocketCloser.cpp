// SPDX-License-Identifier: Apache-2.0
#include "SocketCloser.h"

#include <sys/eventfd.h>

#include <utility>

namespace android::hardware {

SocketCloser::~SocketCloser() {
    if (!mThread.joinable()) return;
    {
        const std::lock_guard<std::mutex> lock(mMutex);
        mIsEnding = true;
    }
    mHasWork.notify_one();
    mThread.join();
}

void SocketCloser::start() {
    if (!mThread.joinable()) mThread = std::thread([this] { run(); });
}

void SocketCloser::close(SocketClient* client) {
    const std::lock_guard<std::mutex> lock(mMutex);
    mToClose.push_back(client);
    mHasWork.notify_one();
}

std::vector<SocketClient*> SocketCloser::takeClosed() {
    const std::lock_guard<std::mutex> lock(mMutex);
    return std::exchange(mClosed, {});
}

void SocketCloser::run() {
    std::unique_lock<std::mutex> lock(mMutex);
    for (;;) {
        mHasWork.wait(lock, [this] { return mIsEnding || !mToClose.empty(); });
        if (mIsEnding) return;
        SocketClient* client = mToClose.back();
        mToClose.pop_back();
        lock.unlock();
        client->socket.reset();
        lock.lock();
        mClosed.push_back(client);
        eventfd_write(mWake, 1);
    }
}

}  // namespace android::hardware
