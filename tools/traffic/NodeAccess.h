// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <map>
#include <optional>
#include <string>
#include <string_view>

namespace vibratorctl {

/** One access of a node, from its open to its close; or a call that the service refused. */
struct NodeAccess {
    enum Kind { kProbe, kRead, kWrite, kRefusal };

    /** The node's path below "/sys/class/", without "vibrator/": "leds/state". For a refusal the
     * operation, if it is known. */
    std::string node;
    Kind kind = kProbe;
    /** The bytes that were read or written; for a refusal what the service logged. */
    std::string bytes = {};
    /** Why it failed, like "ENOENT"; empty if it succeeded. */
    std::string error = {};
    /** When it ended, in s; 0 if the source has no times. */
    double time = 0;
    /** The time as the source writes it, like "11-24 22:18:03.123"; empty without times. */
    std::string clock = {};

    /** @return the last part of the node's name, like "state". */
    std::string leaf() const { return node.substr(node.rfind('/') + 1); }
};

/**
 * Puts accesses together from lines: of the simulated driver's trace, or of the daemon's log as the
 * daemon writes it and as journalctl and logcat show it. Logcat's forms brief, tag and raw have no
 * times.
 */
class AccessReader {
  public:
    explicit AccessReader(bool isLog) : mIsLog(isLog) {}

    /** @return the access that ends with the line; none if the line ends no access. */
    std::optional<NodeAccess> read(std::string_view line);

  private:
    std::optional<NodeAccess> readTrace(std::string_view line);
    std::optional<NodeAccess> readLog(std::string_view line);
    std::optional<NodeAccess> readStep(std::string_view line);
    void begin(std::string_view path, NodeAccess::Kind kind, const std::string& bytes);
    /** @return the text whose success the write shows, if it does. */
    std::optional<NodeAccess> beginWrite(const std::string& text);

    bool mIsLog;
    /** For a trace: the accesses that have begun, by node. */
    std::map<std::string, NodeAccess> mOpen;
    /** For a log: the directory of the last node, like "leds". */
    std::string mDirectory = "vibrator";
    /** For a log: the access of a number, or the probe, that has begun. */
    std::optional<NodeAccess> mNumber;
    /** For a log: the write of a text that has begun; one of a number may be inside it. */
    std::optional<NodeAccess> mText;
};

}  // namespace vibratorctl
