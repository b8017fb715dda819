// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <unistd.h>

#include <cerrno>
#include <iostream>
#include <iterator>
#include <streambuf>

namespace cli {

/** What std::cout writes to while this lives: standard output; it keeps why that failed. */
class Output : public std::streambuf {
  public:
    Output() : mBefore(std::cout.rdbuf(this)) { setp(mBuffer, std::end(mBuffer)); }
    ~Output() override { std::cout.rdbuf(mBefore); }
    Output(const Output&) = delete;
    Output& operator=(const Output&) = delete;
    /** @return the errno of the first failure; 0 without one. */
    int error() const { return mError; }

  protected:
    int sync() override {
        for (const char* next = pbase(); next < pptr() && mError == 0;) {
            const ssize_t size = write(STDOUT_FILENO, next, static_cast<size_t>(pptr() - next));
            if (size >= 0) next += size;
            if (size < 0 && errno != EINTR) mError = errno;
        }
        setp(mBuffer, std::end(mBuffer));
        return mError == 0 ? 0 : -1;
    }
    int overflow(int character) override {
        if (sync() != 0) return traits_type::eof();
        return sputc(traits_type::to_char_type(character));
    }

  private:
    std::streambuf* const mBefore;
    char mBuffer[16384];
    int mError = 0;
};

}  // namespace cli
