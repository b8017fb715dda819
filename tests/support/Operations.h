// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "Driver.h"
#include "support/Answer.h"
#include "support/LogCapture.h"

#include <functional>
#include <string>
#include <vector>

/**
 * What every operation of the interface does, step by step: one table, for the tests of the object,
 * of the daemon, of every fault, and for the benchmarks. Lines of the log are cut down to priority
 * and message, like "E Pemission denied (2000)".
 */

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
    /** Of a text: what the log lines of the access begin with. A number's are the primitives'. */
    std::string textOf;

    /** What the operation logs before the access. */
    Lines before;
    /** The operation's answer, and what it logs at the end, when the open or the transfer fails. */
    std::string answerFailed;
    Lines logFailed;
    /** The answer when the transfer fails, where that is another. */
    std::string answerTransferFailed;
    /** The answer when a read yields a single byte; a write of a single one has failed. */
    std::string answerOneByte;
    /** Whether the operation goes on after a failure, with these nodes written all the same. */
    bool goesOn = false;
    Lines writtenAfter;
};

/** An operation with certain arguments. */
struct Operation {
    std::string name;
    std::function<Answer(IDaxVibrator&)> call;
    std::string answer;
    std::string answerWithoutDriver;
    /** The answer to a caller who is not permitted; empty where everybody is. */
    std::string answerRefused;
    std::vector<Access> accesses;
    /** What it logs after the last access. */
    Lines end;
    /** How many of the lines before the first access come before the caller is judged. */
    size_t linesBeforeGate = 0;
    /** What motor_type holds. */
    std::string motor = "LINEAR_1040\n";
};

/** @return each operation of the interface, on a driver that has every feature and is at rest. */
std::vector<Operation> allOperations(simulator::Layout layout);

/** @return what the trace shows of an operation that nothing disturbs. */
Lines undisturbedTrace(simulator::Layout layout, const Operation& operation);

/** @return what an operation that nothing disturbs logs. */
Lines undisturbedLog(simulator::Layout layout, const Operation& operation);

/**
 * @param index the access that fails; nothing after it happens.
 * @param opens whether it is the transfer that fails, rather than the open.
 * @param error the errno; 0 where the transfer is cut short.
 * @param result what the transfer yields.
 * @return what the operation logs.
 */
Lines failedLog(simulator::Layout layout, const Operation& operation, size_t index, bool opens,
                int error, int result);
