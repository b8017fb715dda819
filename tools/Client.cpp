// SPDX-License-Identifier: Apache-2.0
#include "Client.h"

namespace vibratorctl {

namespace {

/** The service cannot be reached. */
constexpr int kUnreachable = 3;

}  // namespace

Client::Client()
    : Program("vibratorctl", VERSION,
              "Calls the vibrator service, and shows what the driver was told."),
      mInstance(shared().text("--instance NAME", "name of the service's instance", "default")),
      mTimeout(shared().number("--timeout SECONDS", {"a time like 10, 500ms or 2m", 0, 3600, "s"},
                               "the longest that a call may take; 0: no limit", 10)),
      // In braces, so that the options are added in this order.
      mReport{shared().flag("--json", "print each answer as a line of JSON"),
              shared().flag("-v, --verbose", "also print the interface's operation and its status"),
              [this] { return serverOf(*service()).value_or(thisProcess()); }} {
    shared().note("Exit code: 0 done; 1 the service refused, doctor found a problem, or the output "
                  "could not be written; 2 a mistake in the command line or in a file; 3 the "
                  "service cannot be reached.")
            .note("Only " + permittedUsers() +
                  R"( may make the calls under "For root and system".)")
            .note("\"vibratorctl help COMMAND\" shows a command's options and an example.");
}

int Client::perform(const cli::Command& command) {
    setCallTimeout(std::chrono::milliseconds(*mTimeout));
    mReport.setSubject({command.name});
    try {
        return Program::perform(command);
    } catch (const Unreachable& error) {
        complain("UNREACHABLE", std::string("the service cannot be reached: ") + error.what() +
                                        "; \"vibratorctl doctor\" says what to do");
        return kUnreachable;
    }
}

void Client::complain(const std::string& status, const std::string& reason) const {
    Program::complain(status, reason);
    if (!isJson()) return;
    Report report = mReport;
    report.setSubject({current()});
    report.found("", {{"status", status}, {"reason", reason}}, false);
}

}  // namespace vibratorctl
