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

}  // namespace vibratorctl
