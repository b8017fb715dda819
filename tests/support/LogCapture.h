// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <string>

/** Collects, in place of the terminal, what this process writes to standard error. */
class LogCapture {
  public:
    LogCapture();
    LogCapture(const LogCapture&) = delete;
    LogCapture& operator=(const LogCapture&) = delete;
    ~LogCapture();

    /** @return what has been written since the last call. */
    std::string takeText();

  private:
    int mBefore;
    int mFile;
    long mRead = 0;
};

/**
 * @return a log, with each line of the service object's tag cut down to its priority and message,
 *     like "E Pemission denied (2000)".
 */
std::string cutDown(const std::string& log);
