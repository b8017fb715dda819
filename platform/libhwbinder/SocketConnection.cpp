// SPDX-License-Identifier: Apache-2.0
#include "SocketConnection.h"

#include "Packet.h"
#include "SocketServer.h"

#include <sys/socket.h>
#include <unistd.h>

#include <cerrno>
#include <utility>

namespace android::hardware {
namespace {

/** A packet, and the next of those that this thread has no use for now. */
struct SparePacket : Packet {
    SparePacket* next;
};

/** Most calls need no memory from the heap. */
thread_local SparePacket* spare = nullptr;
/** What ends after the spare ones, at the end of a thread or of the process, may still call. */
thread_local bool areSparesGone = false;

struct SparesEnd {
    ~SparesEnd() {
        areSparesGone = true;
        while (spare != nullptr)
            delete std::exchange(spare, spare->next);
    }
};

SparePacket* newPacket() {
    static thread_local const SparesEnd end;
    return new SparePacket;
}

SparePacket* takePacket() {
    return spare == nullptr ? newPacket() : std::exchange(spare, spare->next);
}

void giveBack(const uint8_t* /* bytes */, void* owner) {
    auto* packet = static_cast<SparePacket*>(owner);
    if (areSparesGone) {
        delete packet;
        return;
    }
    packet->next = spare;
    spare = packet;
}

/** Makes a parcel of a reply. @return OK, or the status that the object has answered instead. */
status_t take(SparePacket* packet, Parcel* reply) {
    Packet::Header header;
    status_t status = packet->unpack(&header, reply, giveBack, packet);
    if (status != OK) {
        giveBack(nullptr, packet);
        return status;
    }
    if ((header.flags & TF_STATUS_CODE) == 0) return OK;
    const status_t read = reply->readInt32(&status);
    reply->clear();
    return read == OK && status != OK ? status : FAILED_TRANSACTION;
}

template <typename Call>
auto retry(Call call) {
    auto result = call();
    while (result < 0 && errno == EINTR)
        result = call();
    return result;
}

}  // namespace

SocketConnection::~SocketConnection() {
    close(mSocket);
}

status_t SocketConnection::requestDeathNotice() {
    return mWatcher->watch(mHandle, mSocket) ? OK : DEAD_OBJECT;
}

void SocketConnection::clearDeathNotice() {
    mWatcher->unwatch(mSocket);
}

inline status_t SocketConnection::exchange(Packet* packet, bool oneway) {
    const std::lock_guard<std::mutex> lock(mMutex);
    if (mDead) return DEAD_OBJECT;
    // Until the exchange has succeeded: a late reply must not be taken for that of the next call.
    mDead = true;
    if (retry([&] { return send(mSocket, packet->bytes, packet->size, MSG_NOSIGNAL); }) < 0) {
        return errno == EAGAIN ? TIMED_OUT : DEAD_OBJECT;
    }
    if (!oneway) {
        const ssize_t size =
                retry([&] { return recv(mSocket, packet->bytes, Packet::kMaxSize, MSG_TRUNC); });
        if (size < 0 && errno == EAGAIN) return TIMED_OUT;
        if (size <= 0 || static_cast<size_t>(size) > Packet::kMaxSize) return DEAD_OBJECT;
        packet->size = static_cast<size_t>(size);
    }
    mDead = false;
    return OK;
}

status_t SocketConnection::transact(uint32_t code, const Parcel& data, Parcel* reply,
                                    uint32_t flags) {
    SparePacket* packet = takePacket();
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
