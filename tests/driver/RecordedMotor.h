// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "support/Process.h"

#include <fcntl.h>
#include <gtest/gtest.h>
#include <linux/uhid.h>
#include <linux/uinput.h>
#include <poll.h>
#include <sys/ioctl.h>
#include <sys/stat.h>
#include <unistd.h>

#include <atomic>
#include <cstring>
#include <ctime>
#include <filesystem>
#include <mutex>
#include <set>
#include <string>
#include <thread>
#include <vector>

namespace tests {

/** @return the ms of the monotonic clock. */
inline double nowInMs() {
    timespec time{};
    clock_gettime(CLOCK_MONOTONIC, &time);
    return static_cast<double>(time.tv_sec) * 1e3 + static_cast<double>(time.tv_nsec) / 1e6;
}

/** A motor of the kernel's input core that writes down what it was told, and when. */
class RecordedMotor {
  public:
    struct Kind {
        const char* name;
        /**
         * What it offers, like FF_RUMBLE. Without any it is a game controller of which only the
         * radio is not real: the kernel's own driver keeps the effects, and their times.
         */
        std::vector<int> bits;
        uint32_t effects;
    };
    /** From a time on, in ms, it moves this strongly; 0: it rests. */
    struct Change {
        double time;
        int strength;
    };

    explicit RecordedMotor(const Kind& kind)
        : mIsController(kind.bits.empty()),
          mFile(open(mIsController ? "/dev/uhid" : "/dev/uinput", O_RDWR | O_CLOEXEC)) {
        const std::set<std::string> before = devices();
        mIsController ? plugController(kind.name) : plug(kind);
        EXPECT_TRUE(eventually([&] {
            for (const std::string& path : devices()) {
                if (before.count(path) == 0) mPath = path;
            }
            return !mPath.empty();
        }));
        // As udev does for the user at the seat.
        EXPECT_EQ(chmod(mPath.c_str(), 0666), 0);
        mThread = std::thread([this] { record(); });
    }
    RecordedMotor(const RecordedMotor&) = delete;
    RecordedMotor& operator=(const RecordedMotor&) = delete;
    ~RecordedMotor() {
        if (!mIsController) ioctl(mFile, UI_DEV_DESTROY);
        // Does not wake up who reads.
        mHasEnded = true;
        mThread.join();
        close(mFile);
    }

    const std::string& path() const { return mPath; }
    /** @return what has changed since the last time; what a length has ended, too. */
    std::vector<Change> takeChanges() {
        const std::lock_guard<std::mutex> lock(mMutex);
        endBefore(nowInMs());
        return std::exchange(mChanges, {});
    }
    bool isMoving() {
        const std::lock_guard<std::mutex> lock(mMutex);
        endBefore(nowInMs());
        return mStrength > 0;
    }
    /** @return the gain that was set last; -1 if none was. */
    int gain() const { return mGain; }
    /** @return how many effects it has held. */
    size_t effects() const { return mNumbers.size(); }

  private:
    static std::set<std::string> devices() {
        std::set<std::string> paths;
        for (const auto& entry : std::filesystem::directory_iterator("/dev/input"))
            paths.insert(entry.path());
        return paths;
    }
    void plug(const Kind& kind) const {
        uinput_setup setup{};
        setup.id = {BUS_VIRTUAL, 1, 1, 1};
        setup.ff_effects_max = kind.effects;
        strncpy(setup.name, kind.name, sizeof(setup.name) - 1);
        EXPECT_EQ(ioctl(mFile, UI_SET_EVBIT, EV_FF), 0);
        for (const int bit : kind.bits)
            EXPECT_EQ(ioctl(mFile, UI_SET_FFBIT, bit), 0);
        EXPECT_EQ(ioctl(mFile, UI_DEV_SETUP, &setup), 0);
        EXPECT_EQ(ioctl(mFile, UI_DEV_CREATE), 0);
    }
    void plugController(const char* name) const {
        // A gamepad with eight buttons.
        constexpr char kDescriptor[] =
                "\x05\x01\x09\x05\xa1\x01\x05\x09\x19\x01\x29\x08\x15\x00\x25\x01\x75\x01\x95\x08"
                "\x81\x02\xc0";
        uhid_event event{};
        event.type = UHID_CREATE2;
        event.u.create2 = {{}, {}, {}, sizeof(kDescriptor) - 1, BUS_BLUETOOTH, 0x045e, 0x02fd,
                           1,  0,  {}};
        memcpy(event.u.create2.name, name, strlen(name));
        memcpy(event.u.create2.rd_data, kDescriptor, sizeof(kDescriptor));
        EXPECT_EQ(write(mFile, &event, sizeof(event)), sizeof(event));
    }

    void record() {
        pollfd waiting{mFile, POLLIN, 0};
        while (!mHasEnded) {
            if (poll(&waiting, 1, 20) == 1) mIsController ? recordReport() : recordEvent();
        }
    }
    void recordReport() {
        uhid_event event{};
        if (read(mFile, &event, sizeof(event)) < 0 || event.type != UHID_OUTPUT) return;
        const std::lock_guard<std::mutex> lock(mMutex);
        change(nowInMs(), event.u.output.data[4]);
    }
    void recordEvent() {
        input_event event{};
        if (read(mFile, &event, sizeof(event)) != sizeof(event)) return;
        const std::lock_guard<std::mutex> lock(mMutex);
        const double time = static_cast<double>(event.input_event_sec) * 1e3 +
                            static_cast<double>(event.input_event_usec) / 1e3;
        endBefore(time);
        if (event.type == EV_UINPUT && event.code == UI_FF_UPLOAD) {
            upload(time, static_cast<uint32_t>(event.value));
        } else if (event.type == EV_UINPUT) {
            uinput_ff_erase request{static_cast<uint32_t>(event.value), 0, 0};
            ioctl(mFile, UI_BEGIN_FF_ERASE, &request);
            ioctl(mFile, UI_END_FF_ERASE, &request);
            play(time, false);
        } else if (event.code == FF_GAIN) {
            mGain = event.value;
        } else {
            play(time, event.value != 0);
        }
    }
    void upload(double time, uint32_t number) {
        uinput_ff_upload request{};
        request.request_id = number;
        if (ioctl(mFile, UI_BEGIN_FF_UPLOAD, &request) != 0) return;
        const ff_effect& effect = request.effect;
        mNumbers.insert(effect.id);
        mEffect = effect.type == FF_CONSTANT   ? effect.u.constant.level
                  : effect.type == FF_PERIODIC ? effect.u.periodic.magnitude
                                               : effect.u.rumble.strong_magnitude;
        EXPECT_TRUE(effect.type != FF_RUMBLE || effect.u.rumble.weak_magnitude == mEffect);
        mLength = effect.replay.length;
        // As motors do whose time the kernel keeps: it begins anew.
        if (mEnd > 0) play(time, true);
        ioctl(mFile, UI_END_FF_UPLOAD, &request);
    }
    void play(double time, bool plays) {
        mEnd = plays ? time + mLength : 0;
        change(time, plays ? mEffect : 0);
    }
    void endBefore(double time) {
        if (mEnd > 0 && mEnd <= time) play(mEnd, false);
    }
    void change(double time, int strength) {
        if (strength != mStrength) mChanges.push_back({time, strength});
        mStrength = strength;
    }

    const bool mIsController;
    const int mFile;
    std::string mPath;
    std::mutex mMutex;
    std::vector<Change> mChanges;
    int mStrength = 0;
    /** Strength and length of the effect. */
    int mEffect = 0;
    double mLength = 0;
    /** When it ends by itself; 0: it does not play. */
    double mEnd = 0;
    std::set<int> mNumbers;
    std::atomic<int> mGain{-1};
    std::atomic<bool> mHasEnded{false};
    std::thread mThread;
};

}  // namespace tests
