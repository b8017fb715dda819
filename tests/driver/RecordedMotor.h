// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <linux/uinput.h>

#include <atomic>
#include <cstdint>
#include <map>
#include <mutex>
#include <string>
#include <thread>
#include <vector>

namespace tests {

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
    /** From a time on, in ms of the monotonic clock, it moves this strongly; 0: it rests. */
    struct Change {
        double time;
        int strength;
    };

    explicit RecordedMotor(const Kind& kind);
    RecordedMotor(const RecordedMotor&) = delete;
    RecordedMotor& operator=(const RecordedMotor&) = delete;
    ~RecordedMotor();

    const std::string& path() const { return mPath; }
    /** @return what has changed since the last time; what a length has ended, too. */
    std::vector<Change> takeChanges();
    bool isMoving();
    /** @return the gain that was set last; -1 if none was. */
    int gain();
    /** @return the most effects that it held at a time. */
    size_t effects();

  private:
    struct Held {
        int strength;
        double length;
        bool plays;
        /** When it ends by itself. */
        double end;
    };

    void record();
    void upload(const input_event& event);
    void erase(const input_event& event);
    void play(double time, int effect, bool plays);
    void change(double time, int strength);
    void endBefore(double time);

    int mFile;
    std::string mPath;
    std::mutex mMutex;
    std::map<int, Held> mHeld;
    size_t mMostHeld = 0;
    std::vector<Change> mChanges;
    int mStrength = 0;
    int mGain = -1;
    std::atomic<bool> mHasEnded{false};
    std::thread mThread;
};

/** @return the ms of the monotonic clock. */
double nowInMs();

}  // namespace tests
