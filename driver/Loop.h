// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <poll.h>

#include <functional>
#include <map>
#include <vector>

namespace driver {

/** Waits for descriptors, without waking up for anything else, and does what each is for. */
class Loop {
  public:
    /** @param events as poll has them; 0: only that the other end is gone. */
    void watch(int file, short events, std::function<void()> action) {
        mActions[file] = {events, std::move(action)};
    }
    /** To be called before a watched descriptor is closed. */
    void forget(int file) { mActions.erase(file); }
    void end() { mHasEnded = true; }
    void run() {
        while (!mHasEnded) {
            std::vector<pollfd> files;
            for (const auto& [file, action] : mActions)
                files.push_back({file, action.first, 0});
            poll(files.data(), files.size(), -1);
            for (const pollfd& each : files) {
                const auto found = mActions.find(each.fd);
                if (each.revents == 0 || found == mActions.end()) continue;
                // A copy, since the action may forget its own descriptor.
                const auto action = found->second.second;
                action();
            }
        }
    }

  private:
    std::map<int, std::pair<short, std::function<void()>>> mActions;
    bool mHasEnded = false;
};

}  // namespace driver
