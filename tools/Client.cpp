// SPDX-License-Identifier: Apache-2.0
#include "Client.h"

namespace vibratorctl {

namespace {

/** The service cannot be reached. */
constexpr int kUnreachable = 3;

}  // namespace

Client::Client()
    : Program("vibratorctl", VERSION,
              "Calls the vibrator service, and shows what the driver was told"),
      mInstance(shared().add("--instance NAME", cli::kText, "name of the service's instance",
                             "default")),
      mTimeout(shared().add("--timeout SECONDS",
                            cli::Numbers{"a time like 10, 500ms or 2m", 0, 3600, "s"},
                            "the longest that a call may take; 0: no limit", "10")),
      // In braces, so that the options are added in this order.
      mReport{shared().add("--json", cli::kFlag, "print each answer as a line of JSON"),
              shared().add("-v, --verbose", cli::kFlag,
                           "also print the interface's operation and its status"),
              [this] { return serverOf(*service()).value_or(thisProcess()); }} {
    shared().note("Exit code: 0 done; 1 the service refused, doctor found a problem, or the output "
                  "could not be written; 2 a mistake in the command line or in a file; 3 the "
                  "service cannot be reached.")
            .note("Only " + permittedUsers() +
                  R"( may make the calls under "For root and system".)")
            .note("\"vibratorctl help COMMAND\" shows a command's options and an example.");
}

int Client::perform(const cli::Command& command) {
    setCallTimeout(std::chrono::milliseconds(mTimeout->number()));
    mReport.setSubject({command.name});
    if (mReport.isJson() && !command.hasJson)
        throw cli::UsageError("has no JSON answer; leave out --json");
    try {
        return Program::perform(command);
    } catch (const Unreachable& error) {
        complain("UNREACHABLE", std::string("the service cannot be reached: ") + error.what() +
                                        "; \"vibratorctl doctor\" says what to do");
        return kUnreachable;
    }
}

void Client::warn(const std::string& text) const {
    if (!mReport.isJson()) Program::warn(text);
}

void Client::complain(const std::string& status, const std::string& reason) const {
    Program::complain(status, reason);
    if (!mReport.isJson()) return;
    Report report = mReport;
    report.setSubject({mCurrent});
    report.found("", {{"status", status}, {"reason", reason}}, false);
}

}  // namespace vibratorctl
