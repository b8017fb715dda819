// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "Driver.h"
#include "Vibrator.h"

#include <functional>
#include <string>
#include <utility>
#include <variant>
#include <vector>

namespace vendor::velmora::hardware::vibrator::V2_1::implementation {

/** One access of a node: open, at most one transfer, close. */
struct Access {
    enum Kind { kProbe, kRead, kWrite };
    Kind kind;
    std::string leaf;
    /** O_RDONLY or O_RDWR. */
    int mode;
    /** What is written, or what the node holds. */
    std::string text;
    /** How many bytes a read asks for. */
    size_t size;

    // What the operation answers when the access fails:
    std::string afterOpen;
    std::string afterTransfer;
    /** When a read yields a single byte; a write that takes a single one has failed. */
    std::string afterOneByte;
    /** The nodes that are written all the same after the failure. */
    std::vector<std::string> writtenAfter;
};

/** What an operation has answered. */
struct Answer {
    std::variant<bool, Status, std::pair<Status, uint32_t>, std::pair<bool, hidl_vec<uint32_t>>>
            value;
    /** How often it was given, by callback or as the result. */
    int times = 0;
    /** Whether the transport's part of the result was OK. */
    bool isOk = false;

    /** @return the value, like "OK" or "(OK, 20)"; what is wrong where it is no proper answer. */
    std::string inWords() const;
};

/** An operation with certain arguments, and all that it does with the driver. */
struct Operation {
    std::string name;
    std::function<Answer(Vibrator&)> call;
    /** The answer in words. */
    std::string answer;
    std::vector<Access> accesses;
    /** What motor_type holds. */
    std::string motor = "LINEAR_1040\n";
};

/** @return each operation of the interface, on a driver that has every feature and is at rest. */
std::vector<Operation> allOperations(simulator::Layout layout);

}  // namespace vendor::velmora::hardware::vibrator::V2_1::implementation
