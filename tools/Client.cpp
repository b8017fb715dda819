// SPDX-License-Identifier: Apache-2.0
#include "Client.h"

#include <cerrno>
#include <cstdlib>
#include <cstring>
#include <fstream>
#include <iostream>

Client::Client()
    : mProgram("vibratorctl", VERSION,
               "Calls the vibrator service, and shows what the driver was told.") {
    constexpr cli::Numbers kTimeouts = {"a time in s", 0, 3600};
    cli::Command& shared = mProgram.shared();
    mInstance = shared.text("--instance NAME", "name of the service's instance", "default");
    mTimeout = shared.number("--timeout SECONDS", kTimeouts,
                             "the longest that a call may take; 0: no limit", 10);
    mJson = shared.flag("--json", "print each answer as a line of JSON");
    mVerbose = shared.flag("-v,--verbose", "also print the interface's operation and its status");
    shared.note("Exit code: 0 done; 1 the service refused, doctor found a problem, or the output "
                "could not be written; 2 a mistake in the command line or in a file; 3 the "
                "service cannot be reached.")
            .note("Only root and uid 1000 (system) may make the calls under \"For root and "
                  "system\".")
            .note("\"vibratorctl help COMMAND\" shows a command's options and an example.");
}

int Client::run(int argc, char** argv) {
    int code = runCommand(argc, argv);
    errno = 0;
    if (!std::cout.flush()) {
        std::cerr << "vibratorctl: standard output cannot be written: "
                  << strerror(errno != 0 ? errno : EIO) << '\n';
        code = kRefused;
    }
    return code;
}

int Client::runCommand(int argc, char** argv) {
    const auto fail = [this](const char* status, const std::string& reason, int code) {
        // A command line with a mistake in it is still to be answered in JSON.
        mReport.isJson = *mJson;
        const cli::Command* command = mProgram.current();
        mReport.failure(command == nullptr ? "" : command->name(), status, reason);
        return code;
    };
    try {
        return mProgram.run(argc, argv, [this] {
            service::setCallTimeout(*mTimeout);
            mReport = {*mJson, *mVerbose};
            return *mJson;
        });
    } catch (const cli::UsageError& error) {
        return fail("USAGE", error.what(), kUsage);
    } catch (const service::Unreachable& error) {
        return fail("UNREACHABLE",
                    std::string("the service cannot be reached: ") + error.what() +
                            "; \"vibratorctl doctor\" says what to do",
                    kUnreachable);
    } catch (const std::exception& error) {
        return fail("FAILED", error.what(), kRefused);
    }
}

int Client::answer(const Operation& operation, VibratorStatus status, Answer answer) const {
    if (mStep == nullptr) {
        return mReport.answer(mProgram.current()->name(), operation, status, answer);
    }
    answer.argument = mStep->argument();
    answer.members.update(mStep->place());
    return mReport.answer(mStep->name, operation, status, answer);
}

std::string simulationDirectory() {
    const char* directory = getenv("VIBRATOR_SIM_DIR");
    return directory == nullptr ? "" : directory;
}

std::string readInput(const std::string& name) {
    constexpr size_t kMost = 64 << 20;
    errno = 0;
    std::ifstream file(name);
    std::istream& input = name == "-" ? std::cin : file;
    std::string text;
    char block[65536];
    while (text.size() <= kMost && (input.read(block, sizeof(block)) || input.gcount() > 0))
        text.append(block, static_cast<size_t>(input.gcount()));
    if (text.size() > kMost) throw cli::UsageError(name + ": more than 64 MiB");
    if (input.bad() || (name != "-" && !file.is_open())) {
        throw cli::UsageError(name + ": cannot be read: " + strerror(errno != 0 ? errno : EIO));
    }
    return text;
}
