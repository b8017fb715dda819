// SPDX-License-Identifier: Apache-2.0
#include "SocketServer.h"

#include "libhwbinder/Driver.h"

#include <android/log.h>
#include <fcntl.h>
#include <hwbinder/ProcessState.h>
#include <sys/epoll.h>
#include <sys/eventfd.h>
#include <sys/resource.h>
#include <sys/socket.h>

#include <algorithm>
#include <cerrno>
#include <cstring>
#include <utility>

namespace android::hardware {
namespace {

/** New connections between two rounds of calls, so that a flood of them does not delay calls. */
constexpr int kMaxAcceptedAtOnce = 128;
constexpr int kMaxEventsAtOnce = 1024;
/** Longest time between two tries to get a name that another process has, in ms. */
constexpr int kMaxRetry = 256;

size_t descriptorLimit() {
    rlimit limit{};
    getrlimit(RLIMIT_NOFILE, &limit);
    return static_cast<size_t>(std::min<rlim_t>(limit.rlim_cur, 65536));
}

UniqueFd openSpare() {
    return UniqueFd(open("/dev/null", O_RDONLY | O_CLOEXEC));
}

/** What waits in a connection. */
enum class Content { kNothing, kEnd, kMessage, kMessageWithDescriptors };

/** A message from a connection, with room for who has sent it and for no descriptors. */
struct Message {
    Message(void* bytes, size_t size) : place{bytes, size} {
        header.msg_iov = &place;
        header.msg_iovlen = 1;
        header.msg_control = control;
        header.msg_controllen = sizeof(control);
    }
    ssize_t receive(int socket, int flags) {
        flags |= MSG_DONTWAIT | MSG_CMSG_CLOEXEC;
        const ssize_t size = recvmsg(socket, &header, flags);
        // A client that has gone with replies unread: said once, it hides the calls that wait.
        return size < 0 && errno == ECONNRESET ? recvmsg(socket, &header, flags) : size;
    }
    /** @return the sender; nullptr if he is unknown. */
    const ucred* sender() const {
        const cmsghdr* credentials = CMSG_FIRSTHDR(&header);
        const bool isKnown = credentials != nullptr && credentials->cmsg_level == SOL_SOCKET &&
                             credentials->cmsg_type == SCM_CREDENTIALS;
        return isKnown ? reinterpret_cast<const ucred*>(CMSG_DATA(credentials)) : nullptr;
    }

    iovec place;
    alignas(cmsghdr) char control[CMSG_SPACE(sizeof(ucred))];
    msghdr header{};
};

/** Looks into a connection. That closes none of the descriptors that a message brings. */
Content look(int socket) {
    char byte = 0;
    Message message(&byte, 1);
    const ssize_t size = message.receive(socket, MSG_PEEK);
    if (size < 0 && errno == EAGAIN) return Content::kNothing;
    // Every message has a sender, also an empty one.
    if (size < 0 || message.sender() == nullptr) return Content::kEnd;
    return (message.header.msg_flags & MSG_CTRUNC) != 0 ? Content::kMessageWithDescriptors
                                                        : Content::kMessage;
}

/** Receives a call and who makes it. @return whether there is one, whole. */
bool receive(int socket, Packet* request, ucred* caller) {
    Message message(request->bytes, Packet::kMaxSize);
    const ssize_t size = message.receive(socket, 0);
    if (size <= 0 || (message.header.msg_flags & MSG_TRUNC) != 0) return false;
    request->size = static_cast<size_t>(size);
    const ucred* sender = message.sender();
    if (sender == nullptr) return false;
    *caller = *sender;
    return true;
}

}  // namespace

SocketServer::SocketServer()
    : mEpoll(epoll_create1(EPOLL_CLOEXEC)),
      mDeathEpoll(epoll_create1(EPOLL_CLOEXEC)),
      mWakeEvent(eventfd(0, EFD_CLOEXEC | EFD_NONBLOCK)),
      mSpare(openSpare()),
      mClients(ConnectionLimits(descriptorLimit())),
      mCloser(mWakeEvent.get()) {
    waitFor(&mWake, mWakeEvent.get(), EPOLLIN | EPOLLET);
    waitFor(&mDeaths, mDeathEpoll.get(), EPOLLIN);
}

bool SocketServer::waitFor(EventSource* source, int descriptor, uint32_t events) const {
    epoll_event event{};
    event.events = events;
    event.data.ptr = source;
    return epoll_ctl(mEpoll.get(), EPOLL_CTL_ADD, descriptor, &event) == 0;
}

bool SocketServer::add(const SocketPublication& publication) {
    const std::lock_guard<std::mutex> lock(mMutex);
    ListeningSocket socket;
    const Error error = listenUnderNames(publication, &socket);
    if (error.isOk()) return listen(publication.object, std::move(socket));
    const bool isTaken = error.code() == -EWOULDBLOCK;
    __android_log_print(ANDROID_LOG_ERROR, kLogTag, "%s is not registered%s: %s",
                        publication.name().c_str(), isTaken ? " yet" : "", error.text().c_str());
    if (isTaken) {
        mPending.push_back(publication);
        // Soon: the process that has the name may be ending.
        mRetryAfter = 1;
        // The loop may be waiting without an end.
        eventfd_write(mWakeEvent.get(), 1);
    }
    return false;
}

/** Tries again to get the names of what waits. @return the time until the next try, in ms. */
int SocketServer::retry() {
    const std::lock_guard<std::mutex> lock(mMutex);
    const auto hasItsNames = [this](const SocketPublication& each) {
        ListeningSocket socket;
        if (!listenUnderNames(each, &socket).isOk()) return false;
        __android_log_print(ANDROID_LOG_INFO, kLogTag, "%s is registered now", each.name().c_str());
        listen(each.object, std::move(socket));
        return true;
    };
    mPending.erase(std::remove_if(mPending.begin(), mPending.end(), hasItsNames), mPending.end());
    mRetryAfter = mPending.empty() ? -1 : std::min(2 * mRetryAfter, kMaxRetry);
    return mRetryAfter;
}

bool SocketServer::listen(const sp<BHwBinder>& object, ListeningSocket socket) {
    if (socket.mayBringDescriptors() && !mMayBringDescriptors.exchange(true)) mCloser.start();
    Listener& listener = mListeners.emplace_back(Listener{{}, std::move(socket), object});
    return waitFor(&listener, listener.socket.socket.get(), EPOLLIN);
}

void SocketServer::sendObituaries() const {
    epoll_event events[16];
    const int count = epoll_wait(mDeathEpoll.get(), events, 16, 0);
    for (int i = 0; i < count; ++i)
        ProcessState::self()->sendObituary(events[i].data.u32);
}

void SocketServer::serve() {
    if (!mEpoll.isValid() || !mDeathEpoll.isValid() || !mWakeEvent.isValid() || !mSpare.isValid() ||
        descriptorLimit() < ConnectionLimits::kMinDescriptors) {
        __android_log_print(ANDROID_LOG_ERROR, kLogTag,
                            "too few descriptors to serve: the limit is %zu, at least %zu are "
                            "needed (ulimit -n)",
                            descriptorLimit(), ConnectionLimits::kMinDescriptors);
        return;
    }
    mRequest = std::make_unique<Packet>();
    mReply = std::make_unique<Packet>();
    for (;;) {
        const int timeout = mRetryAfter < 0 ? -1 : retry();
        if (!collect(mClients.turns() == 0 ? timeout : 0)) return;
        serveOneOfEach();
    }
}

bool SocketServer::collect(int timeout) {
    epoll_event events[kMaxEventsAtOnce];
    const int count = epoll_wait(mEpoll.get(), events, kMaxEventsAtOnce, timeout);
    if (count < 0) return errno == EINTR;
    // Clients first: accepting may drop an idle client, and one with an event here is not idle.
    int others = 0;
    for (int i = 0; i < count; ++i) {
        auto* source = static_cast<EventSource*>(events[i].data.ptr);
        if (source->isClient) {
            handle(static_cast<SocketClient*>(source), events[i].events);
        } else {
            events[others++] = events[i];
        }
    }
    for (int i = 0; i < others; ++i) {
        auto* source = static_cast<EventSource*>(events[i].data.ptr);
        if (source == &mDeaths) {
            sendObituaries();
        } else if (source == &mWake) {
            for (SocketClient* client : mCloser.takeClosed())
                mClients.remove(client);
        } else {
            acceptAll(*static_cast<const Listener*>(source));
        }
    }
    return true;
}

void SocketServer::handle(SocketClient* client, uint32_t events) {
    if ((events & EPOLLRDHUP) != 0 && look(client->socket.get()) == Content::kEnd) {
        drop(client);
    } else {
        mClients.wait(client);
    }
}

void SocketServer::serveOneOfEach() {
    for (size_t turn = mClients.turns(); turn > 0; --turn) {
        SocketClient* client = mClients.next();
        // What else the client has sent is reported again, and waits behind its uid's other calls.
        if (!serveCall(client)) drop(client);
    }
}

bool SocketServer::serveCall(SocketClient* client) {
    const int socket = client->socket.get();
    if (mMayBringDescriptors && look(socket) != Content::kMessage) return false;
    ucred caller{};
    if (!receive(socket, mRequest.get(), &caller)) return false;

    bool isAlive = true;
    const auto reply = [&](const Parcel& parcel, uint32_t flags) {
        const status_t status = mReply->pack(0, flags, parcel);
        if (status != OK) mReply->packStatus(status);
        // Never waits: a client that does not read its replies is dropped.
        isAlive = send(socket, mReply->bytes, mReply->size, MSG_DONTWAIT | MSG_NOSIGNAL) >= 0;
    };
    Packet::Header header;
    const status_t status = mRequest->unpack(&header, &mArguments);
    if (status == OK) {
        const CallerIdentity identity(caller.uid, caller.pid);
        answerCall(*client->object, header.code, mArguments, header.flags, &mResults, reply);
    } else {
        // Its header cannot be trusted, nor its oneway flag: it gets an answer.
        mResults.writeInt32(status);
        reply(mResults, TF_STATUS_CODE);
    }
    mResults.clear();
    return isAlive;
}

void SocketServer::acceptAll(const Listener& listener) {
    for (int i = 0; i < kMaxAcceptedAtOnce; ++i) {
        UniqueFd socket(accept4(listener.socket.socket.get(), nullptr, nullptr,
                                SOCK_NONBLOCK | SOCK_CLOEXEC));
        if (!socket.isValid()) {
            if (errno == EMFILE || errno == ENFILE) refuseOne(listener.socket.socket.get());
            return;
        }
        ucred owner{};
        socklen_t size = sizeof(owner);
        if (look(socket.get()) != Content::kEnd &&
            getsockopt(socket.get(), SOL_SOCKET, SO_PEERCRED, &owner, &size) == 0) {
            admit(std::move(socket), owner.uid, listener.object);
        }
    }
}

void SocketServer::admit(UniqueFd socket, uid_t uid, const sp<BHwBinder>& object) {
    SocketClient* client = mClients.add(uid, std::move(socket), object);
    SocketClient* leaving = mClients.surplus(client, [](const SocketClient& each) {
        return look(each.socket.get()) == Content::kNothing;
    });
    if (!waitFor(client, client->socket.get(), EPOLLIN | EPOLLRDHUP)) leaving = client;
    if (leaving == client) {
        __android_log_print(ANDROID_LOG_WARN, kLogTag, "uid %u gets no further connection", uid);
    }
    if (leaving != nullptr) drop(leaving);
}

void SocketServer::refuseOne(int listener) {
    // There is no descriptor left for it; waiting, it would be reported again and again.
    mSpare.reset();
    mSpare.reset(accept4(listener, nullptr, nullptr, SOCK_CLOEXEC));
    mSpare.reset();
    mSpare = openSpare();
}

void SocketServer::drop(SocketClient* client) {
    // Closing is not enough where a child of this process has the connection, too.
    epoll_ctl(mEpoll.get(), EPOLL_CTL_DEL, client->socket.get(), nullptr);
    // No message may come between the look and the end.
    if (mMayBringDescriptors) shutdown(client->socket.get(), SHUT_RD);
    if (!mMayBringDescriptors || look(client->socket.get()) == Content::kEnd) {
        mClients.remove(client);
        return;
    }
    // Waiting messages are closed with it, and the descriptors in them.
    mClients.retire(client);
    mCloser.close(client);
}

}  // namespace android::hardware
