// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <map>
#include <optional>
#include <string>
#include <string_view>

/** One access of a node, from its open to its close; or a call that the service refused. */
struct NodeAccess {
    enum Kind { kProbe, kRead, kWrite, kRefusal };

    /** The node's path below "/sys/class/", without "vibrator/": "leds/state". Of a refusal the
     * operation, as far as it is known. */
    std::string node;
    Kind kind = kProbe;
    /** The bytes that were read or written; of a refusal what the service logged. */
    std::string bytes;
    /** Why it failed, like "ENOENT"; empty where it went well. */
    std::string error;
    /** When it ended, in s; 0 where the source does not say. */
    double time = 0;
    /** The time as the source writes it, like "11-24 22:18:03.123"; empty where it does not. */
    std::string clock;

    /** @return the last part of the node's name, like "state". */
    std::string leaf() const { return node.substr(node.rfind('/') + 1); }
};

/**
 * Puts accesses together from lines: of the simulated driver's trace, or of the daemon's log as the
 * daemon writes it and as journalctl and logcat show it. The times of logcat's forms brief, tag and
 * raw are missing.
 */
class AccessReader {
  public:
    explicit AccessReader(bool isLog) : mIsLog(isLog) {}

    /** @return the access that ends with the line; none where it goes on, or the line is another.
     */
    std::optional<NodeAccess> read(std::string_view line);

  private:
    std::optional<NodeAccess> readTrace(std::string_view line);
    std::optional<NodeAccess> readLog(std::string_view line);

    bool mIsLog;
    /** Of a trace: the accesses that have begun, by their nodes. */
    std::map<std::string, NodeAccess> mOpen;
    /** Of a log: the nodes' directory, as far as it has been seen: "leds". */
    std::string mDirectory = "vibrator";
    /** Of a log: the access of a number, or probe, that has begun. */
    std::optional<NodeAccess> mNumber;
    /** Of a log: the write of a text that has begun; that of a number may lie in it. */
    std::optional<NodeAccess> mText;
};
