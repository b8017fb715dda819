// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "support/Answer.h"
#include "support/Steps.h"

#include <functional>
#include <string>
#include <type_traits>
#include <vector>

namespace tests {

/** A call of an operation with certain arguments. */
struct Call {
    std::string name;
    std::function<Answer(IDaxVibrator&)> make;

    Answer operator()(IDaxVibrator& vibrator) const { return make(vibrator); }
};

/** A call, and what it does. */
struct Operation {
    Call call;
    std::string answer;
    /** In the notation of Steps.h. */
    std::string steps;
    /** The answer when a step fails that does not tell another one. */
    std::string answerFailed;
    /** Distinguishes it from another call of the same operation. */
    std::string variant = {};

    std::string name() const { return call.name + variant; }
};

/** @return each operation of the interface, on a driver that has every feature and is at rest. */
std::vector<Operation> allOperations();

/** An argument of whatever type it takes. */
template <typename Given>
struct Argument {
    Given given;
    template <typename Taken>
    operator Taken() const {
        return static_cast<Taken>(given);
    }
};

/** @return what makes a Call from arguments; enums and structures are taken as plain numbers, too.
 */
template <typename Result, typename Interface, typename... Taken>
auto callsOf(const char* name,
             ::android::hardware::Return<Result> (Interface::*operation)(Taken...)) {
    return [=](auto... given) {
        return Call{
                name, [=](IDaxVibrator& vibrator) {
                    if constexpr (std::is_void_v<Result>) {
                        return answerTo([&](const auto& callback) {
                            return (vibrator.*operation)(Argument<decltype(given)>{given}...,
                                                         callback);
                        });
                    } else {
                        return answerOf((vibrator.*operation)(Argument<decltype(given)>{given}...));
                    }
                }};
    };
}

/** CALL(on)(500) is a Call of on. */
#define CALL(operation) ::tests::callsOf(#operation, &::tests::IDaxVibrator::operation)

}  // namespace tests
