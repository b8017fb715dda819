// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "Packet.h"
#include "SocketClients.h"
#include "SocketCloser.h"
#include "SocketPublication.h"

#include <hwbinder/Binder.h>
#include <utils/UniqueFd.h>

#include <atomic>
#include <cstdint>
#include <list>
#include <memory>
#include <mutex>

namespace android::hardware {

/**
 * Serves the clients of this process's objects with one thread, one call at a time.
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

    /** Sends the obituary of a handle when the other side of its connection closes. */
    bool watch(uint32_t handle, int connection) const;
    void unwatch(int connection) const;

  private:
    struct Listener : EventSource {
        ListeningSocket socket;
        sp<BHwBinder> object;
    };

    bool listen(const sp<BHwBinder>& object, ListeningSocket socket);
    bool waitFor(EventSource* source, int descriptor, uint32_t events) const;
    bool collect(int timeout);
    void handle(SocketClient* client, uint32_t events);
    void sendObituaries() const;
    void serveOneOfEach();
    bool serveCall(SocketClient* client);
    bool reply(int socket);

    void acceptAll(const Listener& listener);
    void admit(UniqueFd socket, uid_t uid, const sp<BHwBinder>& object);
    void refuseOne(int listener);
    void drop(SocketClient* client);

    const UniqueFd mEpoll;
    /** Reports the ends of connections, by their handles. */
    const UniqueFd mDeathEpoll;
    const UniqueFd mWakeEvent;
    UniqueFd mSpare;
    EventSource mDeaths{EventSource::Kind::kDeaths};
    EventSource mWake{EventSource::Kind::kWake};
    SocketClients mClients;
    SocketCloser mCloser;
    PendingPublications mPending;
    /** Guards the listeners, to which others may add while calls are served. */
    std::mutex mMutex;
    std::list<Listener> mListeners;
    /** Whether the kernel lets clients send descriptors. */
    std::atomic<bool> mMayBringDescriptors = false;
    std::unique_ptr<Packet> mRequest;
    std::unique_ptr<Packet> mReply;
    Parcel mArguments;
    Parcel mResults;
};

}  // namespace android::hardware
