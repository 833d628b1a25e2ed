// One record on a stdio stream, whole: other threads write before or behind it.
#pragma once

#include <stdio.h>

namespace bt::cmn {

// Holds the stream for as long as it lives and flushes it at the end.
class StreamRecord {
public:
    explicit StreamRecord(FILE* stream) : stream_(stream) { flockfile(stream_); }
    ~StreamRecord()
    {
        fflush(stream_);
        funlockfile(stream_);
    }
    StreamRecord(const StreamRecord&) = delete;
    StreamRecord& operator=(const StreamRecord&) = delete;

private:
    FILE* const stream_;
};

} // namespace bt::cmn
