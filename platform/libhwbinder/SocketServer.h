// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "Packet.h"

#include <hwbinder/Binder.h>

#include <atomic>
#include <cstddef>
#include <cstdint>
#include <list>
#include <memory>
#include <mutex>
#include <string>
#include <unordered_map>
#include <utility>
#include <vector>

namespace android::hardware {

/**
 * Serves the clients of this process's objects with one thread, one call at a time.
 *
 * Every uid gets the same: in each round every uid that has calls waiting gets one of them served,
 * the one that has waited longest, however many connections it has. The server never waits for a
 * client: one that does not read its replies loses its connection. If there are too many
 * connections, an idle one is closed, or a busy one in favour of a uid that has fewer. What a
 * client has closed itself is gone before, and takes no turn.
 *
 * A child of the process must exec at once: while it holds a connection that is closed here, epoll
 * goes on reporting that.
 */
class SocketServer {
  public:
    SocketServer();
    ~SocketServer();
    SocketServer(const SocketServer&) = delete;
    SocketServer& operator=(const SocketServer&) = delete;

    /**
     * Makes an object known under a name: at once, or when the process that has it has gone.
     *
     * @return whether the object has the name now.
     */
    bool publish(const sp<BHwBinder>& object, const std::vector<std::string>& chain,
                 const std::string& instance);
    /** Serves calls until that becomes impossible. */
    void serve();

    /** Sends the obituary of a handle when the other side of its connection closes. */
    bool watch(uint32_t handle, int connection) const;
    void unwatch(int connection) const;

  private:
    /** First in, first out, by the elements' own links; an element is in one queue at most. */
    template <typename T>
    class Queue {
      public:
        bool isEmpty() const { return mFirst == nullptr; }
        const T* last() const { return mLast; }
        void push(T* element) {
            element->next = nullptr;
            (isEmpty() ? mFirst : mLast->next) = element;
            mLast = element;
        }
        T* pop() { return std::exchange(mFirst, mFirst->next); }
        /** @param element one that is in the queue. */
        void remove(const T* element) {
            T* before = nullptr;
            T** link = &mFirst;
            while (*link != element) {
                before = *link;
                link = &before->next;
            }
            *link = element->next;
            if (mLast == element) mLast = before;
        }

      private:
        T* mFirst = nullptr;
        T* mLast = nullptr;
    };

    struct Share;

    /** What the loop waits for: a listening socket, or a client's connection. */
    struct Endpoint {
        int socket;
        sp<BHwBinder> object;
        /** Whose connection it is; nullptr for a listening socket. */
        Share* share;
        Endpoint* next;
        bool isQueued;
        uint64_t lastUsed;
    };

    /** What a uid has. */
    struct Share {
        uid_t uid;
        size_t connections = 0;
        /** Those of its connections that have calls waiting. */
        Queue<Endpoint> waiting;
        Share* next = nullptr;
    };

    /** An object whose name another process has. */
    struct Pending {
        sp<BHwBinder> object;
        std::vector<std::string> chain;
        std::string instance;
    };

    bool listen(int socket, const sp<BHwBinder>& object);
    int retryPending();
    bool collect(int timeout);
    void enqueue(Endpoint* client);
    void serveOneOfEach();
    bool serveCall(Endpoint* client);
    bool reply(int socket);

    void acceptAll(Endpoint* listener);
    bool makeRoom(const Endpoint* newcomer);
    Endpoint* oldestClient(const Share* share, const Endpoint* newcomer, bool onlyIdle);
    void refuseOne(int listener);
    void drop(Endpoint* client);

    const int mEpoll;
    const int mWake;
    int mSpare;
    size_t mMost;
    size_t mMostPerUid;
    size_t mConnections = 0;
    uint64_t mClock = 0;
    int mRetryAfter = 1;
    std::unordered_map<int, Endpoint> mClients;
    std::unordered_map<uid_t, Share> mShares;
    /** The uids that have calls waiting, each once. */
    Queue<Share> mTurns;
    /** Of what may be published while calls are served. */
    std::mutex mMutex;
    std::list<Endpoint> mListeners;
    std::vector<Pending> mPending;
    std::atomic<bool> mHasPending = false;
    std::unique_ptr<Packet> mRequest;
    std::unique_ptr<Packet> mReply;
    Parcel mArguments;
    Parcel mResults;
};

}  // namespace android::hardware
