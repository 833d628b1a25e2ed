// What the fake platform records and how it was told to answer; its script writes it, its calls read it.
#pragma once

#include "fake_platform.h"

#include <condition_variable>
#include <deque>
#include <map>
#include <mutex>
#include <thread>

namespace fake {

struct Area {
    uint8_t* at = nullptr;
    uint32_t size = 0, reported = 0;
};

struct Lock {
    std::string name;
    bool held = false;
    std::thread::id holder{};
};

// All that reset() forgets.
struct Script {
    std::vector<Post> posts;
    std::vector<LogRecord> logs;
    std::vector<std::string> calls;
    std::vector<uint32_t> sizes_asked;
    std::deque<Bytes> incoming;
    std::map<std::string, Area> areas;
    std::function<void()> at_send;
    uint32_t pno = 0x08C2;
    int32_t send_answer = 0, timer_answer = 0, receive_answer = 0;
    uint32_t counted = 0, fail_nth = 0, fail_from = 0;
    std::string fail_only;
    uint32_t deepest = 0, stray = 0;
};

struct State {
    std::recursive_mutex mutex;
    std::condition_variable_any lock_freed;
    std::vector<Lock> locks; // handle = index + kFirstHandle
    std::vector<std::pair<void*, size_t>> mappings;
    Script script;
};

constexpr uint32_t kFirstHandle = 0x100;
inline thread_local int depth = 0; // of calls of this platform

State& state();

} // namespace fake
