// SPDX-License-Identifier: Apache-2.0

/**
 * How long a client that makes few calls waits for the answer while clients of other users send as
 * much as the daemon takes. Prints a row for each set of such flooders.
 */
#include "libhwbinder/Packet.h"
#include "support/Child.h"
#include "support/TemporaryDirectory.h"

#include <hwbinder/Parcel.h>
#include <poll.h>
#include <sys/socket.h>
#include <sys/un.h>
#include <vendor/velmora/hardware/vibrator/2.1/IDaxVibrator.h>

#include <algorithm>
#include <cerrno>
#include <chrono>
#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <memory>
#include <string>
#include <vector>

namespace {

using ::android::hardware::Packet;
using ::android::hardware::Parcel;
using std::chrono::steady_clock;
using ::vendor::velmora::hardware::vibrator::V2_1::IDaxVibrator;

constexpr uid_t kPoliteUid = 10123;
constexpr uid_t kFirstFlooder = 20000;
constexpr uint32_t kOff = 2;

void become(uid_t uid) {
    if (geteuid() == 0 && setuid(uid) != 0) abort();
}

/** A connection that always has requests waiting. */
class Flooder {
  public:
    explicit Flooder(const std::string& directory) {
        mAddress.sun_family = AF_UNIX;
        const std::string path = directory + "/" + IDaxVibrator::descriptor + ".default";
        if (path.size() >= sizeof(mAddress.sun_path)) abort();
        memcpy(mAddress.sun_path, path.c_str(), path.size());
        Parcel parcel;
        parcel.writeInterfaceToken("android.hardware.vibrator@1.0::IVibrator");
        mRequest->pack(kOff, 0, parcel);
        reconnect();
    }
    int socket() const { return mSocket; }
    /** Takes the replies that are there, and sends as many requests as there is room for. */
    void push() {
        char reply[256];
        ssize_t size = 0;
        while ((size = recv(mSocket, reply, sizeof(reply), MSG_DONTWAIT)) > 0) {
        }
        if (size == 0 || errno != EAGAIN) reconnect();
        for (int i = 0; i < kAtOnce; ++i) {
            if (send(mSocket, mRequest->bytes, mRequest->size, MSG_DONTWAIT | MSG_NOSIGNAL) < 0)
                return;
        }
    }

  private:
    static constexpr int kAtOnce = 64;

    void reconnect() {
        if (mSocket >= 0) close(mSocket);
        mSocket = ::socket(AF_UNIX, SOCK_SEQPACKET | SOCK_CLOEXEC, 0);
        if (connect(mSocket, reinterpret_cast<sockaddr*>(&mAddress), sizeof(mAddress)) != 0)
            usleep(1000);
    }

    sockaddr_un mAddress{};
    std::unique_ptr<Packet> mRequest{new Packet};
    int mSocket = -1;
};

[[noreturn]] void flood(const std::string& directory, uid_t uid, int connections) {
    become(uid);
    std::vector<Flooder> flooders;
    flooders.reserve(static_cast<size_t>(connections));
    for (int i = 0; i < connections; ++i)
        flooders.emplace_back(directory);
    for (;;) {
        std::vector<pollfd> waiting;
        for (Flooder& flooder : flooders) {
            flooder.push();
            waiting.push_back({flooder.socket(), POLLIN, 0});
        }
        poll(waiting.data(), waiting.size(), -1);
    }
}

/** Calls for some seconds. @return how long the answers took, in ms, sorted. */
std::vector<double> waits() {
    constexpr size_t kMax = 1000;
    const auto end = steady_clock::now() + std::chrono::seconds(5);
    const auto vibrator = IDaxVibrator::getService();
    if (vibrator == nullptr) abort();
    std::vector<double> milliseconds;
    while (milliseconds.size() < kMax && (steady_clock::now() < end || milliseconds.empty())) {
        const auto start = steady_clock::now();
        if (!vibrator->off().isOk()) abort();
        const std::chrono::duration<double, std::milli> wait = steady_clock::now() - start;
        milliseconds.push_back(wait.count());
        usleep(2000);
    }
    std::sort(milliseconds.begin(), milliseconds.end());
    return milliseconds;
}

/** Prints the row of one set of flooders. @param goal of the median, in ms; 0 for none. */
void printWaits(const char* company, double goal) {
    const std::vector<double> all = waits();
    const double median = all[all.size() / 2];
    std::printf("%-49s %9.2f ms  %9.2f ms  %9.2f ms", company, median, all[all.size() * 99 / 100],
                all.back());
    if (goal > 0) std::printf("  median <= %.0f ms  %s", goal, median <= goal ? "met" : "MISSED");
    std::printf("\n");
    std::fflush(stdout);
}

/** Measures against flooders of a number of users, with a number of connections each. */
void measure(const std::string& directory, const char* company, uid_t users, int connections,
             double goal) {
    std::vector<std::unique_ptr<Child>> flooders;
    for (uid_t i = 0; i < users; ++i) {
        flooders.emplace_back(new Child([&] { flood(directory, kFirstFlooder + i, connections); }));
    }
    usleep(500'000);
    const pid_t polite = fork();
    if (polite == 0) {
        become(kPoliteUid);
        printWaits(company, goal);
        _exit(0);
    }
    int status = 0;
    if (waitpid(polite, &status, 0) != polite || status != 0)
        std::printf("%-49s not measured: the client has failed\n", company);
}

}  // namespace

int main() {
    setenv("ANDROID_LOG_TAGS", "*:S", 1);
    const TemporaryDirectory directory;
    setenv("HWBINDER_DIR", directory.path().c_str(), 1);
    const Child daemon([] { execl(SERVICE, SERVICE, nullptr); });
    std::printf("%-49s %12s  %12s  %12s\n", "a call now and then", "median", "99th %", "greatest");
    std::fflush(stdout);
    measure(directory.path(), "alone", 0, 0, 0);
    if (geteuid() != 0) {
        std::printf("beside other users: not measured, which takes root\n");
        return 0;
    }
    measure(directory.path(), "beside one flooding connection", 1, 1, 0);
    measure(directory.path(), "beside 16 flooding connections of one user", 1, 16, 0);
    measure(directory.path(), "beside 16 users with 60 flooding connections each", 16, 60, 20);
    return 0;
}
