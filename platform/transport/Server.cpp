// SPDX-License-Identifier: Apache-2.0
#include "transport/Address.h"
#include "transport/Publication.h"
#include "transport/Stub.h"

#include <android/log.h>
#include <fcntl.h>
#include <hidl/HidlTransportSupport.h>
#include <hwbinder/IPCThreadState.h>
#include <sys/epoll.h>
#include <sys/resource.h>
#include <sys/socket.h>
#include <unistd.h>

#include <algorithm>
#include <cerrno>
#include <cstring>
#include <unordered_map>

namespace android::hardware::details {
namespace {

constexpr char kTag[] = "hwbinder";

/** Descriptors that clients never get, so that the objects can always open their files. */
constexpr size_t kReservedDescriptors = 32;
constexpr size_t kMostConnectionsPerUid = 128;

struct Service {
    sp<IBase> object;
    const Stub* stub;
};

/** A socket that is waited for: a service's listening one, or a client's connection to it. */
struct Endpoint {
    Service service;
    bool listens;
    ucred client;
};

/** Serves all clients with one thread, one call at a time, as their calls arrive. */
class Server {
  public:
    static Server& instance() {
        static Server server;
        return server;
    }

    /** Takes a listening socket into service. */
    void add(int listener, const Service& service) { watch(listener, {service, true, {}}); }

    [[noreturn]] void serve() {
        for (;;) {
            // One event at a time: the kernel hands them out in the order of their arrival, and a
            // descriptor that is closed here cannot have a second event waiting in a list.
            epoll_event event;
            if (epoll_wait(mEpoll, &event, 1, -1) != 1) continue;
            const int socket = event.data.fd;
            const Endpoint& endpoint = mEndpoints.at(socket);
            if (endpoint.listens) {
                accept(socket, endpoint.service);
            } else if (!serveCall(socket, endpoint)) {
                drop(socket);
            }
        }
    }

  private:
    Server() : mEpoll(epoll_create1(EPOLL_CLOEXEC)), mSpare(openSpare()) {
        rlimit limit{};
        getrlimit(RLIMIT_NOFILE, &limit);
        const auto most = static_cast<size_t>(std::min<rlim_t>(limit.rlim_cur, 65536));
        mMostConnections = most > 2 * kReservedDescriptors ? most - kReservedDescriptors : most / 2;
        mMostPerUid = std::clamp<size_t>(mMostConnections / 4, 1, kMostConnectionsPerUid);
    }

    static int openSpare() { return open("/dev/null", O_RDONLY | O_CLOEXEC); }

    bool watch(int socket, const Endpoint& endpoint) {
        epoll_event event{};
        event.events = EPOLLIN;
        event.data.fd = socket;
        if (epoll_ctl(mEpoll, EPOLL_CTL_ADD, socket, &event) != 0) return false;
        mEndpoints.emplace(socket, endpoint);
        return true;
    }

    void accept(int listener, const Service& service) {
        const int socket = accept4(listener, nullptr, nullptr, SOCK_NONBLOCK | SOCK_CLOEXEC);
        if (socket < 0) {
            if (errno == EMFILE || errno == ENFILE) refuseOne(listener);
            return;
        }
        ucred client{};
        socklen_t size = sizeof(client);
        getsockopt(socket, SOL_SOCKET, SO_PEERCRED, &client, &size);
        const auto connections = mConnectionsOf.find(client.uid);
        if ((connections != mConnectionsOf.end() && connections->second >= mMostPerUid) ||
            mConnections >= mMostConnections || !watch(socket, {service, false, client})) {
            __android_log_print(ANDROID_LOG_WARN, kTag, "uid %u gets no further connection",
                                client.uid);
            close(socket);
            return;
        }
        ++mConnectionsOf[client.uid];
        ++mConnections;
    }

    /** Answers a connection for which there is no descriptor; it would be reported for ever. */
    void refuseOne(int listener) {
        close(mSpare);
        const int socket = accept4(listener, nullptr, nullptr, SOCK_CLOEXEC);
        if (socket >= 0) close(socket);
        mSpare = openSpare();
    }

    /** @return whether the client keeps its connection. */
    bool serveCall(int socket, const Endpoint& endpoint) {
        const ssize_t size = recv(socket, mRequest.data, kMaxMessageSize, MSG_DONTWAIT | MSG_TRUNC);
        if (size < 0) return errno == EAGAIN || errno == EINTR;
        if (size == 0 || static_cast<size_t>(size) > kMaxMessageSize) return false;
        mRequest.size = static_cast<size_t>(size);

        const status_t error = dispatchFor(endpoint);
        if (error != OK) Writer(mReply).put(error);
        // Never waits: whoever lets the replies pile up has no use for them.
        return send(socket, mReply.data, mReply.size, MSG_DONTWAIT | MSG_NOSIGNAL) >= 0;
    }

    status_t dispatchFor(const Endpoint& endpoint) {
        IPCThreadState* thread = IPCThreadState::self();
        const int64_t own = thread->clearCallingIdentity();
        const uint64_t caller =
                uint64_t{endpoint.client.uid} << 32 | static_cast<uint32_t>(endpoint.client.pid);
        thread->restoreCallingIdentity(static_cast<int64_t>(caller));
        Reader request(mRequest);
        Writer reply(mReply);
        reply.put(status_t{OK});
        const status_t error =
                dispatch(*endpoint.service.stub, *endpoint.service.object, request, reply);
        thread->restoreCallingIdentity(own);
        return error;
    }

    void drop(int socket) {
        const auto entry = mEndpoints.find(socket);
        const auto connections = mConnectionsOf.find(entry->second.client.uid);
        if (--connections->second == 0) mConnectionsOf.erase(connections);
        --mConnections;
        mEndpoints.erase(entry);
        close(socket);
    }

    int mEpoll;
    int mSpare;
    size_t mMostConnections;
    size_t mMostPerUid;
    size_t mConnections = 0;
    std::unordered_map<int, Endpoint> mEndpoints;
    std::unordered_map<uid_t, size_t> mConnectionsOf;
    Message mRequest;
    Message mReply;
};

}  // namespace

status_t registerService(const sp<IBase>& object, const Stub& stub, const std::string& instance) {
    int listener = -1;
    const Status status = publish(stub, instance, &listener);
    if (!status.isOk()) {
        __android_log_print(ANDROID_LOG_ERROR, kTag, "%s is not registered: %s",
                            socketName(stub.descriptor, instance).c_str(),
                            status.description().c_str());
        return status.transactionError();
    }
    Server::instance().add(listener, {object, &stub});
    return OK;
}

}  // namespace android::hardware::details

namespace android::hardware {

void configureRpcThreadpool(size_t maxThreads, bool callerWillJoin) {
    if (maxThreads == 1 && callerWillJoin) return;
    __android_log_print(ANDROID_LOG_ERROR, "hwbinder",
                        "a pool of %zu threads was asked for; the thread that joins serves alone",
                        maxThreads);
}

void joinRpcThreadpool() {
    details::Server::instance().serve();
}

}  // namespace android::hardware
