// How a command ends when it cannot do what was asked: an exit code and a text that says what, where and the remedy.
#pragma once

#include <stdexcept>
#include <string>

namespace bt::client {

enum ExitCode {
    kDone = 0,
    kRefused = 1, // the call was refused, or its answer was negative
    kUsage = 2, // the command line makes no sense
    kNoUnit = 3, // no unit in the domain, or the platform layer is unusable
    kTimedOut = 4, // what was waited for did not come in time
    kNoOutput = 5, // standard output could not be written
    kInterrupted = 6, // a signal ended the wait before what was asked for had come
};

class Failure : public std::runtime_error {
public:
    Failure(ExitCode code, const std::string& text) : std::runtime_error(text), code_(code) {}
    ExitCode code() const { return code_; }

private:
    ExitCode code_;
};

} // namespace bt::client
