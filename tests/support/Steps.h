// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "SimulatedDriver.h"
#include "support/LogCapture.h"

#include <map>
#include <optional>
#include <string>
#include <vector>

/**
 * The notation for what an operation does: its steps in their true order, one a line, or several
 * with "; " between them. Text stands as the trace and the log show it, "\n" for a newline.
 *
 *     D text, E text         a line of the log
 *     @                      the caller is judged; for one who is refused, the step fails
 *     intensity?             a probe that opens a node for reading and writing; ?r for reading
 *     intensity=500          a number is written
 *     event_cmd="OFF\n"      a text is written
 *     num_waves:7="12\n"     a number is read, of at most 7 bytes
 *     motor_type:31="NONE\n" a text is read; :31r= where the node is opened for reading only
 *     on=20, off, running?   what these do in the driver's layout
 *     ( ... )                what an operation does by calling another one
 *
 * After a node's name !ENOENT says that it cannot be opened; at the end of a step !EIO says that
 * the transfer fails and !3 that it stops after 3 bytes.
 *
 * The steps of an operation also tell what it does when one of them fails in another way:
 *
 *     !E text, !intensity?   after a step or a bracket: what follows where that one has failed
 *     !=false                the same, and there the operation ends with this answer
 *     )~, on=20~             a failure does not matter, the operation goes on after this step
 *
 * In the lines after a failure {result} is what the transfer yielded, {error} its errno in words.
 * Otherwise a failure ends a bracket, and in the end the operation.
 */
struct Step {
    enum Kind { kLine, kAnswer, kGate, kBegin, kEnd, kProbe, kWrite, kRead };
    Kind kind = kLine;
    /** Whether it follows only where the step before has failed. */
    bool isAfterFailure = false;
    /** Whether the operation goes on when the step fails. */
    bool isOptional = false;

    /** The line, the answer, or what is written or read. */
    std::string text;
    std::string leaf;
    bool readsOnly = false;
    /** How many bytes a read asks for. */
    size_t size = 0;
    /** Whether the access is a primitive's, with its lines of the log. */
    bool isPrimitive = false;

    /** What goes wrong with "open", "read", "write" or "close", as the simulator takes it. */
    std::map<std::string, std::string> faults;
    /** How often it goes wrong; only EINTR passes. */
    unsigned times = 1;
    /** Whether the steps that follow are what follows where it goes wrong. */
    bool isFaultTold = false;

    bool isAccess() const { return kind >= kProbe; }
    /** @return what the access does to an open node: "read", "write", or nothing. */
    std::string transfer() const;
    /** @return the text, without escapes. */
    std::string bytes() const;
};

/** @return the steps that a text in the notation describes. */
std::vector<Step> parseSteps(model::Layout layout, const std::string& text);

/** What is against a call beside what goes wrong with its steps. */
struct Circumstances {
    /** The caller who is refused. */
    std::optional<uid_t> refused = std::nullopt;
    /** There is no driver, and no path of one. */
    bool isDriverAbsent = false;
};

/** What a call shows of itself. */
struct Behaviour {
    std::string answer;
    /** The system calls on nodes, as the trace has them, without their times. */
    Lines trace;
    /** The log, cut down to priority and message. */
    Lines log;
};

/**
 * @param answer what the operation answers when the steps come to their end.
 * @param answerFailed the same, when they do not and do not tell another answer.
 * @return what the steps should show.
 */
Behaviour behaviourOf(model::Layout layout, const std::vector<Step>& steps,
                      const std::string& answer, const std::string& answerFailed,
                      const Circumstances& circumstances = {});

/** Puts into a driver's nodes what the steps read, and makes go wrong what they say does. */
void prepareNodes(const std::string& directory, model::Layout layout,
                  const std::vector<Step>& steps);
