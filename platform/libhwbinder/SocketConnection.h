// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "libhwbinder/Driver.h"

#include <utils/UniqueFd.h>

#include <cstdint>
#include <mutex>
#include <utility>

namespace android::hardware {

struct Packet;

/**
 * A client's connection to an object. It may be shared between threads; their calls go one after
 * the other. Once it has failed it stays dead.
 */
class SocketConnection : public RemoteObject {
  public:
    /** @param deaths the epoll that tells of the end of connections, by their handles. */
    SocketConnection(UniqueFd socket, int deaths, uint32_t handle)
        : mSocket(std::move(socket)), mDeaths(deaths), mHandle(handle) {}

    status_t transact(uint32_t code, const Parcel& data, Parcel* reply, uint32_t flags) override;
    status_t requestDeathNotice() override;
    void clearDeathNotice() override;

  private:
    status_t exchange(Packet* packet, bool oneway);

    const UniqueFd mSocket;
    const int mDeaths;
    const uint32_t mHandle;
    std::mutex mMutex;
    bool mIsDead = false;
};

}  // namespace android::hardware
