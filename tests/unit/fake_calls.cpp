// The calls of the platform as the fake one answers them.
#include "fake_state.h"

#include <algorithm>
#include <cstdarg>
#include <cstdio>
#include <cstdlib>
#include <cstring>

using namespace fake;

namespace {

// The state, for the time of a call.
class Call {
public:
    Call() : guard(state().mutex), s(state().script) { ++depth; }
    ~Call() { --depth; }

    // Records the call and tells whether the script fails it.
    bool fails(const std::string& call, const std::string& detail = "")
    {
        s.calls.push_back(detail.empty() ? call : call + "(" + detail + ")");
        ++s.counted;
        return s.counted == s.fail_nth || (s.fail_from != 0 && s.counted >= s.fail_from) || s.fail_only == call;
    }

    std::unique_lock<std::recursive_mutex> guard;
    Script& s;
};

Lock* lock_of(uint32_t handle)
{
    std::vector<Lock>& locks = state().locks;
    const uint32_t index = handle - kFirstHandle;
    return handle >= kFirstHandle && index < locks.size() ? &locks[index] : nullptr;
}

std::string joined(std::initializer_list<uint32_t> numbers)
{
    std::string text;
    for (const uint32_t number : numbers)
        text += (text.empty() ? "" : ",") + std::to_string(number);
    return text;
}

std::string formatted(const char* format, va_list arguments)
{
    char text[8192];
    std::vsnprintf(text, sizeof text, format, arguments);
    return text;
}

} // namespace

int32_t _sys_SndMsg(uint32_t pno, uint32_t size, const void* message, uint32_t zero)
{
    Call call;
    if (call.fails("SndMsg")) return kSendFailure;
    const auto* const bytes = static_cast<const uint8_t*>(message);
    call.s.posts.push_back({pno, zero, Bytes(bytes, bytes + size)});
    if (call.s.at_send) call.s.at_send();
    return call.s.send_answer;
}

int32_t _sys_RcvMsg(uint32_t own_pno, uint32_t size, void* buffer, uint32_t zero)
{
    Call call;
    if (call.fails("RcvMsg", joined({own_pno, size, zero}))) return -1;
    if (call.s.incoming.empty()) return call.s.receive_answer;
    const Bytes message = call.s.incoming.front();
    call.s.incoming.pop_front();
    std::memcpy(buffer, message.data(), std::min<size_t>(size, message.size()));
    return 1;
}

uint32_t _sys_GetPno()
{
    return state().script.pno;
}

void _sys_Exit(int32_t code)
{
    std::fprintf(stderr, "the library ended the process\n");
    std::_Exit(code);
}

uint32_t _sys_CreateSemaphore(const char* name)
{
    Call call;
    if (call.fails("CreateSemaphore", name)) return 0;
    if (lock_handle(name) == 0) state().locks.push_back({name, false, {}});
    return lock_handle(name);
}

int32_t _sys_SemLock(uint32_t handle)
{
    Call call;
    const std::thread::id self = std::this_thread::get_id();
    if (call.fails("SemLock") || lock_of(handle) == nullptr) return kLockFailure;
    state().lock_freed.wait(call.guard, [&] { return !lock_of(handle)->held || lock_of(handle)->holder == self; });

    Lock* const lock = lock_of(handle);
    if (lock->held) return kLockFailure;
    lock->held = true;
    lock->holder = self;
    call.s.deepest = std::max(call.s.deepest, held_locks());
    return 0;
}

int32_t _sys_SemUnlock(uint32_t handle)
{
    Call call;
    Lock* const lock = lock_of(handle);
    const bool failing = call.fails("SemUnlock");
    if (lock == nullptr || !lock->held) {
        ++call.s.stray;
        return kUnlockFailure;
    }
    lock->held = false;
    state().lock_freed.notify_all();
    return failing ? kUnlockFailure : 0;
}

int32_t _sys_LinkShareData(const char* name, void** address, uint32_t* size)
{
    Call call;
    call.s.sizes_asked.push_back(*size);
    const auto found = call.s.areas.find(name);
    const bool failing = call.fails("LinkShareData", name), found_one = found != call.s.areas.end();
    *address = found_one ? found->second.at : nullptr; // also when the result says that it failed
    if (failing || !found_one || *size > found->second.size) return kLinkFailure;
    *size = found->second.reported;
    return 0;
}

int32_t _sys_ReqTimerStart(uint32_t pno, uint32_t timer_id, uint32_t two, uint32_t time)
{
    Call call;
    call.fails("ReqTimerStart", joined({pno, timer_id, two, time}));
    return call.s.timer_answer;
}

int32_t _sys_TimerStop(uint32_t pno, uint32_t timer_id, uint32_t two)
{
    Call call;
    call.fails("TimerStop", joined({pno, timer_id, two}));
    return call.s.timer_answer;
}

int32_t _sys_SetupZX44API(uint32_t value)
{
    Call call;
    call.s.calls.push_back("SetupZX44API(" + std::to_string(value) + ")");
    return 0;
}

void QvLog(uint32_t facility, uint32_t zone, const char* tag, const char* format, ...)
{
    Call call;
    va_list arguments;
    va_start(arguments, format);
    call.s.logs.push_back({"QvLog", {facility, zone}, tag, formatted(format, arguments)});
    va_end(arguments);
}

void QvLogSetProcessName(const char* name)
{
    Call call;
    call.s.logs.push_back({"QvLogSetProcessName", {}, "", name});
}

void QvLogSetZones(int32_t count, ...)
{
    Call call;
    LogRecord record{"QvLogSetZones", {count}, "", ""};
    va_list arguments;
    va_start(arguments, count);
    for (int32_t i = 0; i < count; ++i)
        record.numbers.push_back(va_arg(arguments, int));
    va_end(arguments);
    call.s.logs.push_back(record);
}

void ZelLog(int32_t level, int32_t line, const char* function, const char* format, ...)
{
    Call call;
    va_list arguments;
    va_start(arguments, format);
    call.s.logs.push_back({"ZelLog", {level, line}, function, formatted(format, arguments)});
    va_end(arguments);
}
