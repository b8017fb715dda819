// SPDX-License-Identifier: Apache-2.0
#include "SocketCloser.h"

#include <sys/eventfd.h>

#include <thread>
#include <utility>

namespace android::hardware {

void SocketCloser::start() {
    std::thread([this] { run(); }).detach();
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
        mHasWork.wait(lock, [this] { return !mToClose.empty(); });
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
