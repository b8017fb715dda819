// SPDX-License-Identifier: Apache-2.0
#include "transport/RawClient.h"
#include "transport/TransportTest.h"

#include <algorithm>
#include <atomic>
#include <iostream>
#include <random>
#include <thread>

// Real requests, damaged at random, from several clients at once. What is sent depends only on the
// seed, not on what the daemon does.

namespace {

using namespace raw;
using ::android::hardware::Packet;

constexpr unsigned kSeed = 26;
constexpr unsigned kClients = 3;

/** @return IBase's operation with a list of texts. */
std::unique_ptr<Packet> debugRequest() {
    RawMessage message = RawMessage::to(kBase);
    // No descriptors.
    message.head += bytesOf(uint64_t{0});
    message.addList(1, bytesOf(uint64_t{0}) + bytesOf(uint64_t{4}));
    message.add(std::string("text\0", 5), true, 1);
    return message.packet(kDebug);
}

std::unique_ptr<Packet> hapticEngineRequest() {
    RawMessage message = RawMessage::to(kV20);
    message.addList(3, std::string(48, '\1'));
    message.tail = bytesOf(10000);
    return message.packet(kDaxPerformHapticEngine);
}

/** @return a right request for each operation that the daemon has, and for some of every object. */
std::vector<std::string> rightRequests() {
    std::vector<std::unique_ptr<Packet>> packets;
    packets.push_back(request(kBase, kPing));
    packets.push_back(request(kBase, kInterfaceChain));
    packets.push_back(debugRequest());
    for (uint32_t code = kOn; code <= 5; ++code)
        packets.push_back(request(kV10, code, {1, 1}));
    for (uint32_t code = 11; code < kDaxPerformHapticEngine; ++code)
        packets.push_back(request(kV20, code, {1}));
    packets.push_back(hapticEngineRequest());
    packets.push_back(request(kV20, 24, {1, 5000, 1}));
    packets.push_back(request(kV21, 25, {0}));
    std::vector<std::string> requests;
    for (const auto& packet : packets)
        requests.emplace_back(reinterpret_cast<const char*>(packet->bytes), packet->size);
    return requests;
}

/** @return a word of a message; 0 if it ends before. */
uint32_t wordOf(const std::string& bytes, size_t word) {
    uint32_t value = 0;
    if (4 * (word + 1) <= bytes.size()) memcpy(&value, &bytes[4 * word], sizeof(value));
    return value;
}

/** A sequence of damaged requests. */
class Damaged {
  public:
    explicit Damaged(unsigned seed) : mRandom(seed) {}

    std::string next() {
        if (!mRest.empty()) return std::exchange(mRest, {});
        std::string bytes = mRight[below(mRight.size())];
        for (size_t i = 1 + below(3); i > 0; --i)
            damage(bytes);
        if (below(8) == 0) {
            // In two pieces.
            const size_t end = below(bytes.size() + 1);
            mRest = bytes.substr(end);
            bytes.resize(end);
        }
        return bytes;
    }

  private:
    size_t below(size_t end) { return mRandom() % end; }
    void damage(std::string& bytes) {
        const size_t offsetsAt = 4 + (size_t{wordOf(bytes, 2)} + 7) / 8 * 2;
        switch (below(8)) {
            case 0:
                return add(bytes, 0, static_cast<uint32_t>(below(26)));
            case 1:
                return add(bytes, 1, TF_ONE_WAY);
            // The sizes in its header.
            case 2:
                return add(bytes, 2 + below(2), someNumber());
            case 3:
                return add(bytes, offsetsAt + below(6), someNumber());
            case 4:
                return add(bytes, below(bytes.size() / 4 + 1), someNumber());
            case 5:
                return bytes.resize(below(bytes.size() + 1));
            case 6:
                bytes.append(below(20) == 0 ? Packet::kMaxSize : below(64),
                             static_cast<char>(mRandom()));
                return;
            default:
                if (!bytes.empty()) bytes[below(bytes.size())] ^= static_cast<char>(1 << below(8));
        }
    }
    /** @return what a size, an offset or a code may be wrong by. */
    uint32_t someNumber() {
        const auto any = static_cast<uint32_t>(mRandom());
        const uint32_t numbers[] = {any, any % 128, 8, UINT32_MAX, INT32_MAX};
        return numbers[below(std::size(numbers))];
    }
    static void add(std::string& bytes, size_t word, uint32_t number) {
        const uint32_t sum = wordOf(bytes, word) + number;
        if (4 * (word + 1) <= bytes.size()) memcpy(&bytes[4 * word], &sum, sizeof(sum));
    }

    std::mt19937 mRandom;
    const std::vector<std::string> mRight = rightRequests();
    std::string mRest;
};

/** What has come of the messages. */
struct Outcomes {
    std::atomic<size_t> done, failed, withoutAnswer, closed;
};

class RandomMessagesTest : public TransportTest {
  protected:
    /** Sends a message, and expects what must come of it. @return whether the connection lives. */
    static bool send(const RawClient& client, const std::string& bytes, Outcomes& outcomes) {
        EXPECT_TRUE(client.send(bytes.data(), bytes.size()));
        const bool isEnd = bytes.empty() || bytes.size() > Packet::kMaxSize;
        const bool isOneway = !isEnd && (wordOf(bytes, 1) & TF_ONE_WAY) != 0;
        // If there is no answer, the next is that of the ping, which is never a mere status.
        EXPECT_TRUE(!isOneway || client.send(request(kBase, kPing)));
        const Received answer = client.receive();
        EXPECT_EQ(answer.isClosed, isEnd);
        const bool isFailure = answer.status != 0;
        EXPECT_TRUE(!isOneway || !isFailure || client.receive().status == 0);
        ++(isEnd       ? outcomes.closed
           : isFailure ? outcomes.failed
           : isOneway  ? outcomes.withoutAnswer
                       : outcomes.done);
        return !isEnd;
    }
    void sendDamaged(unsigned seed, size_t count, Outcomes& outcomes) const {
        Damaged messages(seed);
        auto client = std::make_unique<RawClient>(mDirectory.path());
        for (size_t i = 0; i < count; ++i) {
            if (!send(*client, messages.next(), outcomes))
                client = std::make_unique<RawClient>(mDirectory.path());
            ASSERT_FALSE(HasFailure()) << "up to message " << i << " of seed " << seed;
        }
    }
};

TEST_F(RandomMessagesTest, AreAnsweredAndHarmNobody) {
    const char* number = getenv("VIBRATOR_RANDOM_MESSAGES");
    const size_t each = (number == nullptr ? 20'000 : std::stoul(number)) / kClients;
    serve("export ANDROID_LOG_TAGS='*:S'");
    Outcomes outcomes{};
    const RawClient right(mDirectory.path());
    for (const std::string& bytes : rightRequests())
        send(right, bytes, outcomes);
    EXPECT_EQ(outcomes.failed, 0U);
    sendDamaged(kSeed, 1000, outcomes);
    const size_t memory = mServer.residentKiB();

    std::atomic<unsigned> running = kClients;
    std::vector<std::thread> clients;
    for (unsigned i = 1; i <= kClients; ++i) {
        clients.emplace_back([&, i] {
            sendDamaged(kSeed + i, each, outcomes);
            --running;
        });
    }
    const auto polite = IDaxVibrator::getService();
    while (running > 0)
        EXPECT_EQ(call(*polite).inWords(), "(UNSUPPORTED_OPERATION, 0)");
    for (std::thread& client : clients)
        client.join();
    std::cout << outcomes.done << " done, " << outcomes.failed << " failed, "
              << outcomes.withoutAnswer << " without an answer, " << outcomes.closed
              << " closed; memory before: " << memory << " KiB, after: " << mServer.residentKiB()
              << " KiB\n";
#ifndef SANITIZED  // a sanitizer keeps what has been freed
    EXPECT_LE(mServer.residentKiB(), memory + 256);
#endif
}

}  // namespace
