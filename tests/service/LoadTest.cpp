// SPDX-License-Identifier: Apache-2.0
#include "support/LogCapture.h"
#include "support/ServiceTest.h"

#include <sys/socket.h>
#include <sys/un.h>
#include <sys/wait.h>
#include <unistd.h>

#include <algorithm>
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
using Clock = std::chrono::steady_clock;

constexpr uint32_t kClients = 64;
constexpr uint32_t kKilled = kClients / 3;
constexpr uint32_t kHostile = 5;
constexpr uint32_t kSurvivors = kClients - kKilled - kHostile;
constexpr uint32_t kCalls = 100'000;
constexpr uint32_t kCallsEach = kCalls / kSurvivors + 1;

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
[[noreturn]] void behaveBadly(const std::string& socketPath, unsigned number) {
    std::mt19937 random(number);
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

/** The writes of a call of each kind, one after the other; # stands for a number. */
const std::vector<std::vector<std::string>> kCallsInTheTrace = {
        {"state write \"1\\n\"", "duration write \"#\\n\"", "activate write \"1\\n\""},
        {"cp_trigger_index write \"65534\\n\"", "cp_trigger_queue write \"#.50, 10, 0~\\0\"",
         "state write \"1\\n\"", "duration write \"1000\\n\"", "activate write \"1\\n\""},
        {"intensity write \"#\\n\""},
        {"motor_type read 31 = 12 \"LINEAR_1040\\n\"", "cp_trigger_index"},
};

/** @return whether a line of the trace is of a pattern; then also the number in place of the #. */
bool matches(const std::string& line, const std::string& pattern, uint32_t* number) {
    const size_t mark = pattern.find('#');
    const std::string start = pattern.substr(0, mark);
    if (line.compare(0, start.size(), start) != 0) return false;
    if (mark == std::string::npos) return true;
    char* end = nullptr;
    *number = static_cast<uint32_t>(strtoul(line.c_str() + mark, &end, 10));
    const std::string rest = pattern.substr(mark + 1);
    return end != line.c_str() + mark && rest.compare(0, rest.size(), end, rest.size()) == 0;
}

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

    /** @return the accesses in the trace: the transfer of each or, of a probe, the node. */
    Lines accesses() const {
        Lines lines;
        std::ifstream trace(mDirectory.path() + "/trace");
        std::string pending;
        for (std::string line; std::getline(trace, line);) {
            line.erase(0, line.find("leds/") + 5);
            const std::string leaf = line.substr(0, line.find(' '));
            const bool opens = line.find(" open ") != std::string::npos;
            // Nothing of another node may come between an open and its close.
            EXPECT_EQ(opens, pending.empty()) << line;
            EXPECT_TRUE(opens || pending.compare(0, leaf.size(), leaf) == 0) << line;
            if (line.find(" close ") == std::string::npos) {
                pending = opens ? leaf : line;
            } else {
                lines.push_back(pending);
                pending.clear();
            }
        }
        return lines;
    }

    /** Goes through the trace: whole calls only, and the calls of each client in their order. */
    void checkTrace() const {
        const Lines lines = accesses();
        std::map<uint32_t, uint32_t> last;
        for (size_t at = 0; at < lines.size();) {
            uint32_t number = 0;
            const auto isHere = [&](const std::vector<std::string>& call) {
                for (size_t i = 0; i < call.size(); ++i) {
                    if (at + i >= lines.size() || !matches(lines[at + i], call[i], &number)) {
                        return false;
                    }
                }
                return true;
            };
            const auto call =
                    std::find_if(kCallsInTheTrace.begin(), kCallsInTheTrace.end(), isHere);
            ASSERT_NE(call, kCallsInTheTrace.end()) << "no whole call: " << lines[at];
            at += call->size();
            if (number < 1'000'000) continue;
            ASSERT_GT(number, last[number / 10'000'000]);
            last[number / 10'000'000] = number;
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
    start();
    EXPECT_TRUE(vibrator->off().isDeadObject()) << "a dead object stays dead";
    EXPECT_EQ(Status(IDaxVibrator::getService()->on(5)), Status::OK);
}

}  // namespace
