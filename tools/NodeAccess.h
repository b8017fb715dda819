// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <map>
#include <optional>
#include <string>
#include <string_view>

/** One access of a node, from its open to its close; or a call that the service refused. */
struct NodeAccess {
    enum Kind { kProbe, kRead, kWrite, kRefusal };

    /** When it ended, in s; 0 where the source does not say. */
    double time = 0;
    /** The node's path below "/sys/class/", without "vibrator/": "leds/state". Of a refusal the
     * operation, as far as it is known. */
    std::string node;
    Kind kind = kProbe;
    /** The bytes that were read or written; of a refusal what the service logged. */
    std::string bytes;
    /** Why it failed, like "ENOENT"; empty where it went well. */
    std::string error;
    /** The time as the source writes it, like "11-24 22:18:03.123"; empty where it does not. */
    std::string clock;

    /** @return the last part of the node's name, like "state". */
    std::string leaf() const { return node.substr(node.rfind('/') + 1); }
};

/** Puts accesses together from the lines of the simulated driver's trace. */
class TraceReader {
  public:
    /** @return the access that ends with the line; none where it goes on, or the line is no trace.
     */
    std::optional<NodeAccess> read(std::string_view line);

  private:
    std::map<std::string, NodeAccess> mOpen;
};

/**
 * Puts accesses together from the lines of the daemon's log: as the daemon writes it, as journalctl
 * and as logcat show it. The times of logcat's forms brief, tag and raw are missing.
 */
class LogReader {
  public:
    /** @return the access that ends with the line; none where it goes on, or the line is another.
     */
    std::optional<NodeAccess> read(std::string_view line);

  private:
    std::optional<NodeAccess> readMessage(std::string_view line);
    std::optional<NodeAccess> readNumber(std::string_view line);
    std::optional<NodeAccess> readText(std::string_view line);
    std::optional<NodeAccess> readRefusal(std::string_view line);
    void begin(NodeAccess::Kind kind, std::string_view path, const std::string& bytes);

    /** Directory of the nodes, as far as it has been seen: "leds". */
    std::string mDirectory = "vibrator";
    /** The access of a number, or probe, that has begun. */
    std::optional<NodeAccess> mCurrent;
    /** The write of a text that has begun; another may lie between its begin and its end. */
    std::optional<NodeAccess> mText;
};
