// SPDX-License-Identifier: Apache-2.0
#include "support/TransportTest.h"
#include "transport/RawClient.h"

#include <linux/filter.h>
#include <linux/seccomp.h>
#include <netinet/in.h>
#include <sched.h>
#include <sys/prctl.h>
#include <sys/resource.h>
#include <sys/syscall.h>
#include <utils/Errors.h>

#include <algorithm>
#include <cerrno>
#include <chrono>
#include <csignal>
#include <cstddef>
#include <cstring>
#include <filesystem>
#include <fstream>

// What clients may do with their connections to the daemon.

namespace {

using namespace raw;
using ::android::hardware::Packet;

constexpr size_t kChainLength = 7;

class HostileClientTest : public TransportTest {
  protected:
    RawClient rawClient() const { return RawClient(mDirectory.path()); }
    /** @return clients that have begun to connect, as another user where root runs the tests. */
    std::vector<RawClient> connecting(size_t count, uid_t uid = geteuid()) const {
        const bool isRoot = geteuid() == 0;
        EXPECT_TRUE(!isRoot || seteuid(uid) == 0);
        std::vector<RawClient> clients;
        while (clients.size() < count)
            clients.push_back(rawClient());
        EXPECT_TRUE(!isRoot || seteuid(0) == 0);
        return clients;
    }
    std::vector<RawClient> connected(size_t count, uid_t uid = geteuid()) const {
        std::vector<RawClient> clients = connecting(count, uid);
        expectAllAnswer(clients);
        return clients;
    }
    static size_t countAnswering(const std::vector<RawClient>& clients) {
        const auto answers = [](const RawClient& client) { return client.answersPing(); };
        return static_cast<size_t>(std::count_if(clients.begin(), clients.end(), answers));
    }
    static void expectAllAnswer(const std::vector<RawClient>& clients) {
        EXPECT_EQ(countAnswering(clients), clients.size());
    }
};

TEST_F(HostileClientTest, MessageMayEndAnywhere) {
    serve();
    const RawClient client = rawClient();
    RawMessage message = RawMessage::to(kV20);
    message.addList(1, std::string(17, '\1'));
    // To be written far away, if a piece of the buffer before counts as the whole.
    message.add("");
    message.objects[2].length = UINT64_MAX / 2;
    message.add("", true, 2, uint64_t{1} << 40);
    const auto whole = message.packet(kDaxPerformHapticEngine);
    for (size_t size = 1; size < whole->size; ++size) {
        ASSERT_TRUE(client.send(whole->bytes, size));
        EXPECT_NE(client.receive().status, android::OK) << size;
    }
    // Nobody can tell whether it was to be oneway.
    const auto uneven = request(kBase, kPing, {}, TF_ONE_WAY);
    --reinterpret_cast<Packet::Header*>(uneven->bytes)->dataSize;
    EXPECT_EQ(client.call(uneven).status, android::FAILED_TRANSACTION);
    EXPECT_TRUE(client.answersPing()) << "the same connection still serves";
}

TEST_F(HostileClientTest, MessageWithoutMeasureCostsTheConnection) {
    serve();
    const std::string bytes(Packet::kMaxSize + 1, '\xff');
    const RawClient tooLarge = rawClient();
    ASSERT_TRUE(tooLarge.send(bytes.data(), bytes.size()));
    EXPECT_TRUE(tooLarge.receive().isClosed);
    const RawClient largest = rawClient();
    ASSERT_TRUE(largest.send(bytes.data(), bytes.size() - 1));
    EXPECT_EQ(largest.receive().status, android::FAILED_TRANSACTION);
    const RawClient empty = rawClient();
    ASSERT_TRUE(empty.send("", 0));
    EXPECT_TRUE(empty.receive().isClosed);
    EXPECT_TRUE(answers());
}

TEST_F(HostileClientTest, RepliesHoldNothingOfTheDaemonsMemory) {
    serve();
    const Received chain = rawClient().call(request(kBase, kInterfaceChain));
    ASSERT_EQ(chain.word(0), 0U);
    Packet::Header header;
    memcpy(&header, chain.packet.data(), sizeof(header));
    const uint8_t* data = chain.packet.data() + sizeof(header);
    const auto* offsets = reinterpret_cast<const uint64_t*>(data + (header.dataSize + 7) / 8 * 8);
    for (size_t i = 0; i < header.offsetsSize / sizeof(*offsets); ++i) {
        binder_buffer_object object;
        memcpy(&object, data + offsets[i], sizeof(object));
        EXPECT_LT(object.buffer, Packet::kMaxSize) << "an address";
    }
    // The list itself: an address, its count, whether it owns the elements, and three bytes more.
    const uint8_t* list = data + (header.dataSize + 7) / 8 * 8 + header.offsetsSize;
    EXPECT_EQ(memcmp(list + 13, "\0\0\0", 3), 0);
    // It, and the texts that follow it, begin with the address of their buffer.
    for (size_t i = 0; i <= kChainLength; ++i)
        EXPECT_EQ(memcmp(list + 16 * i, "\0\0\0\0\0\0\0\0", 8), 0) << i;
    const Received supports = rawClient().call(request(kV10, kSupportsAmplitudeControl));
    EXPECT_LE(supports.word(1), 1U) << "and three bytes of zero";
    rawClient().call(request(kBase, kInterfaceChain));
    EXPECT_EQ(rawClient().call(request(kBase, kPing)).word(1), 0U) << "nothing of the last reply";
}

TEST_F(HostileClientTest, ClientThatNeverReadsIsDropped) {
    serve();
    const RawClient client = rawClient();
    const auto packet = request(kBase, kInterfaceChain);
    bool dropped = false;
    for (int i = 0; i < 1'000'000 && !dropped; ++i) {
        dropped = !client.send(packet->bytes, packet->size, MSG_DONTWAIT) && errno == EPIPE;
    }
    EXPECT_TRUE(dropped);
    EXPECT_TRUE(answers());
}

TEST_F(HostileClientTest, AtTheLimitIdleConnectionsGiveWayAndBusyOnesDoNot) {
    if (geteuid() != 0) GTEST_SKIP() << "only root can become somebody else";
    serve("ulimit -n 64");
    // As many as there may be, some for root and the system user apart.
    std::vector<RawClient> clients;
    for (uid_t uid = 2000; uid < 2016; ++uid)
        clients.push_back(std::move(connected(1, uid)[0]));
    clients.push_back(std::move(connected(1, 3000)[0]));
    EXPECT_EQ(runAs(1000, [] { return answers() ? 0 : 1; }), 0);
    EXPECT_FALSE(clients[0].answersPing());
    clients.erase(clients.begin());
    expectAllAnswer(clients);

    stopServer();
    for (const RawClient& client : clients)
        EXPECT_TRUE(client.send(request(kBase, kPing)));
    const std::vector<RawClient> refused = connecting(1, 3002);
    ::kill(mServer.pid(), SIGCONT);
    EXPECT_FALSE(refused[0].answersPing());
    for (const RawClient& client : clients)
        EXPECT_FALSE(client.receive().isClosed);
    EXPECT_NE(log().find("uid 3002 gets no further connection"), std::string::npos) << log();
}

TEST_F(HostileClientTest, ConnectionsThatTheirClientsHaveClosedGiveWayFirst) {
    serve();
    const bool isRoot = geteuid() == 0;
    const RawClient other = rawClient();
    const std::vector<RawClient> living = connected(isRoot ? 88 : 87, 2000);
    std::vector<RawClient> closed = connected(40, 2000);
    stopServer();
    closed.clear();
    // Then there are 128, as many as a user may have.
    const std::vector<RawClient> newcomers = connecting(40, 2000);
    for (int i = 0; i < 200; ++i)
        connecting(1, 2000);
    EXPECT_TRUE(other.send(request(kV10, kOn, {1001})));
    EXPECT_TRUE(other.send(request(kV10, kOn, {1002})));
    EXPECT_TRUE(living[0].send(request(kV10, kOn, {1000})));
    ::kill(mServer.pid(), SIGCONT);
    expectAllAnswer(living);
    expectAllAnswer(newcomers);
    // In the first round, as its user's only call.
    EXPECT_TRUE(!isRoot || log().find(" val:1000") < log().find(" val:1002")) << log();
}

TEST_F(HostileClientTest, FloodOfConnectionsCostsNobodyACall) {
    serve();
    const RawClient polite = rawClient();
    const std::vector<RawClient> idle = connected(64);
    const size_t descriptors = descriptorsOf(mServer.pid());
    const auto connectAndClose = [this] {
        for (;;)
            rawClient();
    };
    {
        const Child flood[] = {Child(connectAndClose), Child(connectAndClose)};
        for (int i = 0; i < 500; ++i) {
            const auto begin = std::chrono::steady_clock::now();
            EXPECT_TRUE(polite.answersPing());
            EXPECT_LT(std::chrono::steady_clock::now() - begin, std::chrono::seconds(1));
        }
    }
    expectAllAnswer(idle);
    EXPECT_TRUE(eventually([&] { return descriptorsOf(mServer.pid()) <= descriptors; }));
}

TEST_F(HostileClientTest, WhoeverComesWhenDescriptorsAreUsedUpIsTurnedAway) {
    serve();
    rlimit before{};
    ASSERT_EQ(prlimit(mServer.pid(), RLIMIT_NOFILE, nullptr, &before), 0);
    const std::string files = "/proc/" + std::to_string(mServer.pid()) + "/fd/";
    std::vector<RawClient> clients;
    for (int round = 0; round < 2; ++round) {
        clients.push_back(rawClient());
        expectAllAnswer(clients);
        rlimit limit{0, before.rlim_max};
        while (std::filesystem::is_symlink(files + std::to_string(limit.rlim_cur)))
            ++limit.rlim_cur;
        ASSERT_EQ(prlimit(mServer.pid(), RLIMIT_NOFILE, &limit, nullptr), 0);
        EXPECT_EQ(countAnswering(connecting(2)), 0U);
        ASSERT_EQ(prlimit(mServer.pid(), RLIMIT_NOFILE, &before, nullptr), 0);
        expectAllAnswer(clients);
    }
}

#ifndef SANITIZED  // a sanitizer needs descriptors of its own to judge an object
TEST_F(HostileClientTest, DaemonWithoutDescriptorsSaysSoAndEnds) {
    startDaemon(mServer, "ulimit -n 12");
    EXPECT_TRUE(eventually([&] { return !mServer.isAlive(); }));
    EXPECT_NE(log().find("too few descriptors to serve: the limit is 12, at least 16 are needed "
                         "(ulimit -n)\n"),
              std::string::npos)
            << log();
}
#endif

/** Sends a request along with a descriptor. @return whether the kernel took it. */
bool sendWithDescriptor(const RawClient& client, const std::unique_ptr<Packet>& packet,
                        int descriptor) {
    iovec place{packet->bytes, packet->size};
    alignas(cmsghdr) char control[CMSG_SPACE(sizeof(int))] = {};
    msghdr message{};
    message.msg_iov = &place;
    message.msg_iovlen = 1;
    message.msg_control = control;
    message.msg_controllen = sizeof(control);
    cmsghdr* rights = CMSG_FIRSTHDR(&message);
    rights->cmsg_level = SOL_SOCKET;
    rights->cmsg_type = SCM_RIGHTS;
    rights->cmsg_len = CMSG_LEN(sizeof(int));
    memcpy(CMSG_DATA(rights), &descriptor, sizeof(descriptor));
    return sendmsg(client.socketNumber(), &message, MSG_NOSIGNAL) >= 0;
}

/** SO_PASSRIGHTS, which headers before Linux 6.16 lack. */
constexpr int kPassRights = 83;

TEST_F(HostileClientTest, DescriptorsDoNotReachTheDaemon) {
    int value = 0;
    socklen_t size = sizeof(value);
    const int probe = socket(AF_UNIX, SOCK_SEQPACKET | SOCK_CLOEXEC, 0);
    const bool isKnown = getsockopt(probe, SOL_SOCKET, kPassRights, &value, &size) == 0;
    close(probe);
    if (!isKnown) GTEST_SKIP() << "this kernel cannot keep descriptors away";
    serve();
    const RawClient client = rawClient();
    EXPECT_TRUE(client.answersPing());
    EXPECT_FALSE(sendWithDescriptor(client, request(kBase, kPing), STDOUT_FILENO));
    EXPECT_EQ(errno, EPERM);
    EXPECT_TRUE(answers());
}

/** Makes this process's kernel one that does not know SO_PASSRIGHTS, as before 6.16. */
void makeKernelOlder() {
    sock_filter code[] = {
            BPF_STMT(BPF_LD | BPF_W | BPF_ABS, offsetof(seccomp_data, nr)),
            BPF_JUMP(BPF_JMP | BPF_JEQ | BPF_K, SYS_setsockopt, 1, 0),
            BPF_JUMP(BPF_JMP | BPF_JEQ | BPF_K, SYS_getsockopt, 0, 3),
            BPF_STMT(BPF_LD | BPF_W | BPF_ABS, offsetof(seccomp_data, args[2])),
            BPF_JUMP(BPF_JMP | BPF_JEQ | BPF_K, kPassRights, 0, 1),
            BPF_STMT(BPF_RET | BPF_K, SECCOMP_RET_ERRNO | ENOPROTOOPT),
            BPF_STMT(BPF_RET | BPF_K, SECCOMP_RET_ALLOW),
    };
    const sock_fprog program{std::size(code), code};
    prctl(PR_SET_NO_NEW_PRIVS, 1, 0, 0, 0);
    if (prctl(PR_SET_SECCOMP, SECCOMP_MODE_FILTER, &program) != 0) _exit(1);
}

/** @return a connection, to nobody who reads, whose last descriptor takes seconds to close. */
int slowToClose() {
    sockaddr_in address{AF_INET, 0, {htonl(INADDR_LOOPBACK)}, {}};
    socklen_t size = sizeof(address);
    static const int listener = socket(AF_INET, SOCK_STREAM | SOCK_CLOEXEC, 0);
    bind(listener, reinterpret_cast<sockaddr*>(&address), size);
    getsockname(listener, reinterpret_cast<sockaddr*>(&address), &size);
    listen(listener, 8);
    const int connection = socket(AF_INET, SOCK_STREAM | SOCK_CLOEXEC, 0);
    const linger fourSeconds{1, 4};
    setsockopt(connection, SOL_SOCKET, SO_LINGER, &fourSeconds, sizeof(fourSeconds));
    connect(connection, reinterpret_cast<sockaddr*>(&address), size);
    const std::string much(1 << 20, 'x');
    while (send(connection, much.data(), much.size(), MSG_DONTWAIT) > 0) {
    }
    return connection;
}

TEST_F(HostileClientTest, DescriptorThatIsSlowToCloseHoldsNobodyUp) {
    mServer.start([] {
        makeKernelOlder();
        execl(SERVICE, SERVICE, nullptr);
    });
    ASSERT_TRUE(eventually(answers));
    const RawClient polite = rawClient();
    std::vector<RawClient> hostile = connected(2);
    // While it is stopped: the last one to close the descriptors must be the daemon.
    stopServer();
    for (const RawClient& client : hostile) {
        const int slow = slowToClose();
        EXPECT_TRUE(sendWithDescriptor(client, request(kBase, kPing), slow));
        close(slow);
    }
    hostile.pop_back();
    EXPECT_TRUE(polite.send(request(kBase, kPing)));
    const auto start = std::chrono::steady_clock::now();
    ::kill(mServer.pid(), SIGCONT);
    EXPECT_EQ(polite.receive().status, 0);
    EXPECT_TRUE(answers());
    EXPECT_LT(std::chrono::steady_clock::now() - start, std::chrono::seconds(1));
}

TEST_F(HostileClientTest, CallerIsWhoSendsTheMessage) {
    if (geteuid() != 0) GTEST_SKIP() << "only root can become somebody else";
    serve();
    constexpr uint32_t kRefused = 1;
    constexpr uint32_t kBadValue = 2;
    const auto packet = request(kV20, kDaxSetAmplitude, {0});
    // A root's connection in a user's hands, and the other way round.
    const RawClient rootsOwn = rawClient();
    EXPECT_EQ(rootsOwn.call(packet).word(1), kBadValue) << "the gate lets root pass";
    EXPECT_EQ(runAs(2000, [&] { return rootsOwn.call(packet).word(1) == kRefused ? 0 : 1; }), 0);
    EXPECT_EQ(rootsOwn.call(packet).word(1), kBadValue);
    // Whoever calls himself so in a namespace of his own is still who he is.
    for (const char* map : {"0 2000 1", "1000 2000 1"}) {
        const int code = runAs(2000, [&] {
            prctl(PR_SET_DUMPABLE, 1);
            if (unshare(CLONE_NEWUSER) != 0) return 2;
            std::ofstream("/proc/self/uid_map") << map;
            if (static_cast<int>(getuid()) != std::stoi(map)) return 3;
            return rawClient().call(packet).word(1) == kRefused ? 0 : 1;
        });
        if (code == 2) GTEST_SKIP() << "this machine refuses a namespace of users";
        EXPECT_EQ(code, 0) << map;
    }
    EXPECT_NE(log().find("Pemission denied (2000)"), std::string::npos);
}

TEST_F(HostileClientTest, ClosedLogGetsIntoNoNodeAndNoConnection) {
    startDaemon(mServer, "exec 2>&-");
    ASSERT_TRUE(eventually(answers));
    const std::string file = "/proc/" + std::to_string(mServer.pid()) + "/fd/2";
    EXPECT_EQ(std::filesystem::read_symlink(file), "/dev/null");
}

}  // namespace
