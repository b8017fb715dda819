// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "traffic/LogReader.h"
#include "traffic/TraceReader.h"

namespace vibratorctl {

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
