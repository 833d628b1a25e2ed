// The unit's own trace of the messages it took, read while it is being written.
#pragma once

#include "catalogue/decode.h"

#include <cstdint>
#include <fstream>
#include <optional>
#include <string>

namespace demo {

// A unit writes this trace to tmp/bt_cmn.log below its root when the switch "@FileOutLog" is on. A line carries at most
// the first 128 payload bytes.
class PostedTrace {
public:
    explicit PostedTrace(const std::string& root);

    // The next message of this id in the trace; none when the unit has not traced one since the last call.
    std::optional<bt::catalogue::Decoded> next(uint16_t id);

private:
    std::ifstream file_;
};

} // namespace demo
