// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "transport/Message.h"

#include <hidl/Status.h>
#include <utils/RefBase.h>

#include <mutex>
#include <string>

namespace android::hardware::details {

/**
 * A client's connection to a registered object. It may be shared between threads; their calls go
 * one after the other. Once it has failed it stays dead.
 */
class Connection : public RefBase {
  public:
    /** @return the connection; a dead one, with the reason, where the object cannot be reached. */
    static sp<Connection> open(const char* descriptor, const std::string& instance);

    /** Sends a request and waits for its reply, which takes the request's place. */
    Status transact(Message& message);

  private:
    explicit Connection(int socket) : mSocket(socket) {}
    ~Connection() override;

    Status die(const std::string& why);

    std::mutex mMutex;
    int mSocket;
    std::string mWhyDead;
};

}  // namespace android::hardware::details
