// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "Attributes.h"

#include <sys/types.h>

#include <map>
#include <string>
#include <vector>

namespace tests {

struct Operation;

/**
 * The notation for what an operation does: its steps in their true order, one a line, or several
 * with "; " between them. Text stands as the trace and the log show it, "\n" for a newline.
 *
 *     D text, E text         a line of the log; {name} is what is called
 *     @                      the caller is judged; for one who is refused, the step fails
 *     intensity?             a probe that opens a node for reading and writing; ?r for reading
 *     intensity=500          a number is written
 *     event_cmd="OFF\n"      a text is written
 *     num_waves:7="12\n"     a number is read, of at most 7 bytes
 *     motor_type:31="NONE\n" a text is read; :31r= where the node is opened for reading only
 *     on=20, off, running?   what these do in the driver's layout
 *     (NAME ... )            what it does by calling another one, whose name its texts are logged
 * with
 *
 * After a node's name !ENOENT says that it cannot be opened; at the end of a step !EIO says that
 * the transfer fails and !3 that it stops after 3 bytes. What comes next is told for that case.
 *
 * The steps of an operation also tell what it does when one of them fails in another way:
 *
 *     !E text, !intensity?   after a step or a bracket: what follows where that one has failed
 *     !=false                the same, and there the operation ends with this answer
 *     ~on=20, ~( ... )       a failure does not matter, the operation goes on after this step
 *
 * In the lines after a failure {result} is what the transfer yielded, {error} its errno in words.
 * Otherwise a failure ends a bracket, and in the end the operation.
 */
struct Step {
    enum Kind { kLine, kAnswer, kGate, kBracket, kProbe, kWrite, kRead };
    Kind kind = kLine;
    /** The line, the answer, the name of what is called, or what is written or read. */
    std::string text;
    /** Of a bracket. */
    std::vector<Step> children = {};
    /** What follows where the step fails, before what it stands in ends. */
    std::vector<Step> afterFailure = {};
    /** Whether all goes on when the step fails. */
    bool isOptional = false;

    // Of an access.
    std::string leaf = {};
    bool readsOnly = false;
    /** How many bytes a read asks for. */
    size_t size = 0;
    /** Whether it is a primitive's, with its lines of the log. */
    bool isPrimitive = false;
    /** What goes wrong with "open", "read", "write" or "close", as the simulator takes it. */
    std::map<std::string, std::string> faults = {};
    /** How often it goes wrong; only EINTR passes. */
    unsigned times = 1;

    bool isAccess() const { return kind >= kProbe; }
    /** @return what the access does to an open node: "read", "write", or nothing. */
    std::string transfer() const;
    /** @return the text, without escapes. */
    std::string bytes() const;
};
using Steps = std::vector<Step>;

/** @return the steps that a text in the notation describes. */
Steps parseSteps(model::Layout layout, const std::string& text);

/** @return the accesses among the steps, in the order in which they come if none fails. */
std::vector<Step*> accessesOf(Steps& steps);

/** What a call shows of itself. */
struct Behaviour {
    std::string answer;
    /** The system calls on nodes, a line each, as the trace has them without their times. */
    std::string trace;
    /** The log, cut down to priority and message. */
    std::string log = {};

    /** @return all of it, to be compared. */
    std::string text() const { return answer + "\n\n" + trace + "\n" + log; }
};

/** @return what an operation shows by such steps, which may differ from its own, for a caller. */
Behaviour behaviourOf(model::Layout layout, const Operation& operation, const Steps& steps,
                      uid_t caller);

/** Puts into a driver's nodes what the steps read, and makes go wrong what they say does. */
void prepareNodes(const std::string& directory, model::Layout layout, Steps steps);

}  // namespace tests
