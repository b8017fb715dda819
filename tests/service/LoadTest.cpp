// SPDX-License-Identifier: Apache-2.0
#include "support/ServiceTest.h"

#include <sys/socket.h>
#include <sys/un.h>
#include <sys/wait.h>
#include <unistd.h>

#include <chrono>
#include <csignal>
#include <cstring>
#include <fstream>
#include <iostream>
#include <map>
#include <random>
#include <sstream>
#include <thread>

namespace {

using ::android::hardware::hidl_vec;
using Status = ::android::hardware::vibrator::V1_0::Status;
using ::vendor::velmora::hardware::vibrator::V2_1::DaxAmplitudeType;
using ::vendor::velmora::hardware::vibrator::V2_1::IDaxVibrator;
using Clock = std::chrono::steady_clock;

constexpr uint32_t kClients = 64;
constexpr uint32_t kKilled = kClients / 3;
constexpr uint32_t kHostile = 5;
constexpr uint32_t kSurvivors = kClients - kKilled - kHostile;
constexpr uint32_t kCalls = 100'000;
constexpr uint32_t kCallsEach = kCalls / kSurvivors + 1;

const std::string kDirectory = "leds/";

/** A number that no other call has, and that grows from call to call of a client. */
uint32_t markOf(uint32_t client, uint32_t call) {
    return 1'000'000 + client * 10'000'000 + call;
}

/** Makes the client's next call. @return whether the answer was the right one. */
bool makeCall(IDaxVibrator& vibrator, bool permitted, uint32_t client, uint32_t call) {
    const uint32_t mark = markOf(client, call);
    const Status done = permitted ? Status::OK : Status::UNKNOWN_ERROR;
    switch (call % 4) {
        case 0: {
            const auto result = vibrator.on(mark);
            return result.isOk() && result == Status::OK;
        }
        case 1: {
            const auto result = vibrator.daxPerformPrebakedHapticPattern(mark, 5050, true);
            return result.isOk() && result == done;
        }
        case 2: {
            const uint32_t amplitude = call % 20'001;
            const bool isValid = amplitude >= 1 && amplitude <= 10'000;
            const auto result = vibrator.daxSetAmplitude(amplitude);
            return result.isOk() && result == (permitted && !isValid ? Status::BAD_VALUE : done);
        }
        default: {
            bool right = false;
            const auto take = [&](bool supported, const hidl_vec<uint32_t>& list) {
                right = supported == permitted && list.size() == (permitted ? 6U : 0U) &&
                        (!permitted || list[1] == 3000);
            };
            return vibrator.daxGetAmplitudeList(DaxAmplitudeType::TYPE_0, take).isOk() && right;
        }
    }
}

/** Sends nonsense, reads no reply, and comes again when it is thrown out. */
[[noreturn]] void behaveBadly(const std::string& socketPath, unsigned seed) {
    std::mt19937 random(seed);
    sockaddr_un address{};
    address.sun_family = AF_UNIX;
    memcpy(address.sun_path, socketPath.c_str(), socketPath.size());
    for (;;) {
        const int client = socket(AF_UNIX, SOCK_SEQPACKET, 0);
        if (connect(client, reinterpret_cast<sockaddr*>(&address), sizeof(address)) == 0) {
            std::string bytes(random() % 300, '\0');
            for (char& byte : bytes)
                byte = static_cast<char>(random());
            for (auto i = random() % 50; i > 0; --i)
                send(client, bytes.data(), bytes.size(), MSG_NOSIGNAL | MSG_DONTWAIT);
        }
        close(client);
        usleep(500);
    }
}

/** A line of the trace, without its time. */
using Block = std::vector<std::string>;

Block writing(const std::string& leaf, const std::string& text, size_t size) {
    return {kDirectory + leaf + " open O_RDWR = 0",
            kDirectory + leaf + " write \"" + text + "\" = " + std::to_string(size),
            kDirectory + leaf + " close = 0"};
}

Block operator+(Block first, const Block& second) {
    first.insert(first.end(), second.begin(), second.end());
    return first;
}

Block switchingOn(const std::string& ms) {
    return writing("state", "1\\n", 2) + writing("duration", ms + "\\n", ms.size() + 1) +
           writing("activate", "1\\n", 2);
}

/** Reads a trace call by call. */
class TraceReader {
  public:
    explicit TraceReader(const std::string& file) : mFile(file) { next(); }

    bool atEnd() const { return mLine.empty(); }
    const std::string& line() const { return mLine; }
    /** @return the decimal number in the line that follows some lines after this one. */
    static std::string numberIn(const std::string& line) {
        const size_t start = line.find('"') + 1;
        return line.substr(start, line.find_first_not_of("0123456789", start) - start);
    }
    /** Takes a line, which must be there. */
    std::string take() {
        std::string taken = mLine;
        next();
        return taken;
    }
    void expect(const Block& block) {
        for (const std::string& line : block) {
            ASSERT_EQ(mLine, line);
            next();
        }
    }

  private:
    void next() {
        if (!std::getline(mFile, mLine)) mLine.clear();
        mLine.erase(0, mLine.find(' ') + 1);
    }

    std::ifstream mFile;
    std::string mLine;
};

class LoadTest : public ServiceTest {
  protected:
    size_t residentKiB() const {
        std::istringstream sizes(readFile("/proc/" + std::to_string(mService.pid()) + "/statm"));
        size_t all = 0;
        size_t resident = 0;
        sizes >> all >> resident;
        return resident * static_cast<size_t>(getpagesize()) / 1024;
    }

    /** Starts a process, as one of several users. */
    template <typename Function>
    pid_t spawn(uint32_t client, Function function) {
        const uid_t uids[] = {0, 1000, 2000, 10123};
        const uid_t uid = geteuid() == 0 ? uids[client % 4] : geteuid();
        const pid_t pid = fork();
        if (pid == 0) {
            if (uid != geteuid() && setuid(uid) != 0) _exit(2);
            function(uid == 0 || uid == 1000);
            _exit(0);
        }
        return pid;
    }

    /** Goes through the trace: whole calls only, and the calls of each client in their order. */
    void checkTrace() {
        std::map<uint32_t, uint32_t> last;
        const auto comesInOrder = [&](const std::string& number) {
            const auto mark = static_cast<uint32_t>(std::stoul(number));
            ASSERT_GT(mark, last[mark / 10'000'000]);
            last[mark / 10'000'000] = mark;
        };
        const std::string reading = kDirectory + "motor_type open O_RDWR = 0";
        TraceReader trace(mDirectory.path() + "/trace");
        while (!trace.atEnd() && !HasFatalFailure()) {
            if (trace.line() == reading) {
                trace.expect({reading, kDirectory + "motor_type read 31 = 12 \"LINEAR_1040\\n\"",
                              kDirectory + "motor_type close = 0",
                              kDirectory + "cp_trigger_index open O_RDWR = 0",
                              kDirectory + "cp_trigger_index close = 0"});
            } else if (trace.line() == kDirectory + "intensity open O_RDWR = 0") {
                trace.take();
                const std::string amplitude = TraceReader::numberIn(trace.line());
                trace.expect({kDirectory + "intensity write \"" + amplitude +
                                      "\\n\" = " + std::to_string(amplitude.size() + 1),
                              kDirectory + "intensity close = 0"});
            } else if (trace.line() == kDirectory + "cp_trigger_index open O_RDWR = 0") {
                trace.expect(writing("cp_trigger_index", "65534\\n", 6));
                trace.take();
                const std::string mark = TraceReader::numberIn(trace.line());
                comesInOrder(mark);
                trace.expect({kDirectory + "cp_trigger_queue write \"" + mark +
                                      ".50, 10, 0~\\0\" = " + std::to_string(mark.size() + 12),
                              kDirectory + "cp_trigger_queue close = 0"});
                trace.expect(switchingOn("1000"));
            } else {
                trace.expect(writing("state", "1\\n", 2));
                trace.take();
                const std::string mark = TraceReader::numberIn(trace.line());
                comesInOrder(mark);
                const Block whole = switchingOn(mark);
                trace.expect({whole.begin() + 4, whole.end()});
            }
        }
        EXPECT_GE(last.size(), size_t{kSurvivors});
    }
};

TEST_F(LoadTest, ManyClientsGetTheirOwnAnswersInTheirOwnOrder) {
    createDriver();
    start({"ANDROID_LOG_TAGS=*:S"});
    const std::string socketPath =
            socketDirectory() + "/vendor.velmora.hardware.vibrator@2.1::IDaxVibrator.default";
    {
        const auto vibrator = IDaxVibrator::getService();
        for (uint32_t call = 0; call < 1000; ++call)
            ASSERT_TRUE(makeCall(*vibrator, true, 0, call));
    }
    const size_t descriptors = mService.descriptors();
    const size_t memory = residentKiB();
    std::ofstream(mDirectory.path() + "/trace", std::ios::trunc).flush();

    const auto begin = Clock::now();
    std::vector<pid_t> survivors;
    std::vector<pid_t> doomed;
    for (uint32_t client = 1; client <= kSurvivors; ++client) {
        survivors.push_back(spawn(client, [client](bool permitted) {
            const auto vibrator = IDaxVibrator::getService();
            for (uint32_t call = 1; call <= kCallsEach; ++call) {
                if (!makeCall(*vibrator, permitted, client, call)) _exit(1);
            }
        }));
    }
    for (uint32_t client = kSurvivors + 1; client <= kSurvivors + kKilled; ++client) {
        doomed.push_back(spawn(client, [client](bool permitted) {
            const auto vibrator = IDaxVibrator::getService();
            for (uint32_t call = 1;; ++call)
                makeCall(*vibrator, permitted, client, call);
        }));
    }
    for (uint32_t client = 0; client < kHostile; ++client) {
        doomed.push_back(spawn(client, [&](bool) { behaveBadly(socketPath, client); }));
    }

    // The doomed die one after the other, at moments that nobody has chosen.
    std::mt19937 random(std::random_device{}());
    for (const pid_t pid : doomed) {
        std::this_thread::sleep_for(std::chrono::microseconds(random() % 100'000));
        kill(pid, SIGKILL);
        waitpid(pid, nullptr, 0);
    }
    for (const pid_t pid : survivors) {
        int status = -1;
        waitpid(pid, &status, 0);
        EXPECT_EQ(status, 0) << "a call got another answer than its own";
    }
    const std::chrono::duration<double> time = Clock::now() - begin;
    std::cout << kSurvivors * kCallsEach << " calls of " << kSurvivors << " clients in "
              << time.count() << " s, beside " << kKilled << " killed and " << kHostile
              << " hostile ones\n";

    EXPECT_TRUE(eventually([&] { return mService.descriptors() <= descriptors; }));
    std::cout << "memory before: " << memory << " KiB, after: " << residentKiB() << " KiB\n";
#ifndef SANITIZED  // a sanitizer keeps what has been freed
    EXPECT_LE(residentKiB(), memory + 256);
#endif
    checkTrace();
}

TEST_F(LoadTest, KilledDaemonIsNoticedAtOnceAndReplaced) {
    createDriver();
    start();
    const auto vibrator = IDaxVibrator::getService();
    EXPECT_EQ(Status(vibrator->on(5)), Status::OK);
    // Interrupted for ever, the call is under way when the daemon dies.
    runProgram({VIBRATOR_SIM, "fault", "state", "write", "EINTR"});
    Clock::time_point killed;
    std::thread killer([&] {
        std::this_thread::sleep_for(std::chrono::milliseconds(200));
        killed = Clock::now();
        kill(mService.pid(), SIGKILL);
    });
    const auto result = vibrator->on(5);
    const auto noticed = Clock::now();
    killer.join();
    EXPECT_TRUE(result.isDeadObject());
    EXPECT_LT(noticed - killed, std::chrono::milliseconds(500));
    EXPECT_TRUE(vibrator->off().isDeadObject());

    mService.kill();
    createDriver();
    runProgram({VIBRATOR_SIM, "fault", "state", "write", "none"});
    start();
    EXPECT_TRUE(vibrator->off().isDeadObject()) << "a dead object stays dead";
    EXPECT_EQ(Status(IDaxVibrator::getService()->on(5)), Status::OK);
}

}  // namespace
