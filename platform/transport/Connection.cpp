// SPDX-License-Identifier: Apache-2.0
#include "transport/Connection.h"

#include "transport/Address.h"

#include <sys/socket.h>
#include <sys/un.h>
#include <unistd.h>

#include <cerrno>
#include <cstring>

namespace android::hardware::details {
namespace {

template <typename Call>
auto retry(Call call) {
    auto result = call();
    while (result < 0 && errno == EINTR)
        result = call();
    return result;
}

std::string inWords(const char* what) {
    return std::string(what) + ": " + strerror(errno);
}

/** Connects a new socket. @return a failure, in words. */
Status connectTo(int socket, const char* descriptor, const std::string& instance) {
    std::string directory;
    Status status = socketDirectory(&directory);
    if (!status.isOk()) return status;
    sockaddr_un address;
    status = socketAddress(directory, socketName(descriptor, instance), &address);
    if (!status.isOk()) return status;

    const auto* generic = reinterpret_cast<const sockaddr*>(&address);
    // An interrupted connect must not be waited for: on a Unix socket it has not begun.
    if (retry([&] { return connect(socket, generic, sizeof(address)); }) == 0) return Status::ok();
    return Status::fromStatusT(-errno, inWords(address.sun_path));
}

}  // namespace

sp<Connection> Connection::open(const char* descriptor, const std::string& instance) {
    sp<Connection> connection(new Connection(socket(AF_UNIX, SOCK_SEQPACKET | SOCK_CLOEXEC, 0)));
    if (connection->mSocket < 0) {
        connection->die(inWords("socket"));
        return connection;
    }
    const Status status = connectTo(connection->mSocket, descriptor, instance);
    if (!status.isOk()) connection->die(status.description());
    return connection;
}

Connection::~Connection() {
    if (mSocket >= 0) close(mSocket);
}

Status Connection::transact(Message& message) {
    const std::lock_guard<std::mutex> lock(mMutex);
    if (mSocket < 0) return Status::fromStatusT(DEAD_OBJECT, mWhyDead);

    if (retry([&] { return send(mSocket, message.data, message.size, MSG_NOSIGNAL); }) < 0) {
        return die(inWords("the call could not be sent"));
    }
    const ssize_t received =
            retry([&] { return recv(mSocket, message.data, kMaxMessageSize, MSG_TRUNC); });
    if (received < 0) return die(inWords("no reply came"));
    if (received == 0) return die("the service has closed the connection");
    if (static_cast<size_t>(received) > kMaxMessageSize) return die("the reply is too large");
    message.size = static_cast<size_t>(received);
    return Status::ok();
}

Status Connection::die(const std::string& why) {
    if (mSocket >= 0) close(mSocket);
    mSocket = -1;
    mWhyDead = why;
    return Status::fromStatusT(DEAD_OBJECT, mWhyDead);
}

}  // namespace android::hardware::details
