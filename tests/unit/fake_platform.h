// A platform for unit tests: records every call, answers from a script, fails the nth call on request.
#pragma once

#include <bt_platform/platform.h>

#include <cstdint>
#include <functional>
#include <optional>
#include <string>
#include <vector>

namespace fake {

using Bytes = std::vector<uint8_t>;

struct Post {
    uint32_t pno;
    uint32_t zero;
    Bytes message; // as many bytes as the call stated

    uint16_t length() const { return static_cast<uint16_t>(message.at(10) | message.at(11) << 8); }
    Bytes payload() const { return Bytes(message.begin() + 16, message.end()); }
};

struct LogRecord {
    std::string channel; // "QvLog", "ZelLog", "QvLogSetZones", "QvLogSetProcessName"
    std::vector<int64_t> numbers;
    std::string tag; // tag of QvLog, function of ZelLog
    std::string text; // formatted
};

// Forgets everything recorded and scripted and removes the shared areas. Lock handles stay what they were, since the
// library keeps them for the life of the process.
void reset();

// ---- what was called
const std::vector<Post>& posts();
const std::vector<LogRecord>& logs();
const std::vector<std::string>& calls(); // every call in order, e.g. "SemLock", "LinkShareData(/tmp/shm_x)"
const std::vector<uint32_t>& sizes_asked(); // size word of each LinkShareData on entry

// ---- how it answers
void set_pno(uint32_t pno);
void answer_send(int32_t result); // of every following _sys_SndMsg; default 0
void answer_timer(int32_t result); // of both timer calls; default 0
void at_send(std::function<void()> look); // run by every following _sys_SndMsg
void incoming(const Bytes& message); // queued for _sys_RcvMsg, which answers 1
void answer_receive(int32_t result); // of _sys_RcvMsg when nothing is queued; default 0

// Every call of _sys_SndMsg, _sys_RcvMsg, _sys_CreateSemaphore, _sys_SemLock, _sys_SemUnlock, _sys_LinkShareData,
// _sys_ReqTimerStart, _sys_TimerStop counts, the first being 1. A failing call returns kSendFailure and so on.
// _sys_Exit ends the test process.
void fail_nth(uint32_t n);
void fail_from(uint32_t n);
void fail_only(const char* call); // every call of that name, e.g. "SemLock"
uint32_t counted_calls();
bool inside(); // the calling thread runs code of this platform

enum : int32_t { kSendFailure = -1, kLockFailure = 51, kUnlockFailure = 52, kLinkFailure = 53 };

// ---- shared data
// Creates shared data of `size` bytes, filled with `fill`. It ends at an unreadable page: the first byte behind it
// faults. The same name again replaces it.
uint8_t* area(const std::string& name, uint32_t size, uint8_t fill = 0);
uint8_t* find_area(const std::string& name); // null when there is none
void remove_area(const std::string& name); // linking it fails from now on
void report_size(const std::string& name, uint32_t size); // what the size word of a link answers instead
void null_area(const std::string& name); // linking it succeeds, but yields no address

// Memory of `size` bytes between two unreadable pages, ending right at the second; for the caller's buffers.
// Lives until reset().
uint8_t* guarded(uint32_t size, uint8_t fill = 0xA5);

// ---- locks
uint32_t held_locks(); // locks held now
uint32_t deepest_lock(); // most locks held at once since reset
uint32_t stray_unlocks(); // unlocks of a lock that was not held
uint32_t lock_handle(const std::string& name); // 0 when never created

// Runs `body` in a fork, for what a process does once only. True when no expectation in it failed. The library's
// state is that of this process at the call, so a test that needs untouched state calls it before touching any.
bool in_child(const std::function<void()>& body);

// Runs `body` where no file can grow beyond that size; what tries to gets an error, not a signal.
void with_longest_file(size_t bytes, const std::function<void()>& body);

// Root below which the library opens its files (BT_SERVICE_ROOT of the test program), a folder of this process alone.
const std::string& root();
void write_file(const std::string& unit_path, const Bytes& content); // creates folders
std::optional<Bytes> read_file(const std::string& unit_path);
void remove_file(const std::string& unit_path);

// "0A FF" -> bytes. Blanks and newlines are ignored; "41*3" repeats a byte.
Bytes hex(const std::string& text);
std::string to_hex(const Bytes& bytes);

} // namespace fake
