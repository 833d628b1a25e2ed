// A registered listener: the process's own number, its entries in the listener table, and the events that arrive.
#pragma once

#include "catalogue/decode.h"

#include <chrono>
#include <cstdint>
#include <optional>
#include <vector>

namespace bt::client {

// Makes SIGINT, SIGTERM and SIGHUP end a wait of Listener::next() instead of the process.
void catch_stop_signals();
bool stop_requested();

using Clock = std::chrono::steady_clock;
using Deadline = std::optional<Clock::time_point>; // empty: no limit

constexpr double kShortestTimeout = 0.001; // seconds
constexpr double kLongestTimeout = 1e9;

// So many seconds from now; 0 means no limit.
Deadline time_limit(double seconds);

class Listener {
public:
    // Claims a free process number and registers for the events. Throws Failure.
    explicit Listener(const std::vector<uint32_t>& event_ids);
    ~Listener();
    Listener(const Listener&) = delete;
    Listener& operator=(const Listener&) = delete;

    // The next event; none when a stop signal came or `until` passed. Throws Failure when the unit goes away.
    std::optional<BtMessage> next(Deadline until);

private:
    void leave();

    std::vector<uint32_t> handles_;
};

} // namespace bt::client
