// Time on the monotonic clock.
#pragma once

#include <cstdint>
#include <ctime>

namespace bt::platform {

constexpr uint64_t kMillisecond = 1'000'000;

inline uint64_t now_ns()
{
    timespec now{};
    clock_gettime(CLOCK_MONOTONIC, &now);
    return static_cast<uint64_t>(now.tv_sec) * 1'000'000'000 + static_cast<uint64_t>(now.tv_nsec);
}

inline timespec to_timespec(uint64_t ns)
{
    timespec time{};
    time.tv_sec = static_cast<time_t>(ns / 1'000'000'000);
    time.tv_nsec = static_cast<decltype(time.tv_nsec)>(ns % 1'000'000'000);
    return time;
}

} // namespace bt::platform
