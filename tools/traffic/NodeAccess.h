// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <string>

namespace vibratorctl {

/** One access of a node, from its open to its close; or a call that the service refused. */
struct NodeAccess {
    enum Kind { kProbe, kRead, kWrite, kRefusal };

    /** The node's path below "/sys/class/", without "vibrator/": "leds/state". For a refusal the
     * operation, if it is known. */
    std::string node;
    Kind kind = kProbe;
    /** What was read or written, escaped as in C; for a refusal what the service logged. */
    std::string text = {};
    /** Why it failed, like "ENOENT"; empty if it succeeded. */
    std::string error = {};
    /** When it ended, in s; 0 if the source has no times. */
    double time = 0;
    /** The time as the source writes it, like "11-24 22:18:03.123"; empty without times. */
    std::string clock = {};

    /** @return the last part of the node's name, like "state". */
    std::string leaf() const { return node.substr(node.rfind('/') + 1); }
};

}  // namespace vibratorctl
