// SPDX-License-Identifier: Apache-2.0
#include "transport/Message.h"
#include "transport/TransactionCodes.h"
#include "transport/TransportTest.h"

#include <sys/socket.h>
#include <sys/un.h>
#include <utils/Errors.h>

#include <cerrno>
#include <cstring>
#include <optional>

namespace {

using namespace ::android::hardware::details;

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
    bool send(const void* bytes, size_t size, int flags = 0) const {
        return ::send(mSocket, bytes, size, flags | MSG_NOSIGNAL) == static_cast<ssize_t>(size);
    }
    bool send(const Message& message) const { return send(message.data, message.size); }

    /** @return the status that a reply begins with; nothing when the connection has ended. */
    std::optional<int32_t> reply() const {
        Message message;
        const ssize_t size = recv(mSocket, message.data, kMaxMessageSize, 0);
        // Reset: closed by the server with a request still unread.
        if (size < 0 && errno != ECONNRESET) ADD_FAILURE() << "no reply: " << strerror(errno);
        if (size <= 0) return std::nullopt;
        int32_t status = 0;
        memcpy(&status, message.data, sizeof(status));
        return status;
    }

  private:
    int mSocket;
    bool mConnected;
};

template <typename... Arguments>
void makeRequest(Message& message, const char* descriptor, uint32_t code,
                 const Arguments&... arguments) {
    Writer writer(message);
    writer.put(code);
    writer.put(std::string_view(descriptor));
    (writer.put(arguments), ...);
}

constexpr char kV10[] = "android.hardware.vibrator@1.0::IVibrator";
constexpr char kV20[] = "vendor.velmora.hardware.vibrator@2.0::IDaxVibrator";
constexpr char kBase[] = "android.hidl.base@1.0::IBase";

class HostileClientTest : public TransportTest {
  protected:
    RawClient rawClient() const { return RawClient(mDirectory.path()); }
};

TEST_F(HostileClientTest, NonsenseIsAnsweredWithAnError) {
    serve();
    const RawClient client = rawClient();
    ASSERT_TRUE(client.isConnected());
    const auto answer = [&](const Message& message) {
        EXPECT_TRUE(client.send(message));
        return client.reply().value_or(1);
    };
    Message message;

    // No operation of that number, or not of that interface, or no such interface.
    const std::pair<const char*, uint32_t> unknown[] = {
            {kV10, 0},
            {kV10, 6},
            {kV10, kDaxSetAmplitude},
            {kV10, 0xffffffff},
            {kV20, kOn},
            {kV20, 25},
            {kBase, kOn},
            {kV10, kPing},
            {"no.such@1.0::I", 1},
            {"", 1},
            {"vendor.velmora.hardware.vibrator@2.1::IDaxVibratorX", 1}};
    for (const auto& [descriptor, code] : unknown) {
        makeRequest(message, descriptor, code);
        EXPECT_EQ(answer(message), android::UNKNOWN_TRANSACTION) << descriptor << ' ' << code;
    }

    // Arguments that are not the operation's.
    makeRequest(message, kV10, kOn);
    EXPECT_EQ(answer(message), android::BAD_TYPE) << "none";
    makeRequest(message, kV10, kOn, uint32_t{1}, uint32_t{2});
    EXPECT_EQ(answer(message), android::BAD_TYPE) << "one too many";
    makeRequest(message, "android.hardware.vibrator@1.3::IVibrator", kSetExternalControl,
                uint32_t{2});
    EXPECT_EQ(answer(message), android::BAD_TYPE) << "no bool";
    for (const uint32_t count : {1U, 0x10000000U, 0x20000000U, 0xffffffffU}) {
        // A list that says it is longer than the message.
        makeRequest(message, kV20, kDaxPerformHapticEngine, count, uint32_t{1});
        EXPECT_EQ(answer(message), android::BAD_TYPE) << count;
        makeRequest(message, kBase, kDebug, uint8_t{0}, count);
        EXPECT_EQ(answer(message), android::BAD_TYPE) << count;
    }

    // Half a message, cut at every byte.
    makeRequest(message, kV20, kDaxSetAmplitude, uint32_t{10});
    const size_t whole = message.size;
    for (size_t size = 1; size < whole; ++size) {
        ASSERT_TRUE(client.send(message.data, size));
        EXPECT_NE(client.reply().value_or(0), android::OK) << size;
    }
    // After all that the same connection still serves.
    EXPECT_EQ(answer(message), android::OK);
}

TEST_F(HostileClientTest, MessageWithoutMeasureCostsTheConnection) {
    serve();
    const std::string large(kMaxMessageSize + 1, '\xff');
    const std::string whole(kMaxMessageSize, '\xff');
    const RawClient first = rawClient();
    ASSERT_TRUE(first.send(large.data(), large.size()));
    EXPECT_EQ(first.reply(), std::nullopt);
    const RawClient second = rawClient();
    ASSERT_TRUE(second.send(whole.data(), whole.size()));
    EXPECT_EQ(second.reply(), android::UNKNOWN_TRANSACTION);
    const RawClient third = rawClient();
    ASSERT_TRUE(third.send("", 0));
    EXPECT_EQ(third.reply(), std::nullopt);
    EXPECT_TRUE(answers());
}

TEST_F(HostileClientTest, ClientsThatVanishLeaveNothingBehind) {
    serve();
    const size_t before = mServer.descriptors();
    Message message;
    makeRequest(message, kBase, kPing);
    for (int i = 0; i < 300; ++i) {
        const RawClient client = rawClient();
        ASSERT_TRUE(client.isConnected());
        ASSERT_TRUE(client.send(message));
        if (i % 2 == 0) client.reply();
    }
    EXPECT_TRUE(eventually([&] { return mServer.descriptors() == before; }));
    EXPECT_TRUE(answers());
}

TEST_F(HostileClientTest, ClientThatNeverReadsIsDropped) {
    serve();
    const RawClient client = rawClient();
    Message message;
    makeRequest(message, kBase, kInterfaceChain);
    bool dropped = false;
    for (int i = 0; i < 1'000'000 && !dropped; ++i) {
        dropped = !client.send(message.data, message.size, MSG_DONTWAIT) && errno == EPIPE;
    }
    EXPECT_TRUE(dropped);
    EXPECT_TRUE(answers());
}

TEST_F(HostileClientTest, OneUidCannotTakeEveryConnection) {
    if (geteuid() != 0) GTEST_SKIP() << "only root can become somebody else";
    serve();
    const std::string directory = mDirectory.path();
    const int kept = runAs(2000, [&] {
        std::vector<RawClient> clients;
        for (int i = 0; i < 900; ++i)
            clients.emplace_back(directory);
        // Those that the server keeps answer; the others find their connection closed.
        Message message;
        makeRequest(message, kBase, kPing);
        int alive = 0;
        for (const RawClient& client : clients) {
            if (client.send(message) && client.reply() == android::OK) ++alive;
        }
        // While all of them are open, others still get in.
        const bool othersServed = runAs(2000, [&] { return answers() ? 0 : 1; }) == 1;
        return othersServed ? alive : 0;
    });
    EXPECT_EQ(kept, 128);
    EXPECT_TRUE(answers());
    std::vector<RawClient> own;
    for (int i = 0; i < 200; ++i)
        own.push_back(rawClient());
    EXPECT_EQ(runAs(1000, [] { return answers() ? 0 : 1; }), 0);
}

TEST_F(HostileClientTest, FewDescriptorsAreKeptForTheObjects) {
    serve("default", 64);
    std::vector<RawClient> clients;
    for (int i = 0; i < 100; ++i)
        clients.push_back(rawClient());
    Message message;
    makeRequest(message, kBase, kPing);
    int alive = 0;
    for (const RawClient& client : clients) {
        if (client.send(message) && client.reply() == android::OK) ++alive;
    }
    EXPECT_EQ(alive, 8);
    EXPECT_LE(mServer.descriptors(), 32U);
}

TEST_F(HostileClientTest, AnswerThatIsTooLargeIsAnError) {
    Message message;
    Writer writer(message);
    writer.put(::android::hardware::hidl_vec<uint32_t>(
            std::vector<uint32_t>(kMaxMessageSize / 4 - 2)));
    EXPECT_TRUE(writer.fits());
    EXPECT_EQ(message.size, kMaxMessageSize);
    writer.put(uint32_t{1});
    EXPECT_FALSE(writer.fits());
    EXPECT_EQ(message.size, kMaxMessageSize);
}

}  // namespace
