// SPDX-License-Identifier: Apache-2.0
#include "support/TransportTest.h"
#include "transport/RawClient.h"

#include <algorithm>
#include <filesystem>
#include <random>

// Real requests, damaged at random, from several clients at once. What is sent depends only on the
// seed, not on what the daemon does.

namespace {

using namespace raw;
using ::android::hardware::Packet;

constexpr unsigned kSeed = 26;

/** @return the requests that the fuzzer begins with, those with lists last. */
std::vector<std::string> rightRequests() {
    std::vector<std::string> requests;
    for (const auto& file :
         std::filesystem::directory_iterator(SOURCE_DIRECTORY "/fuzz/seeds/transactions")) {
        const std::string bytes = readFile(file.path());
        // The first byte tells a request from a reply.
        if (bytes[0] % 2 == 0) requests.push_back(bytes.substr(1));
    }
    std::sort(requests.begin(), requests.end(), [](const auto& one, const auto& other) {
        return std::pair(one.size(), one) < std::pair(other.size(), other);
    });
    return requests;
}

/** @return a word of a message; 0 if it ends before. */
uint32_t wordOf(const std::string& bytes, size_t word) {
    uint32_t value = 0;
    if (word < bytes.size() / 4) memcpy(&value, &bytes[4 * word], sizeof(value));
    return value;
}

void damage(std::string& bytes, std::mt19937& random) {
    const auto below = [&](size_t end) { return random() % end; };
    const uint32_t numbers[] = {static_cast<uint32_t>(random()), 1, 2, 4, 8, ~0U, ~3U, INT32_MAX};
    const size_t offsets = 4 + (size_t{wordOf(bytes, 2)} + 7) / 8 * 2;
    const size_t arguments = bytes.find('\0', sizeof(Packet::Header)) / 4 + 1;
    // In the arguments, in the header, in the list of objects, or anywhere.
    const size_t words[] = {arguments + below(24), below(4), offsets + below(6), below(64)};
    const size_t kind = below(8);
    const size_t word = words[kind % 4];
    if (kind < 5) {
        const uint32_t sum = wordOf(bytes, word) + numbers[below(std::size(numbers))];
        if (word < bytes.size() / 4) memcpy(&bytes[4 * word], &sum, sizeof(sum));
    } else if (kind == 5) {
        bytes.resize(below(bytes.size() + 1));
    } else if (kind == 6) {
        bytes.append(below(20) == 0 ? Packet::kMaxSize : below(64), '\1');
    } else if (!bytes.empty()) {
        bytes[below(bytes.size())] ^= static_cast<char>(1 << below(8));
    }
}

class RandomMessagesTest : public TransportTest {
  protected:
    /** Sends a message, and expects what must come of it; connects anew if it is the end. */
    int32_t send(std::unique_ptr<RawClient>& client, const std::string& bytes) const {
        const bool isEnd = bytes.empty() || bytes.size() > Packet::kMaxSize;
        const bool isOneway = !isEnd && (wordOf(bytes, 1) & TF_ONE_WAY) != 0;
        EXPECT_TRUE(client->send(bytes.data(), bytes.size()));
        // If there is no answer, the next is that of the ping, which is never a mere status.
        EXPECT_TRUE(!isOneway || client->send(request(kBase, kPing)));
        const Received answer = client->receive();
        EXPECT_EQ(answer.isClosed, isEnd);
        EXPECT_TRUE(!isOneway || answer.status == 0 || client->receive().status == 0);
        if (isEnd) client = std::make_unique<RawClient>(mDirectory.path());
        return answer.status;
    }
    void sendDamaged(unsigned seed, size_t count) const {
        std::mt19937 random(seed);
        const std::vector<std::string> right = rightRequests();
        const auto any = [&] { return random() % right.size(); };
        auto client = std::make_unique<RawClient>(mDirectory.path());
        for (size_t i = 0; i < count; ++i) {
            // Most often one with lists, where there is most to damage.
            std::string bytes = right[std::max({any(), any(), any()})];
            for (size_t times = 1 + random() % 2; times > 0; --times)
                damage(bytes, random);
            // Some in two pieces.
            const size_t end = random() % 8 == 0 ? random() % (bytes.size() + 1) : bytes.size();
            send(client, bytes.substr(0, end));
            if (end < bytes.size()) send(client, bytes.substr(end));
            ASSERT_FALSE(HasFailure()) << "up to message " << i << " of seed " << seed;
        }
    }
};

TEST_F(RandomMessagesTest, AreAnsweredAndHarmNobody) {
    const char* number = getenv("VIBRATOR_RANDOM_MESSAGES");
    const size_t count = number == nullptr ? 20'000 : std::stoul(number);
    serve("export ANDROID_LOG_TAGS='*:S'");
    auto client = std::make_unique<RawClient>(mDirectory.path());
    size_t understood = 0;
    for (const std::string& bytes : rightRequests())
        understood += send(client, bytes) == android::OK ? 1 : 0;
    EXPECT_GT(understood, 25U);
    sendDamaged(kSeed, 1000);
    [[maybe_unused]] const size_t memory = mServer.residentKiB();

    const auto polite = IDaxVibrator::getService();
    runBeside(
            3, [&](unsigned i) { sendDamaged(kSeed + 1 + i, count / 3); },
            [&] { EXPECT_EQ(call(*polite).inWords(), "(UNSUPPORTED_OPERATION, 0)"); });
    EXPECT_TRUE(answers());
#ifndef SANITIZED  // a sanitizer keeps what has been freed
    EXPECT_LE(mServer.residentKiB(), memory + 256);
#endif
}

}  // namespace
