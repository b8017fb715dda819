// SPDX-License-Identifier: Apache-2.0
#include "SocketConnection.h"

#include "Alarm.h"
#include "Packet.h"

#include <sys/epoll.h>
#include <sys/socket.h>
#include <unistd.h>

#include <atomic>
#include <cerrno>
#include <cstring>
#include <utility>

namespace android::hardware {
namespace {

/** One that no call uses now, so that most calls need no memory from the heap. */
std::atomic<Packet*> sSpare = nullptr;

Packet* takePacket() {
    Packet* packet = sSpare.exchange(nullptr);
    return packet == nullptr ? new Packet : packet;
}

void giveBack(const uint8_t* /* bytes */, void* packet) {
    delete sSpare.exchange(static_cast<Packet*>(packet));
}

/** Makes a parcel of a reply. @return OK, or the status that the object has answered instead. */
status_t take(Packet* packet, Parcel* reply) {
    Packet::Header header;
    const status_t status = packet->unpack(&header, reply, giveBack, packet);
    if (status == OK) return statusOf(*reply, header.flags);
    giveBack(nullptr, packet);
    return status;
}

/**
 * Sends a request in the name of the effective user, as over the kernel's binder. By itself the
 * kernel names the real one; it allows this.
 */
ssize_t sendRequest(int socket, const Packet& packet) {
    uid_t real = 0;
    uid_t effective = 0;
    uid_t saved = 0;
    getresuid(&real, &effective, &saved);
    if (real == effective) return send(socket, packet.bytes, packet.size, MSG_NOSIGNAL);

    const ucred credentials{getpid(), effective, getegid()};
    iovec place{const_cast<uint8_t*>(packet.bytes), packet.size};
    alignas(cmsghdr) char control[CMSG_SPACE(sizeof(credentials))] = {};
    msghdr message{};
    message.msg_iov = &place;
    message.msg_iovlen = 1;
    message.msg_control = control;
    message.msg_controllen = sizeof(control);
    cmsghdr* header = CMSG_FIRSTHDR(&message);
    header->cmsg_level = SOL_SOCKET;
    header->cmsg_type = SCM_CREDENTIALS;
    header->cmsg_len = CMSG_LEN(sizeof(credentials));
    memcpy(CMSG_DATA(header), &credentials, sizeof(credentials));
    return sendmsg(socket, &message, MSG_NOSIGNAL);
}

}  // namespace

status_t SocketConnection::requestDeathNotice() {
    epoll_event event{};
    // A death is news only once.
    event.events = EPOLLRDHUP | EPOLLONESHOT;
    event.data.u32 = mHandle;
    return epoll_ctl(mDeaths, EPOLL_CTL_ADD, mSocket.get(), &event) == 0 ? OK : DEAD_OBJECT;
}

void SocketConnection::clearDeathNotice() {
    epoll_ctl(mDeaths, EPOLL_CTL_DEL, mSocket.get(), nullptr);
}

inline status_t SocketConnection::exchange(Packet* packet, bool oneway) {
    const std::lock_guard<std::mutex> lock(mMutex);
    if (mIsDead) return DEAD_OBJECT;
    // Until the exchange has succeeded: a late reply must not be taken for that of the next call.
    mIsDead = true;
    const Alarm alarm(callTimeout);
    const auto error = [] { return errno == ETIMEDOUT ? TIMED_OUT : DEAD_OBJECT; };
    if (alarm.uninterrupted([&] { return sendRequest(mSocket.get(), *packet); }) < 0) {
        return error();
    }
    if (!oneway) {
        const ssize_t size = alarm.uninterrupted(
                [&] { return recv(mSocket.get(), packet->bytes, Packet::kMaxSize, MSG_TRUNC); });
        if (size < 0) return error();
        if (size == 0 || static_cast<size_t>(size) > Packet::kMaxSize) return DEAD_OBJECT;
        packet->size = static_cast<size_t>(size);
    }
    mIsDead = false;
    return OK;
}

status_t SocketConnection::transact(uint32_t code, const Parcel& data, Parcel* reply,
                                    uint32_t flags) {
    Packet* packet = takePacket();
    const bool oneway = (flags & IBinder::FLAG_ONEWAY) != 0;
    status_t status = packet->pack(code, flags, data);
    if (status == OK) status = exchange(packet, oneway);
    if (status != OK || oneway) {
        giveBack(nullptr, packet);
        return status;
    }
    return take(packet, reply);
}

}  // namespace android::hardware
