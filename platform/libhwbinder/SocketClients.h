// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <hwbinder/Binder.h>
#include <sys/types.h>
#include <utils/FunctionRef.h>
#include <utils/UniqueFd.h>

#include <cstddef>
#include <deque>
#include <list>
#include <unordered_map>

namespace android::hardware {

/** How many connections a process serves, and each user. */
class ConnectionLimits {
  public:
    /** With fewer descriptors than this the process cannot serve anybody. */
    static constexpr size_t kMinDescriptors = 16;

    /** @param descriptors as many as the process may have. */
    explicit ConnectionLimits(size_t descriptors);

    /** @return the most connections that one uid may have. */
    size_t ofEach() const { return mOfEach; }
    /** @return the most connections that there may be, if the last one is this uid's. */
    size_t ofAll(uid_t uid) const { return isPrivileged(uid) ? mOfAll : mOfAll - mReserved; }

    /** @return whether the uid's connections never make room for another uid's. */
    static bool isPrivileged(uid_t uid);

  private:
    size_t mOfAll;
    size_t mOfEach;
    /** Connections that only root and the system user get. */
    size_t mReserved;
};

/** What a loop waits for. */
struct EventSource {
    const bool isClient = false;
};

struct SocketUser;

/** A client's connection. */
struct SocketClient : EventSource {
    SocketClient() : EventSource{true} {}

    UniqueFd socket;
    /** What it is connected to. */
    sp<BHwBinder> object;
    SocketUser* user = nullptr;
    bool isWaiting = false;
    bool isRetired = false;
    /** Where it is in the list that it is in. */
    std::list<SocketClient>::iterator place;
};

/** A uid that has connections. */
struct SocketUser {
    uid_t uid = 0;
    size_t connections = 0;
    /** How many of them are retired, and so cannot give way. */
    size_t retired = 0;
    /** Those that have calls waiting, the one that has waited longest first. */
    std::list<SocketClient> waiting;
};

/**
 * The clients of a process. Every uid gets the same: one turn in each round, however many of its
 * clients have calls waiting. When there are too many clients, one gives way.
 */
class SocketClients {
  public:
    explicit SocketClients(const ConnectionLimits& limits) : mLimits(limits) {}

    SocketClient* add(uid_t uid, UniqueFd socket, const sp<BHwBinder>& object);
    /** Forgets a client, and closes its connection. */
    void remove(SocketClient* client);
    /** Lets a client count as one until it is removed, but have no more turns. */
    void retire(SocketClient* client);

    /** Notes that a call of a client waits. */
    void wait(SocketClient* client);
    /** @return how many uids have calls waiting: the turns of a round. */
    size_t turns() const { return mTurns.size(); }
    /** @return the client whose turn is next. It has no call waiting then. */
    SocketClient* next();

    /**
     * Chooses who has to give way to a new client: at its uid's limit one of the uid's clients, at
     * the limit of all one of the uids that have most. It is the one that has been idle longest; if
     * none is idle, a busy one of a uid that has more than the newcomer's.
     *
     * @param isIdle tells whether no call of a client is on its way.
     * @return nullptr if there is room for all; the newcomer if nobody gives way.
     */
    SocketClient* surplus(SocketClient* newcomer, FunctionRef<bool(const SocketClient&)> isIdle);

  private:
    const ConnectionLimits mLimits;
    size_t mConnections = 0;
    /** Those that have no call waiting, the one that was served longest ago first. */
    std::list<SocketClient> mIdle;
    std::list<SocketClient> mRetired;
    std::unordered_map<uid_t, SocketUser> mUsers;
    std::deque<SocketUser*> mTurns;
};

}  // namespace android::hardware
