// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "traffic/NodeAccess.h"

#include <map>
#include <optional>
#include <string_view>

namespace vibratorctl {

/** Puts accesses together from the lines of the simulated driver's trace. */
class TraceReader {
  public:
    /** @return the access that ends with the line; none if the line ends no access. */
    std::optional<NodeAccess> read(std::string_view line);

  private:
    /** The accesses that have begun, by node. */
    std::map<std::string, NodeAccess> mOpen;
};

/**
 * Puts accesses together from the lines of the daemon's log as the daemon writes it and as
 * journalctl and logcat show it. Logcat's forms brief, tag and raw have no times.
 */
class LogReader {
  public:
    /** @return the access that ends with the line, or that it refuses; none if it does neither. */
    std::optional<NodeAccess> read(std::string_view line);

  private:
    std::optional<NodeAccess> readStep(std::string_view line);
    void begin(std::string_view path, NodeAccess::Kind kind, const std::string& text);
    /** @return the text whose success the write shows, if it does. */
    std::optional<NodeAccess> beginWrite(const std::string& text);

    /** The directory of the last node, like "leds". */
    std::string mDirectory = "vibrator";
    /** The access of a number, or the probe, that has begun. */
    std::optional<NodeAccess> mNumber;
    /** The write of a text that has begun; one of a number may be inside it. */
    std::optional<NodeAccess> mText;
};

/** Reads traces and logs: no line of the one means something in the other. */
class AccessReader {
  public:
    /** @return the access that ends with the line; none if the line ends no access. */
    std::optional<NodeAccess> read(std::string_view line) {
        std::optional<NodeAccess> access = mTrace.read(line);
        return access ? access : mLog.read(line);
    }

  private:
    TraceReader mTrace;
    LogReader mLog;
};

}  // namespace vibratorctl
