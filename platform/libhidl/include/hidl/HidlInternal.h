// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <charconv>
#include <iterator>
#include <string>
#include <type_traits>
#include <utility>
#include <vector>

namespace android::hardware::details {

/** Tags of the four kinds of classes that the interface compiler generates. */
struct i_tag {};
struct bnhw_tag {};
struct bphw_tag {};
struct bs_tag {};

// The wire has 64-bit pointers, and the types below are laid out as on the wire.
static_assert(sizeof(void*) == 8, "this platform is for 64-bit processes");

/** @return a number like "0x1f". */
template <typename T>
std::string toHexString(T number) {
    char digits[2 * sizeof(number)];
    const auto value = static_cast<std::make_unsigned_t<T>>(number);
    return "0x" + std::string(digits, std::to_chars(digits, std::end(digits), value, 16).ptr);
}

/** Base of generated classes that could report their calls, which this platform does not do. */
class HidlInstrumentor {
  public:
    HidlInstrumentor(const std::string& /* package */, const std::string& /* interface */) {}

    void configureInstrumentation() {}
};

}  // namespace android::hardware::details
