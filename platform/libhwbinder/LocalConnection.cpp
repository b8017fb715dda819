// SPDX-License-Identifier: Apache-2.0
#include "LocalConnection.h"

#include "Packet.h"

#include <sys/socket.h>
#include <unistd.h>

#include <cerrno>
#include <memory>
#include <new>
#include <vector>

namespace android::hardware {
namespace {

/** The packets that this thread has no use for now: most calls need no memory from the heap. */
struct SparePackets {
    ~SparePackets() { areGone = true; }

    std::vector<std::unique_ptr<Packet>> packets;
    /** What ends after this, at the end of a thread or of the process, may still make calls. */
    static thread_local bool areGone;
};
thread_local bool SparePackets::areGone = false;
thread_local SparePackets spare;

std::unique_ptr<Packet> takePacket() {
    if (SparePackets::areGone || spare.packets.empty()) return std::unique_ptr<Packet>(new Packet);
    std::unique_ptr<Packet> packet = std::move(spare.packets.back());
    spare.packets.pop_back();
    return packet;
}

void giveBack(const uint8_t* /* bytes */, void* packet) {
    std::unique_ptr<Packet> returned(static_cast<Packet*>(packet));
    if (!SparePackets::areGone) spare.packets.push_back(std::move(returned));
}

template <typename Call>
auto retry(Call call) {
    auto result = call();
    while (result < 0 && errno == EINTR)
        result = call();
    return result;
}

}  // namespace

LocalConnection::~LocalConnection() {
    close(mSocket);
}

status_t LocalConnection::transact(uint32_t code, const Parcel& data, Parcel* reply,
                                   uint32_t flags) {
    std::unique_ptr<Packet> packet = takePacket();
    const bool oneway = (flags & IBinder::FLAG_ONEWAY) != 0;
    status_t status = packet->pack(code, flags, data);
    if (status == OK) status = exchange(packet.get(), oneway);
    if (status != OK || oneway) {
        giveBack(nullptr, packet.release());
        return status;
    }
    Parcel unwanted;
    Parcel* received = reply == nullptr ? &unwanted : reply;
    Packet::Header header;
    Packet* const owner = packet.release();
    status = owner->unpack(&header, received, giveBack, owner);
    if (status == OK && (header.flags & TF_STATUS_CODE) != 0) {
        const status_t read = received->readInt32(&status);
        received->clear();
        if (read != OK || status == OK) return FAILED_TRANSACTION;
    }
    return status;
}

status_t LocalConnection::exchange(Packet* packet, bool oneway) {
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

}  // namespace android::hardware
