// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <string>
#include <vector>

using Lines = std::vector<std::string>;

/** Collects, in place of the terminal, what this process writes to standard error. */
class LogCapture {
  public:
    LogCapture();
    LogCapture(const LogCapture&) = delete;
    LogCapture& operator=(const LogCapture&) = delete;
    ~LogCapture();

    /** @return what has been written since the last call. */
    std::string takeText();
    /**
     * @return the lines since the last call, each cut down to its priority and its message, like
     *     "E Pemission denied (2000)"; a line of another tag than the service object's is whole.
     */
    Lines takeLines();

  private:
    int mBefore;
    int mFile;
    long mRead = 0;
};

/** @return the lines of a log, cut down as takeLines does. */
Lines cutDown(const std::string& log);
