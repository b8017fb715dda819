// SPDX-License-Identifier: Apache-2.0
#include "libhwbinder/Packet.h"
#include "transport/TransportTest.h"

#include <fcntl.h>
#include <hwbinder/Parcel.h>
#include <sys/socket.h>
#include <sys/un.h>
#include <sys/wait.h>
#include <utils/Errors.h>

#include <algorithm>
#include <cerrno>
#include <csignal>
#include <cstring>
#include <optional>

namespace {

using ::android::hardware::Packet;
using ::android::hardware::Parcel;

constexpr char kV10[] = "android.hardware.vibrator@1.0::IVibrator";
constexpr char kV20[] = "vendor.velmora.hardware.vibrator@2.0::IDaxVibrator";
constexpr char kBase[] = "android.hidl.base@1.0::IBase";
constexpr size_t kChainLength = 7;
constexpr uint32_t kPing = 0x0f504e47;
constexpr uint32_t kInterfaceChain = 0x0f43484e;
constexpr uint32_t kDebug = 0x0f444247;
constexpr uint32_t kOn = 1;
constexpr uint32_t kDaxSetAmplitude = 18;
constexpr uint32_t kDaxPerformHapticEngine = 23;

/** What has come back: the status that stands for a reply, or the reply. */
struct Received {
    bool isClosed = false;
    int32_t status = 0;
    std::vector<uint8_t> packet;

    uint32_t word(size_t index) const {
        uint32_t value = 0;
        memcpy(&value, packet.data() + sizeof(Packet::Header) + 4 * index, sizeof(value));
        return value;
    }
};

/** A client that sends whatever it likes. */
class RawClient {
  public:
    explicit RawClient(const std::string& directory) {
        mSocket = socket(AF_UNIX, SOCK_SEQPACKET | SOCK_CLOEXEC, 0);
        sockaddr_un address{};
        address.sun_family = AF_UNIX;
        const std::string path =
                directory + "/vendor.velmora.hardware.vibrator@2.1::IDaxVibrator.default";
        memcpy(address.sun_path, path.c_str(), path.size());
        const timeval tenSeconds{10, 0};
        setsockopt(mSocket, SOL_SOCKET, SO_RCVTIMEO, &tenSeconds, sizeof(tenSeconds));
        mConnected = connect(mSocket, reinterpret_cast<sockaddr*>(&address), sizeof(address)) == 0;
    }
    RawClient(RawClient&& other) noexcept
        : mSocket(std::exchange(other.mSocket, -1)), mConnected(other.mConnected) {}
    RawClient(const RawClient&) = delete;
    RawClient& operator=(const RawClient&) = delete;
    ~RawClient() {
        if (mSocket >= 0) close(mSocket);
    }

    bool isConnected() const { return mConnected; }
    int socketNumber() const { return mSocket; }
    bool send(const void* bytes, size_t size, int flags = 0) const {
        return ::send(mSocket, bytes, size, flags | MSG_NOSIGNAL) == static_cast<ssize_t>(size);
    }
    bool send(const Packet& packet) const { return send(packet.bytes, packet.size); }
    Received receive() const {
        Received answer;
        answer.packet.resize(Packet::kMaxSize);
        const ssize_t size = recv(mSocket, answer.packet.data(), Packet::kMaxSize, 0);
        // Reset: closed by the server with a request still unread.
        if (size < 0 && errno != ECONNRESET) ADD_FAILURE() << "no reply: " << strerror(errno);
        answer.isClosed = size <= 0;
        if (answer.isClosed) return answer;
        answer.packet.resize(static_cast<size_t>(size));
        Packet::Header header;
        memcpy(&header, answer.packet.data(), sizeof(header));
        if ((header.flags & TF_STATUS_CODE) != 0) {
            answer.status = static_cast<int32_t>(answer.word(0));
        }
        return answer;
    }
    Received call(const Packet& packet) const {
        EXPECT_TRUE(send(packet));
        return receive();
    }
    bool answersPing() const;

  private:
    int mSocket;
    bool mConnected;
};

/** @return a request with numbers as arguments. */
std::unique_ptr<Packet> request(const char* interface, uint32_t code,
                                const std::vector<uint32_t>& arguments = {}) {
    Parcel parcel;
    parcel.writeInterfaceToken(interface);
    for (const uint32_t argument : arguments)
        parcel.writeUint32(argument);
    auto packet = std::unique_ptr<Packet>(new Packet);
    packet->pack(code, 0, parcel);
    return packet;
}

bool RawClient::answersPing() const {
    if (!send(*request(kBase, kPing))) return false;
    const Received answer = receive();
    return !answer.isClosed && answer.status == 0;
}

class HostileClientTest : public TransportTest {
  protected:
    void SetUp() override {
        if (isKernel()) GTEST_SKIP() << "what a raw client may do is the kernel's to say there";
    }
    RawClient rawClient() const { return RawClient(mDirectory.path()); }
    /** Stops the daemon, and waits until it has stopped. */
    void stopServer() const {
        ::kill(mServer.pid(), SIGSTOP);
        EXPECT_EQ(waitpid(mServer.pid(), nullptr, WUNTRACED), mServer.pid());
    }
    void needRoot() const {
        if (geteuid() != 0) GTEST_SKIP() << "only root can become somebody else";
    }
};

/** @return a list of packets for the haptic engine, with things about it changed. */
std::unique_ptr<Packet> list(uint32_t count, size_t bytes,
                             const std::function<void(binder_buffer_object*, uint64_t*)>& change) {
    struct {
        const void* buffer;
        uint32_t count;
        uint32_t owns = 0;
    } header{nullptr, count};
    const std::vector<uint8_t> elements(bytes);
    Parcel parcel;
    size_t parent = 0;
    parcel.writeInterfaceToken(kV20);
    parcel.writeBuffer(&header, sizeof(header), &parent);
    parcel.writeEmbeddedBuffer(elements.data(), elements.size(), nullptr, parent, 0);
    parcel.writeUint32(10000);
    auto packet = std::unique_ptr<Packet>(new Packet);
    packet->pack(kDaxPerformHapticEngine, 0, parcel);
    uint8_t* data = packet->bytes + sizeof(Packet::Header);
    binder_buffer_object objects[2];
    uint64_t offsets[2];
    memcpy(offsets, data + (parcel.dataSize() + 7) / 8 * 8, sizeof(offsets));
    const size_t places[] = {offsets[0], offsets[1]};
    for (int i = 0; i < 2; ++i)
        memcpy(&objects[i], data + places[i], sizeof(objects[i]));
    change(objects, offsets);
    for (int i = 0; i < 2; ++i)
        memcpy(data + places[i], &objects[i], sizeof(objects[i]));
    memcpy(data + (parcel.dataSize() + 7) / 8 * 8, offsets, sizeof(offsets));
    return packet;
}

TEST_F(HostileClientTest, NonsenseIsAnsweredWithAnErrorAndCostsNothing) {
    serve();
    const RawClient client = rawClient();
    ASSERT_TRUE(client.isConnected());
    const struct {
        const char* interface;
        uint32_t code;
        std::vector<uint32_t> arguments;
        android::status_t status;
    } calls[] = {
            {kV10, 0, {}, android::UNKNOWN_TRANSACTION},
            {kV10, 26, {}, android::UNKNOWN_TRANSACTION},
            {kV10, 0xffffffff, {}, android::UNKNOWN_TRANSACTION},
            {kV20, kOn, {1}, android::BAD_TYPE},
            {kBase, kOn, {1}, android::BAD_TYPE},
            {kV10, kPing, {}, android::BAD_TYPE},
            {"android.hardware.vibrator@1.0::IVibratorX", kOn, {1}, android::BAD_TYPE},
            {"android.hardware.vibrator@1.0::IVibrato", kOn, {1}, android::BAD_TYPE},
            {"", kOn, {1}, android::BAD_TYPE},
            {kV10, kOn, {}, android::NOT_ENOUGH_DATA},
            {kV20, kDaxPerformHapticEngine, {1, 2}, android::NOT_ENOUGH_DATA},
            {kV20, kDaxPerformHapticEngine, std::vector<uint32_t>(20), android::BAD_TYPE},
            {kBase, kDebug, {8, 0}, android::INVALID_OPERATION},
    };
    for (const auto& [interface, code, arguments, status] : calls) {
        EXPECT_EQ(client.call(*request(interface, code, arguments)).status, status)
                << interface << ' ' << code;
    }
    const struct {
        uint32_t count;
        size_t bytes;
        std::function<void(binder_buffer_object*, uint64_t*)> change;
        android::status_t status;
    } lists[] = {
            {1, 16, [](auto*, auto*) {}, android::OK},
            // The list says something else than its buffer measures.
            {2, 16, [](auto*, auto*) {}, android::BAD_VALUE},
            {0x10000001, 16, [](auto*, auto*) {}, android::BAD_VALUE},
            {0xffffffff, 0, [](auto*, auto*) {}, android::BAD_VALUE},
            // Objects that are none, in places that are none, with parents that are none.
            {1, 16, [](auto* o, auto*) { o[0].hdr.type = BINDER_TYPE_BINDER; },
             android::FAILED_TRANSACTION},
            {1, 16, [](auto* o, auto*) { o[1].hdr.type = BINDER_TYPE_FDA; },
             android::FAILED_TRANSACTION},
            {1, 16, [](auto* o, auto*) { o[1].parent = 1; }, android::FAILED_TRANSACTION},
            {1, 16, [](auto* o, auto*) { o[1].parent = UINT64_MAX; }, android::FAILED_TRANSACTION},
            {1, 16, [](auto* o, auto*) { o[1].parent_offset = 9; }, android::FAILED_TRANSACTION},
            {1, 16, [](auto* o, auto*) { o[1].parent_offset = UINT64_MAX - 7; },
             android::FAILED_TRANSACTION},
            {1, 16, [](auto* o, auto*) { o[1].parent_offset = 8; }, android::BAD_VALUE},
            {1, 16, [](auto* o, auto*) { o[1].flags = 0; }, android::BAD_VALUE},
            {1, 16, [](auto* o, auto*) { o[0].flags = 1; }, android::FAILED_TRANSACTION},
            {1, 16, [](auto* o, auto*) { o[1].length = UINT64_MAX; }, android::FAILED_TRANSACTION},
            {1, 16, [](auto* o, auto*) { o[1].length = UINT64_MAX - 6; },
             android::FAILED_TRANSACTION},
            {1, 16, [](auto* o, auto*) { o[1].length = 8; }, android::FAILED_TRANSACTION},
            {1, 16, [](auto*, auto* at) { at[0] = UINT64_MAX - 3; }, android::FAILED_TRANSACTION},
            {1, 16, [](auto*, auto* at) { at[0] += 1; }, android::FAILED_TRANSACTION},
            {1, 16, [](auto*, auto* at) { at[1] += 8; }, android::FAILED_TRANSACTION},
            {1, 16, [](auto*, auto* at) { std::swap(at[0], at[1]); }, android::FAILED_TRANSACTION},
            {1, 16, [](auto*, auto* at) { at[1] = at[0]; }, android::FAILED_TRANSACTION},
    };
    for (size_t i = 0; i < std::size(lists); ++i) {
        const auto& [count, bytes, change, status] = lists[i];
        EXPECT_EQ(client.call(*list(count, bytes, change)).status, status) << i;
    }
    const auto whole = list(1, 16, [](auto*, auto*) {});
    for (size_t size = 1; size < whole->size; ++size) {
        ASSERT_TRUE(client.send(whole->bytes, size));
        EXPECT_NE(client.receive().status, android::OK) << size;
    }
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

TEST_F(HostileClientTest, OnewayCallsHaveNoReply) {
    serve();
    const RawClient client = rawClient();
    Parcel parcel;
    parcel.writeInterfaceToken(kV10);
    parcel.writeUint32(77);
    const auto oneway = std::unique_ptr<Packet>(new Packet);
    oneway->pack(kOn, TF_ONE_WAY, parcel);
    ASSERT_TRUE(client.send(*oneway));
    // The operation is not one; the next reply is the ping's.
    EXPECT_TRUE(client.answersPing());
    EXPECT_EQ(log().find("val:77"), std::string::npos);
}

TEST_F(HostileClientTest, RepliesHoldNothingOfTheDaemonsMemory) {
    serve();
    const Received chain = rawClient().call(*request(kBase, kInterfaceChain));
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
}

TEST_F(HostileClientTest, ClientsThatVanishLeaveNothingBehind) {
    serve();
    const size_t before = mServer.descriptors();
    for (int i = 0; i < 300; ++i) {
        const RawClient client = rawClient();
        ASSERT_TRUE(client.send(*request(kBase, kPing)));
        if (i % 2 == 0) client.receive();
    }
    EXPECT_TRUE(eventually([&] { return mServer.descriptors() == before; }));
    EXPECT_TRUE(answers());
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

TEST_F(HostileClientTest, IdleConnectionsGiveWayAndRootIsNeverLockedOut) {
    needRoot();
    serve("ulimit -n 1024");
    const std::string directory = mDirectory.path();
    int alive = 0;
    std::vector<RawClient> clients;
    // Of eight users each has as many as it can get; all of them stay open.
    for (uid_t uid = 2000; uid < 2008; ++uid) {
        ASSERT_EQ(seteuid(uid), 0);
        for (int i = 0; i < 140; ++i)
            clients.emplace_back(directory);
        ASSERT_EQ(seteuid(0), 0);
    }
    for (const RawClient& client : clients)
        alive += client.answersPing() ? 1 : 0;
    EXPECT_GE(alive, 900);
    EXPECT_LE(alive, 8 * 128);
    EXPECT_TRUE(answers());
    EXPECT_EQ(runAs(1000, [] { return answers() ? 0 : 1; }), 0);
    EXPECT_EQ(runAs(3000, [] { return answers() ? 0 : 1; }), 0) << "one more user";

    // And while all of them are busy.
    stopServer();
    for (const RawClient& client : clients)
        static_cast<void>(client.send(*request(kBase, kPing)));
    ASSERT_EQ(seteuid(3001), 0);
    const RawClient newcomer = rawClient();
    ASSERT_EQ(seteuid(0), 0);
    EXPECT_TRUE(newcomer.send(*request(kBase, kPing)));
    ::kill(mServer.pid(), SIGCONT);
    EXPECT_FALSE(newcomer.receive().isClosed);
    EXPECT_TRUE(answers());
}

TEST_F(HostileClientTest, OldestIdleConnectionOfAUserGivesWay) {
    serve();
    std::vector<RawClient> clients;
    for (int i = 0; i < 128; ++i) {
        clients.push_back(rawClient());
        ASSERT_TRUE(clients.back().answersPing());
    }
    ASSERT_TRUE(clients[0].answersPing()) << "it is not the oldest any more";
    clients.push_back(rawClient());
    EXPECT_TRUE(clients.back().answersPing());
    EXPECT_TRUE(clients[0].answersPing());
    EXPECT_FALSE(clients[1].answersPing());
    EXPECT_TRUE(clients[2].answersPing());
}

TEST_F(HostileClientTest, DescriptorsAreKeptForTheObjects) {
    serve("ulimit -n 64");
    std::vector<RawClient> clients;
    for (int i = 0; i < 100; ++i)
        clients.push_back(rawClient());
    int alive = 0;
    for (const RawClient& client : clients)
        alive += client.answersPing() ? 1 : 0;
    // The client that has seen whether the daemon is there may still count.
    EXPECT_GE(alive, 7);
    EXPECT_LE(alive, 8);
    EXPECT_LE(mServer.descriptors(), 32U);
}

TEST_F(HostileClientTest, DaemonWithoutDescriptorsSaysSoAndEnds) {
    startDaemon(mServer, "ulimit -n 12");
    EXPECT_TRUE(eventually([&] { return !mServer.isAlive(); }));
    EXPECT_NE(log().find("too few descriptors to serve: the limit is 12, at least 16"),
              std::string::npos)
            << log();
}

/** Sends a request along with a descriptor. @return whether the kernel took it. */
bool sendWithDescriptor(const RawClient& client, const Packet& packet, int descriptor) {
    iovec place{const_cast<uint8_t*>(packet.bytes), packet.size};
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

TEST_F(HostileClientTest, DescriptorsDoNotReachTheDaemon) {
    constexpr int kPassRights = 83;
    int value = 0;
    socklen_t size = sizeof(value);
    const int probe = socket(AF_UNIX, SOCK_SEQPACKET | SOCK_CLOEXEC, 0);
    const bool isKnown = getsockopt(probe, SOL_SOCKET, kPassRights, &value, &size) == 0;
    close(probe);
    if (!isKnown) GTEST_SKIP() << "this kernel cannot keep descriptors away";
    serve();
    const RawClient client = rawClient();
    EXPECT_TRUE(client.answersPing());
    EXPECT_FALSE(sendWithDescriptor(client, *request(kBase, kPing), STDOUT_FILENO));
    EXPECT_EQ(errno, EPERM);
    EXPECT_TRUE(answers());
}

TEST_F(HostileClientTest, CallerIsWhoSendsTheMessage) {
    needRoot();
    serve();
    constexpr uint32_t kRefused = 1;
    constexpr uint32_t kBadValue = 2;
    const auto packet = request(kV20, kDaxSetAmplitude, {0});
    // A root's connection in a user's hands, and the other way round.
    const RawClient rootsOwn = rawClient();
    EXPECT_EQ(rootsOwn.call(*packet).word(1), kBadValue) << "the gate lets root pass";
    EXPECT_EQ(runAs(2000, [&] { return rootsOwn.call(*packet).word(1) == kRefused ? 0 : 1; }), 0);
    EXPECT_EQ(rootsOwn.call(*packet).word(1), kBadValue);
    EXPECT_NE(log().find("Pemission denied (2000)"), std::string::npos);
}

TEST_F(HostileClientTest, EveryUserHasItsTurnAndItsCallsKeepTheirOrder) {
    serve();
    const bool isRoot = geteuid() == 0;
    std::vector<RawClient> clients;
    for (int i = 0; i < 41; ++i) {
        const bool isDone = !isRoot || seteuid(i < 40 ? 2000 : 2001) == 0;
        clients.push_back(rawClient());
        ASSERT_TRUE(isDone && (!isRoot || seteuid(0) == 0));
    }
    for (const RawClient& client : clients)
        EXPECT_TRUE(client.answersPing());
    stopServer();
    for (uint32_t i = 0; i < clients.size(); ++i)
        EXPECT_TRUE(clients[i].send(*request(kV10, kOn, {1000 + i})));
    ::kill(mServer.pid(), SIGCONT);
    for (const RawClient& client : clients)
        EXPECT_EQ(client.receive().status, 0);

    std::vector<int> order;
    const std::string text = log();
    for (size_t at = 0; (at = text.find(" val:10", at)) != std::string::npos; ++at)
        order.push_back(std::stoi(text.substr(at + 5)));
    ASSERT_EQ(order.size(), 41U);
    const auto polite = std::find(order.begin(), order.end(), 1040);
    if (isRoot) {
        EXPECT_LE(polite - order.begin(), 1) << "40 connections count no more than one";
        order.erase(polite);
    }
    EXPECT_TRUE(std::is_sorted(order.begin(), order.end()));
}

TEST_F(HostileClientTest, LogThatNobodyReadsHoldsNobodyUp) {
    int pipe[2];
    ASSERT_EQ(pipe2(pipe, O_CLOEXEC), 0);
    const int terminal = posix_openpt(O_RDWR | O_NOCTTY | O_CLOEXEC);
    ASSERT_EQ(grantpt(terminal) + unlockpt(terminal), 0);
    const std::string self = "/proc/" + std::to_string(getpid()) + "/fd/";
    for (const std::string& log :
         {self + std::to_string(pipe[1]), std::string(ptsname(terminal))}) {
        SCOPED_TRACE(log);
        startDaemon(mServer, "exec 2>" + log);
        ASSERT_TRUE(eventually(answers));
        const RawClient client = rawClient();
        for (int i = 0; i < 2000; ++i)
            ASSERT_EQ(client.call(*request(kV10, kOn, {1})).status, 0);
        mServer.kill();
    }
    for (const int descriptor : {pipe[0], pipe[1], terminal})
        close(descriptor);
}

}  // namespace
