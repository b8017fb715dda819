// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <hwbinder/Parcel.h>
#include <utils/Errors.h>

#include <cstdint>
#include <mutex>

namespace android::hardware {

struct Packet;

/**
 * A client's connection to an object. It may be shared between threads; their calls go one after
 * the other. Once it has failed it stays dead.
 */
class LocalConnection {
  public:
    explicit LocalConnection(int socket) : mSocket(socket) {}
    ~LocalConnection();
    LocalConnection(const LocalConnection&) = delete;
    LocalConnection& operator=(const LocalConnection&) = delete;

    status_t transact(uint32_t code, const Parcel& data, Parcel* reply, uint32_t flags);

    /** @return the socket, which lives as long as the connection. */
    int socket() const { return mSocket; }

  private:
    status_t exchange(Packet* packet, bool oneway);

    const int mSocket;
    std::mutex mMutex;
    bool mDead = false;
};

}  // namespace android::hardware
