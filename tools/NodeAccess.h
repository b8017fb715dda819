// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <map>
#include <optional>
#include <string>
#include <string_view>

/** One access of a node, from its open to its close. */
struct NodeAccess {
    enum Kind { kProbe, kRead, kWrite };

    /** When it ended, in s of a clock that never goes back; 0 where the source does not say. */
    double time = 0;
    /** The node's path, from "/sys/class/" on: "leds/vibrator/state"; without "vibrator/" inside.
     */
    std::string node;
    Kind kind = kProbe;
    /** The bytes that were read or written. */
    std::string bytes;
    /** Why it failed, like "ENOENT"; empty where it went well. */
    std::string error;

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

/** Puts accesses together from the lines of the daemon's log, in whatever form the log is shown. */
class LogReader {
  public:
    /** @return the access that ends with the line; none where it goes on, or the line is another.
     */
    std::optional<NodeAccess> read(std::string_view line);

  private:
    std::optional<NodeAccess> readNumber(std::string_view line);
    std::optional<NodeAccess> readText(std::string_view line);
    void begin(NodeAccess::Kind kind, std::string_view path, const std::string& bytes);

    /** Directory of the nodes, as far as it has been seen: "leds". */
    std::string mDirectory = "vibrator";
    /** The access of a number, or probe, that has begun. */
    std::optional<NodeAccess> mCurrent;
    /** The write of a text that has begun; another may lie between its begin and its end. */
    std::optional<NodeAccess> mText;
};
