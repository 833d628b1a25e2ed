// The local time of log records.
#pragma once

#include <cstdio>
#include <ctime>

namespace bt::cmn {

struct LocalTime {
    bool known; // false when the clock's time could not be converted
    std::tm calendar;
    int milliseconds;
};

LocalTime local_time_now();

// Writes "2026/11/22 09:30:01.250 "; nothing when the time is not known.
void print_date_and_time(std::FILE* stream, const LocalTime& time);

} // namespace bt::cmn
