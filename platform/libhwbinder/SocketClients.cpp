// SPDX-License-Identifier: Apache-2.0
#include "SocketClients.h"

#include <private/android_filesystem_config.h>

#include <algorithm>
#include <utility>

namespace android::hardware {
namespace {

/** Descriptors that clients never get, so that the objects can always open their files. */
constexpr size_t kReservedDescriptors = 32;
constexpr size_t kReservedConnections = 16;
constexpr size_t kMaxConnectionsPerUid = 128;

}  // namespace

ConnectionLimits::ConnectionLimits(size_t descriptors)
    : mOfAll(descriptors > 2 * kReservedDescriptors ? descriptors - kReservedDescriptors
                                                    : descriptors / 2),
      mOfEach(std::clamp<size_t>(mOfAll / 4, 1, kMaxConnectionsPerUid)),
      mReserved(std::min(mOfAll / 2, kReservedConnections)) {}

bool ConnectionLimits::isPrivileged(uid_t uid) {
    return uid == AID_ROOT || uid == AID_SYSTEM;
}

SocketClient* SocketClients::add(uid_t uid, UniqueFd socket, const sp<BHwBinder>& object) {
    SocketUser& user = mUsers[uid];
    user.uid = uid;
    ++user.connections;
    ++mConnections;
    SocketClient& client = mIdle.emplace_back();
    client.socket = std::move(socket);
    client.object = object;
    client.user = &user;
    client.place = std::prev(mIdle.end());
    return &client;
}

void SocketClients::retire(SocketClient* client) {
    SocketUser* user = client->user;
    mRetired.splice(mRetired.end(), client->isWaiting ? user->waiting : mIdle, client->place);
    if (std::exchange(client->isWaiting, false) && user->waiting.empty()) {
        mTurns.erase(std::find(mTurns.begin(), mTurns.end(), user));
    }
    client->isRetired = true;
    ++user->retired;
}

void SocketClients::remove(SocketClient* client) {
    if (!client->isRetired) retire(client);
    SocketUser* user = client->user;
    --user->retired;
    mRetired.erase(client->place);
    --mConnections;
    if (--user->connections == 0) mUsers.erase(user->uid);
}

void SocketClients::wait(SocketClient* client) {
    if (client->isWaiting) return;
    client->isWaiting = true;
    SocketUser* user = client->user;
    if (user->waiting.empty()) mTurns.push_back(user);
    user->waiting.splice(user->waiting.end(), mIdle, client->place);
}

SocketClient* SocketClients::next() {
    SocketUser* user = mTurns.front();
    mTurns.pop_front();
    SocketClient& client = user->waiting.front();
    mIdle.splice(mIdle.end(), user->waiting, client.place);
    client.isWaiting = false;
    if (!user->waiting.empty()) mTurns.push_back(user);
    return &client;
}

SocketClient* SocketClients::surplus(SocketClient* newcomer,
                                     FunctionRef<bool(const SocketClient&)> isIdle) {
    const SocketUser* own = newcomer->user;
    const bool ownGivesWay = own->connections > mLimits.ofEach();
    if (!ownGivesWay && mConnections <= mLimits.ofAll(own->uid)) return nullptr;
    size_t most = own->connections;
    for (const auto& [uid, user] : mUsers) {
        const bool canGiveWay =
                user.retired < user.connections && !ConnectionLimits::isPrivileged(uid);
        if (!ownGivesWay && canGiveWay) {
            most = std::max(most, user.connections);
        }
    }
    const auto givesWay = [&](const SocketClient& client) {
        const SocketUser* user = client.user;
        if (&client == newcomer || user->connections != most) return false;
        return user == own || (!ownGivesWay && !ConnectionLimits::isPrivileged(user->uid));
    };
    for (SocketClient& client : mIdle) {
        if (givesWay(client) && isIdle(client)) return &client;
    }
    // Else a few users that are always busy could keep all others out.
    if (most == own->connections) return newcomer;
    for (SocketClient& client : mIdle) {
        if (givesWay(client)) return &client;
    }
    for (SocketUser* user : mTurns) {
        if (givesWay(user->waiting.front())) return &user->waiting.front();
    }
    return newcomer;
}

}  // namespace android::hardware
