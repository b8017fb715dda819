// SPDX-License-Identifier: Apache-2.0
#include "libhwbinder/SocketClients.h"

#include <gtest/gtest.h>

#include <algorithm>
#include <vector>

namespace {

using ::android::hardware::ConnectionLimits;
using ::android::hardware::SocketClient;
using ::android::hardware::SocketClients;

TEST(ConnectionLimitsTest, FollowTheLimitOfDescriptors) {
    const struct {
        size_t descriptors, ofEach, ofAll, ofRoot;
    } rows[] = {
            {1024, 128, 976, 992},
            {65536, 128, 65488, 65504},
            {65, 8, 17, 33},
            {16, 2, 4, 8},
    };
    for (const auto& row : rows) {
        const ConnectionLimits limits(row.descriptors);
        EXPECT_EQ(limits.ofEach(), row.ofEach) << row.descriptors;
        EXPECT_EQ(limits.ofAll(2000), row.ofAll) << row.descriptors;
        EXPECT_EQ(limits.ofAll(0), row.ofRoot) << row.descriptors;
        EXPECT_EQ(limits.ofAll(1000), row.ofRoot) << row.descriptors;
    }
}

class SocketClientsTest : public ::testing::Test {
  protected:
    SocketClient* add(uid_t uid) { return mClients.add(uid, {}, nullptr); }
    std::vector<SocketClient*> add(uid_t uid, size_t count) {
        std::vector<SocketClient*> clients;
        while (clients.size() < count)
            clients.push_back(add(uid));
        return clients;
    }
    void wait(const std::vector<SocketClient*>& clients) {
        for (SocketClient* client : clients)
            mClients.wait(client);
    }
    SocketClient* surplus(SocketClient* newcomer, const std::vector<SocketClient*>& busy = {}) {
        return mClients.surplus(newcomer, [&](const SocketClient& client) {
            return std::find(busy.begin(), busy.end(), &client) == busy.end();
        });
    }

    /** 2 for each uid, 4 for all, and 4 more for root and the system user. */
    SocketClients mClients{ConnectionLimits(16)};
};

TEST_F(SocketClientsTest, EveryUidHasOneTurnARound) {
    const auto flood = add(1, 3);
    SocketClient* polite = add(2);
    wait(flood);
    wait({polite, flood[0]});
    EXPECT_EQ(mClients.turns(), 2U);
    EXPECT_EQ(mClients.next(), flood[0]);
    EXPECT_EQ(mClients.next(), polite);
    EXPECT_EQ(mClients.turns(), 1U);
    // What comes back waits behind its uid's other calls.
    wait({flood[0], polite});
    for (SocketClient* each : {flood[1], polite, flood[2], flood[0]})
        EXPECT_EQ(mClients.next(), each);
    EXPECT_EQ(mClients.turns(), 0U);
}

TEST_F(SocketClientsTest, WhoHasGoneTakesNoTurn) {
    const auto clients = add(1, 2);
    SocketClient* other = add(2);
    SocketClient* retired = add(3);
    wait(clients);
    wait({other, retired});
    mClients.remove(clients[0]);
    mClients.remove(other);
    mClients.retire(retired);
    EXPECT_EQ(mClients.turns(), 1U);
    EXPECT_EQ(mClients.next(), clients[1]);
    EXPECT_EQ(mClients.turns(), 0U);
}

TEST_F(SocketClientsTest, AtItsLimitAUidGivesWayItself) {
    const auto others = add(2, 2);
    const auto own = add(1, 2);
    wait({own[0]});
    mClients.next();
    SocketClient* newcomer = add(1);
    EXPECT_EQ(surplus(newcomer), own[1]) << "it was used longer ago";
    EXPECT_EQ(surplus(newcomer, {own[1]}), own[0]);
    EXPECT_EQ(surplus(newcomer, own), newcomer);
    wait(own);
    EXPECT_EQ(surplus(newcomer), newcomer);
}

TEST_F(SocketClientsTest, AtTheLimitOfAllTheUidsThatHaveMostGiveWay) {
    const auto roots = add(0, 2);
    const auto two = add(2, 2);
    SocketClient* newcomer = add(1);
    EXPECT_EQ(surplus(newcomer), two[0]);
    EXPECT_EQ(surplus(newcomer, {two[0]}), two[1]);
    EXPECT_EQ(surplus(newcomer, two), two[0]) << "a busy one, in favour of who has fewer";
    wait(two);
    EXPECT_EQ(surplus(newcomer), two[0]);
    mClients.remove(newcomer);
    EXPECT_EQ(surplus(add(1000)), nullptr) << "some are kept for the system user";
}

TEST_F(SocketClientsTest, WhenAllHaveOneTheOneThatWasIdleLongestGivesWay) {
    std::vector<SocketClient*> clients;
    for (uid_t uid = 2000; uid < 2004; ++uid)
        clients.push_back(add(uid));
    wait({clients[0]});
    mClients.next();
    SocketClient* newcomer = add(3000);
    EXPECT_EQ(surplus(newcomer), clients[1]);
    EXPECT_EQ(surplus(newcomer, clients), newcomer) << "nobody loses a call to his like";
    wait(clients);
    EXPECT_EQ(surplus(newcomer), newcomer);
    EXPECT_EQ(surplus(add(0)), nullptr);
}

TEST_F(SocketClientsTest, ConnectionThatIsBeingClosedStillCounts) {
    const auto own = add(1, 2);
    for (SocketClient* each : own)
        mClients.retire(each);
    SocketClient* newcomer = add(1);
    EXPECT_EQ(surplus(newcomer), newcomer);
    mClients.remove(newcomer);
    SocketClient* other = add(2);
    add(3);
    EXPECT_EQ(surplus(add(4)), other) << "one that can give way, though its uid has not most";
    mClients.remove(own[0]);
    EXPECT_EQ(surplus(other), nullptr);
}

}  // namespace
