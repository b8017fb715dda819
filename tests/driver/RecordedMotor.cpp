// SPDX-License-Identifier: Apache-2.0
#include "driver/RecordedMotor.h"

#include <dirent.h>
#include <fcntl.h>
#include <gtest/gtest.h>
#include <poll.h>
#include <sys/ioctl.h>
#include <sys/stat.h>
#include <unistd.h>

#include <algorithm>
#include <cstring>
#include <ctime>

namespace tests {
namespace {

int strengthOf(const ff_effect& effect) {
    switch (effect.type) {
        case FF_RUMBLE:
            EXPECT_EQ(effect.u.rumble.strong_magnitude, effect.u.rumble.weak_magnitude);
            return effect.u.rumble.strong_magnitude;
        case FF_PERIODIC:
            EXPECT_EQ(effect.u.periodic.waveform, FF_SINE);
            EXPECT_GT(effect.u.periodic.period, 0);
            return effect.u.periodic.magnitude;
        default:
            EXPECT_EQ(effect.type, FF_CONSTANT);
            return effect.u.constant.level;
    }
}

double timeOf(const input_event& event) {
    return static_cast<double>(event.input_event_sec) * 1e3 +
           static_cast<double>(event.input_event_usec) / 1e3;
}

}  // namespace

double nowInMs() {
    timespec time{};
    clock_gettime(CLOCK_MONOTONIC, &time);
    return static_cast<double>(time.tv_sec) * 1e3 + static_cast<double>(time.tv_nsec) / 1e6;
}

RecordedMotor::RecordedMotor(const Kind& kind) : mFile(open("/dev/uinput", O_RDWR | O_CLOEXEC)) {
    EXPECT_GE(mFile, 0);
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
    DIR* directory = opendir(("/sys/devices/virtual/input/" + std::string(name)).c_str());
    while (const dirent* entry = directory == nullptr ? nullptr : readdir(directory)) {
        if (strncmp(entry->d_name, "event", 5) == 0)
            mPath = std::string("/dev/input/") + entry->d_name;
    }
    closedir(directory);
    // As udev does for the user at the seat.
    EXPECT_EQ(chmod(mPath.c_str(), 0666), 0);
    mThread = std::thread([this] { record(); });
}

RecordedMotor::~RecordedMotor() {
    ioctl(mFile, UI_DEV_DESTROY);
    // Does not wake up who reads.
    mHasEnded = true;
    mThread.join();
    close(mFile);
}

void RecordedMotor::record() {
    pollfd waiting{mFile, POLLIN, 0};
    while (!mHasEnded) {
        input_event event{};
        if (poll(&waiting, 1, 20) != 1) continue;
        if (read(mFile, &event, sizeof(event)) != sizeof(event)) continue;
        const std::lock_guard<std::mutex> lock(mMutex);
        endBefore(timeOf(event));
        if (event.type == EV_UINPUT && event.code == UI_FF_UPLOAD) upload(event);
        if (event.type == EV_UINPUT && event.code == UI_FF_ERASE) erase(event);
        if (event.type == EV_FF && event.code == FF_GAIN) mGain = event.value;
        if (event.type == EV_FF && event.code < FF_GAIN)
            play(timeOf(event), event.code, event.value != 0);
    }
}

void RecordedMotor::upload(const input_event& event) {
    uinput_ff_upload request{};
    request.request_id = static_cast<uint32_t>(event.value);
    if (ioctl(mFile, UI_BEGIN_FF_UPLOAD, &request) != 0) return;
    Held& held = mHeld[request.effect.id];
    held.strength = strengthOf(request.effect);
    held.length = request.effect.replay.length;
    mMostHeld = std::max(mMostHeld, mHeld.size());
    // As motors do whose time the kernel keeps: it begins anew.
    if (held.plays) play(timeOf(event), request.effect.id, true);
    request.retval = 0;
    ioctl(mFile, UI_END_FF_UPLOAD, &request);
}

void RecordedMotor::erase(const input_event& event) {
    uinput_ff_erase request{};
    request.request_id = static_cast<uint32_t>(event.value);
    if (ioctl(mFile, UI_BEGIN_FF_ERASE, &request) != 0) return;
    play(timeOf(event), static_cast<int>(request.effect_id), false);
    mHeld.erase(static_cast<int>(request.effect_id));
    request.retval = 0;
    ioctl(mFile, UI_END_FF_ERASE, &request);
}

void RecordedMotor::play(double time, int effect, bool plays) {
    Held& held = mHeld[effect];
    held.plays = plays;
    held.end = time + held.length;
    change(time, plays ? held.strength : 0);
}

void RecordedMotor::change(double time, int strength) {
    if (strength != mStrength) mChanges.push_back({time, strength});
    mStrength = strength;
}

void RecordedMotor::endBefore(double time) {
    for (auto& [effect, held] : mHeld) {
        if (held.plays && held.end <= time) play(held.end, effect, false);
    }
}

std::vector<RecordedMotor::Change> RecordedMotor::takeChanges() {
    const std::lock_guard<std::mutex> lock(mMutex);
    endBefore(nowInMs());
    return std::exchange(mChanges, {});
}

bool RecordedMotor::isMoving() {
    const std::lock_guard<std::mutex> lock(mMutex);
    endBefore(nowInMs());
    return mStrength > 0;
}

int RecordedMotor::gain() {
    const std::lock_guard<std::mutex> lock(mMutex);
    return mGain;
}

size_t RecordedMotor::effects() {
    const std::lock_guard<std::mutex> lock(mMutex);
    return mMostHeld;
}

}  // namespace tests
