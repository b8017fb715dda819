// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "Child.h"
#include "Folder.h"
#include "PrivateDirectory.h"

#include <csignal>
#include <functional>
#include <string>
#include <vector>

/** What runs the service on a driver that is there only for a while. */
namespace session {

/**
 * @param places where to look, relative to this program's directory.
 * @return a file that belongs to this program, beside it or where it is built or installed.
 * @throw std::runtime_error
 */
std::string findProgram(const std::string& name, const std::vector<const char*>& places);

/**
 * @return two lines for another shell, with which it uses the driver and the service of the session
 *     that this process is in; "" if it is in none.
 */
std::string exportLines();

/** The service on a driver, and a command that uses both. */
class Session {
  public:
    /** Finds the programs. From now on signals wait until run takes them. */
    Session();

    /** @return a path in a directory that is removed when this process ends, in whatever way. */
    std::string operator/(const std::string& name) const { return mPlace / name; }

    /** What the service is to run on. */
    struct Driver {
        /** Its directory, with its trace and the service's log; VIBRATOR_SIM_DIR has it. */
        std::string directory;
        /** Called in the service's process before it begins. */
        std::function<void()> prepare = [] {};
        /** Called when the service has ended before the command. */
        std::function<void()> whenEnded = [] {};
        /** What it is and what to try in a shell beside it, in lines. */
        std::string banner = {};
    };
    /**
     * Starts the service, and runs a command when it answers. When the command or this process
     * ends, in whatever way, the service is ended.
     *
     * @param command empty for a shell.
     * @return the command's exit code; 128 plus the signal's number if a signal ended it.
     * @throw std::runtime_error that says what kept the service from running on the driver.
     */
    int run(const Driver& driver, std::vector<std::string> command);

  private:
    void linkPrograms() const;
    void setEnvironment(const std::string& directory) const;
    int takeSignal(siginfo_t* info, bool waits) const;
    void awaitDaemon(Child& daemon, const simulator::Folder& directory) const;
    int awaitCommand(Child& command, Child& daemon, const Driver& driver) const;

    std::string mDaemon;
    std::string mClient;
    // Before the directory: the process that removes it must not get the signals either.
    sigset_t mSignals;
    PrivateDirectory mPlace;
};

}  // namespace session
