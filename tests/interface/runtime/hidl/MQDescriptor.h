// SPDX-License-Identifier: Apache-2.0
#pragma once

// What only generated headers ask of the runtime's hidl headers.

#include <hidl/HidlSupport.h>

#include <array>
#include <cstddef>
#include <cstdint>
#include <string>
#include <type_traits>

namespace android::hardware {

template <typename Enum>
using hidl_bitfield = std::underlying_type_t<Enum>;

inline std::string toString(int64_t number) {
    return std::to_string(number);
}

namespace details {

template <typename T>
std::string toHexString(T number) {
    return std::to_string(number);
}

template <typename Enum>
constexpr std::array<Enum, 0> hidl_enum_values{};

}  // namespace details
}  // namespace android::hardware
