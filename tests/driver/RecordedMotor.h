// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <fcntl.h>
#include <gtest/gtest.h>
#include <linux/uinput.h>
#include <poll.h>
#include <sys/ioctl.h>
#include <sys/stat.h>
#include <unistd.h>

#include <algorithm>
#include <atomic>
#include <cstring>
#include <ctime>
#include <filesystem>
#include <map>
#include <mutex>
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

/** A force-feedback motor of the kernel's input core that writes down what it was told, and when.
 */
class RecordedMotor {
  public:
    struct Kind {
        const char* name;
        /** What it offers, like FF_RUMBLE. */
        std::vector<int> bits;
        uint32_t effects;
    };
    /** From a time on, in ms, it moves this strongly; 0: it rests. */
    struct Change {
        double time;
        int strength;
    };

    explicit RecordedMotor(const Kind& kind) : mFile(open("/dev/uinput", O_RDWR | O_CLOEXEC)) {
        uinput_setup setup{};
        setup.id = {BUS_VIRTUAL, 1, 1, 1};
        setup.ff_effects_max = kind.effects;
        strncpy(setup.name, kind.name, sizeof(setup.name) - 1);
        EXPECT_EQ(ioctl(mFile, UI_SET_EVBIT, EV_FF), 0);
        for (const int bit : kind.bits)
            EXPECT_EQ(ioctl(mFile, UI_SET_FFBIT, bit), 0);
        EXPECT_EQ(ioctl(mFile, UI_DEV_SETUP, &setup), 0);
        EXPECT_EQ(ioctl(mFile, UI_DEV_CREATE), 0);
        char name[64] = "";
        EXPECT_GT(ioctl(mFile, UI_GET_SYSNAME(sizeof(name)), name), 0);
        const std::string directory = "/sys/devices/virtual/input/" + std::string(name);
        for (const auto& entry : std::filesystem::directory_iterator(directory)) {
            const std::string leaf = entry.path().filename();
            if (leaf.find("event") == 0) mPath = "/dev/input/" + leaf;
        }
        // As udev does for the user at the seat.
        EXPECT_EQ(chmod(mPath.c_str(), 0666), 0);
        mThread = std::thread([this] { record(); });
    }
    RecordedMotor(const RecordedMotor&) = delete;
    RecordedMotor& operator=(const RecordedMotor&) = delete;
    ~RecordedMotor() {
        ioctl(mFile, UI_DEV_DESTROY);
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
    /** @return the most effects that it held at a time. */
    size_t effects() const { return mMostHeld; }

  private:
    struct Held {
        int strength;
        double length;
        bool plays;
        /** When it ends by itself. */
        double end;
    };

    static int strengthOf(const ff_effect& effect) {
        if (effect.type == FF_CONSTANT) return effect.u.constant.level;
        if (effect.type == FF_PERIODIC) return effect.u.periodic.magnitude;
        EXPECT_EQ(effect.type, FF_RUMBLE);
        EXPECT_EQ(effect.u.rumble.strong_magnitude, effect.u.rumble.weak_magnitude);
        return effect.u.rumble.strong_magnitude;
    }

    void record() {
        pollfd waiting{mFile, POLLIN, 0};
        while (!mHasEnded) {
            input_event event{};
            if (poll(&waiting, 1, 20) != 1) continue;
            if (read(mFile, &event, sizeof(event)) != sizeof(event)) continue;
            const std::lock_guard<std::mutex> lock(mMutex);
            const double time = static_cast<double>(event.input_event_sec) * 1e3 +
                                static_cast<double>(event.input_event_usec) / 1e3;
            endBefore(time);
            if (event.type == EV_UINPUT && event.code == UI_FF_UPLOAD) upload(time, event.value);
            if (event.type == EV_UINPUT && event.code == UI_FF_ERASE) erase(time, event.value);
            if (event.type == EV_FF && event.code == FF_GAIN) mGain = event.value;
            if (event.type == EV_FF && event.code < FF_GAIN)
                play(time, event.code, event.value != 0);
        }
    }
    void upload(double time, int number) {
        uinput_ff_upload request{};
        request.request_id = static_cast<uint32_t>(number);
        if (ioctl(mFile, UI_BEGIN_FF_UPLOAD, &request) != 0) return;
        Held& held = mHeld[request.effect.id];
        held.strength = strengthOf(request.effect);
        held.length = request.effect.replay.length;
        mMostHeld = std::max<size_t>(mMostHeld, mHeld.size());
        // As motors do whose time the kernel keeps: it begins anew.
        if (held.plays) play(time, request.effect.id, true);
        request.retval = 0;
        ioctl(mFile, UI_END_FF_UPLOAD, &request);
    }
    void erase(double time, int number) {
        uinput_ff_erase request{};
        request.request_id = static_cast<uint32_t>(number);
        if (ioctl(mFile, UI_BEGIN_FF_ERASE, &request) != 0) return;
        play(time, static_cast<int>(request.effect_id), false);
        mHeld.erase(static_cast<int>(request.effect_id));
        request.retval = 0;
        ioctl(mFile, UI_END_FF_ERASE, &request);
    }
    void play(double time, int effect, bool plays) {
        Held& held = mHeld[effect];
        held.plays = plays;
        held.end = time + held.length;
        const int strength = plays ? held.strength : 0;
        if (strength != mStrength) mChanges.push_back({time, strength});
        mStrength = strength;
    }
    void endBefore(double time) {
        for (auto& [effect, held] : mHeld) {
            if (held.plays && held.end <= time) play(held.end, effect, false);
        }
    }

    int mFile;
    std::string mPath;
    std::mutex mMutex;
    std::map<int, Held> mHeld;
    std::vector<Change> mChanges;
    int mStrength = 0;
    std::atomic<size_t> mMostHeld{0};
    std::atomic<int> mGain{-1};
    std::atomic<bool> mHasEnded{false};
    std::thread mThread;
};

}  // namespace tests
