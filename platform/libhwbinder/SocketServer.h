// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "Packet.h"
#include "SocketClients.h"
#include "SocketCloser.h"
#include "SocketPublication.h"

#include <hwbinder/Binder.h>
#include <utils/UniqueFd.h>

#include <atomic>
#include <list>
#include <memory>
#include <mutex>
#include <vector>

namespace android::hardware {

/**
 * Serves the clients of this process's objects with one thread, one call at a time. Lives as long
 * as the process.
 *
 * SocketClients says whose turn it is and who gives way. The server never waits for a client: one
 * that does not read its replies loses its connection. What a client has closed itself is gone
 * before new ones are let in, and takes no turn.
 */
class SocketServer {
  public:
    SocketServer();

    /**
     * Serves an object under its names: at once, or when the process that has them has gone.
     *
     * @return whether the object has its names now.
     */
    bool add(const SocketPublication& publication);
    /** Serves calls until that becomes impossible. */
    void serve();

    /** @return an epoll. When it tells of a handle, serve sends its obituary. */
    int deaths() const { return mDeathEpoll.get(); }

  private:
    struct Listener : EventSource {
        ListeningSocket socket;
        sp<BHwBinder> object;
    };

    bool listen(const sp<BHwBinder>& object, ListeningSocket socket);
    int retry();
    bool waitFor(EventSource* source, int descriptor, uint32_t events) const;
    bool collect(int timeout);
    void handle(SocketClient* client, uint32_t events);
    void sendObituaries() const;
    void serveOneOfEach();
    bool serveCall(SocketClient* client);

    void acceptAll(const Listener& listener);
    void admit(UniqueFd socket, uid_t uid, const sp<BHwBinder>& object);
    void refuseOne(int listener);
    void drop(SocketClient* client);

    const UniqueFd mEpoll;
    /** Reports the ends of connections, by their handles. */
    const UniqueFd mDeathEpoll;
    const UniqueFd mWakeEvent;
    UniqueFd mSpare;
    EventSource mDeaths;
    EventSource mWake;
    SocketClients mClients;
    SocketCloser mCloser;
    /** Guards what others may add to while calls are served. */
    std::mutex mMutex;
    std::list<Listener> mListeners;
    /** What waits until the processes that have its names have gone. */
    std::vector<SocketPublication> mPending;
    /** When that is to be tried again, in ms; -1 if there is nothing. */
    std::atomic<int> mRetryAfter = -1;
    /** Whether the kernel lets clients send descriptors. */
    std::atomic<bool> mMayBringDescriptors = false;
    std::unique_ptr<Packet> mRequest;
    std::unique_ptr<Packet> mReply;
    Parcel mArguments;
    Parcel mResults;
};

}  // namespace android::hardware
