// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <cstddef>
#include <type_traits>
#include <utility>

namespace android {

template <typename Signature>
class FunctionRef;

/**
 * Refers to a function, which must live as long as it is called; that is cheaper to pass on than a
 * copy. One that refers to nothing does nothing.
 */
template <typename Result, typename... Arguments>
class FunctionRef<Result(Arguments...)> {
  public:
    FunctionRef(std::nullptr_t = nullptr) {}  // NOLINT: implicit, as a parameter's default
    template <typename Function,
              typename = std::enable_if_t<!std::is_same_v<Function, FunctionRef>>>
    FunctionRef(const Function& function)  // NOLINT: implicit, so that a lambda can be passed
        : mFunction(&function), mCall([](const void* each, Arguments... arguments) -> Result {
              return (*static_cast<const Function*>(each))(std::forward<Arguments>(arguments)...);
          }) {}

    Result operator()(Arguments... arguments) const {
        if (mCall == nullptr) return Result();
        return mCall(mFunction, std::forward<Arguments>(arguments)...);
    }

  private:
    const void* mFunction = nullptr;
    Result (*mCall)(const void* function, Arguments... arguments) = nullptr;
};

}  // namespace android
