// SPDX-License-Identifier: Apache-2.0
#include "SocketServer.h"

#include "libhwbinder/Driver.h"
#include "libhwbinder/SocketDirectory.h"

#include <android/log.h>
#include <fcntl.h>
#include <hwbinder/ProcessState.h>
#include <sys/epoll.h>
#include <sys/eventfd.h>
#include <sys/resource.h>
#include <sys/socket.h>
#include <unistd.h>

#include <algorithm>
#include <cerrno>
#include <cstring>

namespace android::hardware {
namespace {

/** Descriptors that clients never get, so that the objects can always open their files. */
constexpr size_t kReservedDescriptors = 32;
/** Connections that only root and the system user get. */
constexpr size_t kReservedConnections = 16;
constexpr size_t kMostConnectionsPerUid = 128;
/** New connections between two rounds of calls, so that a flood of them does not delay calls. */
constexpr int kMostAcceptedAtOnce = 128;
/** With fewer descriptors than this the process cannot serve anybody. */
constexpr size_t kLeastDescriptors = 16;

/** AID_SYSTEM of the platform's android_filesystem_config.h. */
constexpr uid_t kSystemUid = 1000;

/** Longest time between two tries to get a name that another process has, in ms. */
constexpr int kLongestRetry = 256;

/** Marks the handle of a watched connection, in the place of an endpoint's address. */
constexpr uint64_t kWatched = uint64_t{1} << 63;
/** Ends a wait; no handle is 0. */
constexpr uint64_t kWake = kWatched;

bool isPrivileged(uid_t uid) {
    return uid == 0 || uid == kSystemUid;
}

size_t descriptorLimit() {
    rlimit limit{};
    getrlimit(RLIMIT_NOFILE, &limit);
    return static_cast<size_t>(std::min<rlim_t>(limit.rlim_cur, 65536));
}

int openSpare() {
    return open("/dev/null", O_RDONLY | O_CLOEXEC);
}

/** @return 1 if a call waits, 0 if none has come, -1 if the client has closed and left none. */
int peek(int socket) {
    char byte = 0;
    const ssize_t size = recv(socket, &byte, 1, MSG_PEEK | MSG_DONTWAIT);
    if (size < 0 && errno == EAGAIN) return 0;
    return size > 0 ? 1 : -1;
}

/** Receives a call and who makes it. @return whether there is one, whole. */
bool receive(int socket, Packet* request, ucred* caller) {
    iovec place{request->bytes, Packet::kMaxSize};
    alignas(cmsghdr) char control[CMSG_SPACE(sizeof(ucred))];
    msghdr message{};
    message.msg_iov = &place;
    message.msg_iovlen = 1;
    message.msg_control = control;
    message.msg_controllen = sizeof(control);
    const ssize_t size = recvmsg(socket, &message, MSG_DONTWAIT | MSG_CMSG_CLOEXEC);
    if (size <= 0 || (message.msg_flags & MSG_TRUNC) != 0) return false;
    request->size = static_cast<size_t>(size);
    const cmsghdr* credentials = CMSG_FIRSTHDR(&message);
    if (credentials == nullptr || credentials->cmsg_level != SOL_SOCKET ||
        credentials->cmsg_type != SCM_CREDENTIALS) {
        // The caller is unknown.
        return false;
    }
    memcpy(caller, CMSG_DATA(credentials), sizeof(*caller));
    return true;
}

}  // namespace

SocketServer::SocketServer()
    : mEpoll(epoll_create1(EPOLL_CLOEXEC)),
      mWake(eventfd(0, EFD_CLOEXEC | EFD_NONBLOCK)),
      mSpare(openSpare()) {
    epoll_event event{};
    event.events = EPOLLIN | EPOLLET;
    event.data.u64 = kWake;
    epoll_ctl(mEpoll, EPOLL_CTL_ADD, mWake, &event);
    const size_t limit = descriptorLimit();
    mMost = limit > 2 * kReservedDescriptors ? limit - kReservedDescriptors : limit / 2;
    mMostPerUid = std::clamp<size_t>(mMost / 4, 1, kMostConnectionsPerUid);
}

SocketServer::~SocketServer() {
    for (const Endpoint& listener : mListeners)
        close(listener.socket);
    for (const auto& [socket, client] : mClients)
        close(socket);
    for (const int descriptor : {mSpare, mWake, mEpoll})
        close(descriptor);
}

bool SocketServer::publish(const sp<BHwBinder>& object, const std::vector<std::string>& chain,
                           const std::string& instance) {
    std::string whyNot;
    const int socket = ::android::hardware::publish(chain, instance, &whyNot);
    if (socket >= 0) {
        const std::lock_guard<std::mutex> lock(mMutex);
        return listen(socket, object);
    }
    const bool isTaken = errno == EWOULDBLOCK;
    __android_log_print(ANDROID_LOG_ERROR, kLogTag, "%s is not registered%s: %s",
                        socketName(chain.front(), instance).c_str(), isTaken ? " yet" : "",
                        whyNot.c_str());
    const std::lock_guard<std::mutex> lock(mMutex);
    if (!isTaken) return false;
    mPending.push_back({object, chain, instance});
    mHasPending = true;
    // The loop may be waiting without an end.
    eventfd_write(mWake, 1);
    return false;
}

bool SocketServer::listen(int socket, const sp<BHwBinder>& object) {
    Endpoint& listener =
            mListeners.emplace_back(Endpoint{socket, object, nullptr, nullptr, false, 0});
    epoll_event event{};
    event.events = EPOLLIN;
    event.data.ptr = &listener;
    return epoll_ctl(mEpoll, EPOLL_CTL_ADD, socket, &event) == 0;
}

int SocketServer::retryPending() {
    const std::lock_guard<std::mutex> lock(mMutex);
    const auto isKnown = [&](const Pending& each) {
        std::string whyNot;
        const int socket = ::android::hardware::publish(each.chain, each.instance, &whyNot);
        if (socket < 0) return false;
        __android_log_print(ANDROID_LOG_INFO, kLogTag, "%s is registered now",
                            socketName(each.chain.front(), each.instance).c_str());
        return listen(socket, each.object);
    };
    mPending.erase(std::remove_if(mPending.begin(), mPending.end(), isKnown), mPending.end());
    // Soon at first: the process that has the name may be ending.
    mRetryAfter = std::min(2 * mRetryAfter, kLongestRetry);
    mHasPending = !mPending.empty();
    return mHasPending ? mRetryAfter : -1;
}

bool SocketServer::watch(uint32_t handle, int connection) const {
    epoll_event event{};
    // The death is news only once.
    event.events = EPOLLRDHUP | EPOLLONESHOT;
    event.data.u64 = kWatched | handle;
    return epoll_ctl(mEpoll, EPOLL_CTL_ADD, connection, &event) == 0;
}

void SocketServer::unwatch(int connection) const {
    epoll_ctl(mEpoll, EPOLL_CTL_DEL, connection, nullptr);
}

void SocketServer::serve() {
    if (mEpoll < 0 || mWake < 0 || mSpare < 0 || descriptorLimit() < kLeastDescriptors) {
        __android_log_print(ANDROID_LOG_ERROR, kLogTag,
                            "too few descriptors to serve: the limit is %zu, at least %zu are "
                            "needed (ulimit -n)",
                            descriptorLimit(), kLeastDescriptors);
        return;
    }
    mRequest = std::make_unique<Packet>();
    mReply = std::make_unique<Packet>();
    for (;;) {
        const int timeout = mHasPending ? retryPending() : -1;
        if (!collect(mTurns.isEmpty() ? timeout : 0)) return;
        serveOneOfEach();
    }
}

bool SocketServer::collect(int timeout) {
    epoll_event events[1024];
    const int count = epoll_wait(mEpoll, events, 1024, timeout);
    if (count < 0) return errno == EINTR;
    // Clients first: accepting may drop an idle client, and one with an event here is not idle.
    int others = 0;
    for (int i = 0; i < count; ++i) {
        auto* endpoint = static_cast<Endpoint*>(events[i].data.ptr);
        if ((events[i].data.u64 & kWatched) != 0 || endpoint->share == nullptr) {
            events[others++] = events[i];
        } else if ((events[i].events & EPOLLRDHUP) != 0 && peek(endpoint->socket) < 0) {
            drop(endpoint);
        } else {
            enqueue(endpoint);
        }
    }
    for (int i = 0; i < others; ++i) {
        const uint64_t word = events[i].data.u64;
        if (word == kWake) continue;
        if ((word & kWatched) != 0) {
            ProcessState::self()->sendObituary(static_cast<uint32_t>(word));
        } else {
            acceptAll(static_cast<Endpoint*>(events[i].data.ptr));
        }
    }
    return true;
}

void SocketServer::enqueue(Endpoint* client) {
    if (client->isQueued) return;
    client->isQueued = true;
    Share* share = client->share;
    if (share->waiting.isEmpty()) mTurns.push(share);
    share->waiting.push(client);
}

void SocketServer::serveOneOfEach() {
    const Share* const lastOfRound = mTurns.last();
    for (bool isLast = mTurns.isEmpty(); !isLast;) {
        Share* share = mTurns.pop();
        isLast = share == lastOfRound;
        Endpoint* client = share->waiting.pop();
        client->isQueued = false;
        if (!share->waiting.isEmpty()) mTurns.push(share);
        // What else the client has sent is reported again, and waits behind its uid's other calls.
        if (!serveCall(client)) drop(client);
    }
}

bool SocketServer::serveCall(Endpoint* client) {
    client->lastUsed = ++mClock;
    const int socket = client->socket;
    ucred caller{};
    if (!receive(socket, mRequest.get(), &caller)) return false;

    Packet::Header header;
    status_t status = mRequest->unpack(&header, &mArguments);
    // The header of a malformed packet cannot be trusted, nor its oneway flag: it gets an answer.
    const bool oneway = status == OK && (header.flags & TF_ONE_WAY) != 0;
    bool isAlive = true;
    bool replied = oneway;
    const auto send = [&](Parcel& parcel) {
        if (replied) return;
        replied = true;
        const status_t packed = mReply->pack(0, 0, parcel);
        if (packed != OK) mReply->packStatus(packed);
        isAlive = reply(socket);
    };
    if (status == OK) {
        const CallerIdentity identity(caller.uid, caller.pid);
        status = client->object->BHwBinder::transact(header.code, mArguments, &mResults,
                                                     header.flags & TF_ONE_WAY, send);
    }
    if (!replied && status == OK) send(mResults);
    if (!replied) {
        mReply->packStatus(status);
        isAlive = reply(socket);
    }
    mArguments.clear();
    mResults.clear();
    return isAlive;
}

bool SocketServer::reply(int socket) {
    // Never waits: a client that does not read its replies is dropped.
    return send(socket, mReply->bytes, mReply->size, MSG_DONTWAIT | MSG_NOSIGNAL) >= 0;
}

void SocketServer::acceptAll(Endpoint* listener) {
    for (int i = 0; i < kMostAcceptedAtOnce; ++i) {
        const int socket =
                accept4(listener->socket, nullptr, nullptr, SOCK_NONBLOCK | SOCK_CLOEXEC);
        if (socket < 0) {
            if (errno == EMFILE || errno == ENFILE) refuseOne(listener->socket);
            return;
        }
        ucred owner{};
        socklen_t size = sizeof(owner);
        if (peek(socket) < 0 || getsockopt(socket, SOL_SOCKET, SO_PEERCRED, &owner, &size) != 0) {
            close(socket);
            continue;
        }
        Share& share = mShares[owner.uid];
        share.uid = owner.uid;
        ++share.connections;
        ++mConnections;
        Endpoint& client =
                mClients[socket] = {socket, listener->object, &share, nullptr, false, ++mClock};
        epoll_event event{};
        event.events = EPOLLIN | EPOLLRDHUP;
        event.data.ptr = &client;
        if (!makeRoom(&client) || epoll_ctl(mEpoll, EPOLL_CTL_ADD, socket, &event) != 0) {
            __android_log_print(ANDROID_LOG_WARN, kLogTag, "uid %u gets no further connection",
                                owner.uid);
            drop(&client);
        }
    }
}

bool SocketServer::makeRoom(const Endpoint* newcomer) {
    const Share* share = newcomer->share;
    const size_t kept = isPrivileged(share->uid) ? 0 : std::min(mMost / 2, kReservedConnections);
    if (share->connections <= mMostPerUid) {
        if (mConnections <= mMost - kept) return true;
        // The uid that has most gives way; that may be the newcomer's own.
        for (const auto& [uid, each] : mShares) {
            if (!isPrivileged(uid) && each.connections > share->connections) share = &each;
        }
    }
    Endpoint* oldest = oldestClient(share, newcomer, true);
    // Else a few users that are always busy could keep all others out.
    if (oldest == nullptr && share != newcomer->share) {
        oldest = oldestClient(share, newcomer, false);
    }
    if (oldest == nullptr) return false;
    drop(oldest);
    return true;
}

SocketServer::Endpoint* SocketServer::oldestClient(const Share* share, const Endpoint* newcomer,
                                                   bool onlyIdle) {
    const auto isIdle = [](const Endpoint& client) {
        return !client.isQueued && peek(client.socket) == 0;
    };
    Endpoint* oldest = nullptr;
    for (auto& [socket, client] : mClients) {
        if (client.share == share && &client != newcomer &&
            (oldest == nullptr || client.lastUsed < oldest->lastUsed) &&
            (!onlyIdle || isIdle(client))) {
            oldest = &client;
        }
    }
    return oldest;
}

void SocketServer::refuseOne(int listener) {
    // There is no descriptor left for it; waiting, it would be reported again and again.
    close(mSpare);
    const int socket = accept4(listener, nullptr, nullptr, SOCK_CLOEXEC);
    if (socket >= 0) close(socket);
    mSpare = openSpare();
}

void SocketServer::drop(Endpoint* client) {
    Share* share = client->share;
    if (client->isQueued) {
        share->waiting.remove(client);
        if (share->waiting.isEmpty()) mTurns.remove(share);
    }
    const int socket = client->socket;
    mClients.erase(socket);
    close(socket);
    --mConnections;
    if (--share->connections == 0) mShares.erase(share->uid);
}

}  // namespace android::hardware
