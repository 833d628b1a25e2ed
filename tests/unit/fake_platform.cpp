#include "fake_platform.h"

#include <gtest/gtest.h>
#include <sys/mman.h>
#include <sys/wait.h>
#include <unistd.h>

#include <algorithm>
#include <condition_variable>
#include <csetjmp>
#include <cstdarg>
#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <deque>
#include <filesystem>
#include <fstream>
#include <map>
#include <mutex>
#include <sstream>
#include <thread>

namespace fake {
namespace {

struct Area {
    uint8_t* at = nullptr;
    uint32_t size = 0;
    uint32_t reported = 0;
};

struct Mapping {
    void* base;
    size_t length;
};

struct Lock {
    std::string name;
    bool held = false;
    std::thread::id holder{};
};

struct State {
    std::recursive_mutex mutex;
    std::condition_variable_any lock_freed;
    std::vector<Post> posts;
    std::vector<LogRecord> logs;
    std::vector<TimerCall> timers;
    std::vector<std::string> calls;
    std::vector<uint32_t> sizes_asked;
    std::deque<Bytes> incoming;
    std::map<std::string, Area> areas;
    std::vector<Mapping> mappings;
    std::vector<Lock> locks; // handle = index + 0x100
    uint32_t pno = 0x08C2;
    int32_t send_answer = 0, timer_answer = 0, receive_answer = 0;
    uint32_t counted = 0, fail_nth = 0, fail_from = 0;
    std::string fail_only;
    std::function<void()> at_send;
    uint32_t deepest = 0, stray = 0;
    jmp_buf* exit_target = nullptr;
    int32_t exit_code = 0;
};

constexpr uint32_t kFirstHandle = 0x100;

thread_local int depth = 0;

struct Inside {
    Inside() { ++depth; }
    ~Inside() { --depth; }
};

State& state()
{
    static State instance;
    return instance;
}

// Records the call and tells whether the script fails it.
bool fails(const std::string& name, const std::string& detail = "")
{
    State& s = state();
    s.calls.push_back(detail.empty() ? name : name + "(" + detail + ")");
    ++s.counted;
    return s.counted == s.fail_nth || (s.fail_from != 0 && s.counted >= s.fail_from) || s.fail_only == name;
}

std::string formatted(const char* format, va_list arguments)
{
    va_list again;
    va_copy(again, arguments);
    const int length = std::vsnprintf(nullptr, 0, format, arguments);
    std::string text(static_cast<size_t>(std::max(length, 0)), '\0');
    std::vsnprintf(text.data(), text.size() + 1, format, again);
    va_end(again);
    return text;
}

uint8_t* map_guarded(uint32_t size)
{
    const auto page = static_cast<size_t>(sysconf(_SC_PAGESIZE));
    const size_t body = std::max<size_t>((size + page - 1) / page, 1) * page;
    void* const base = mmap(nullptr, body + 2 * page, PROT_NONE, MAP_PRIVATE | MAP_ANONYMOUS, -1, 0);
    if (base == MAP_FAILED || mprotect(static_cast<uint8_t*>(base) + page, body, PROT_READ | PROT_WRITE) != 0) {
        std::perror("fake platform: mmap");
        std::abort();
    }
    std::lock_guard<std::recursive_mutex> guard(state().mutex);
    state().mappings.push_back({base, body + 2 * page});
    return static_cast<uint8_t*>(base) + page + body - size;
}

Lock* lock_of(uint32_t handle)
{
    std::vector<Lock>& locks = state().locks;
    const uint32_t index = handle - kFirstHandle;
    return handle >= kFirstHandle && index < locks.size() ? &locks[index] : nullptr;
}

} // namespace

uint16_t Post::u16(size_t at) const
{
    uint16_t value = 0;
    if (at + sizeof value <= message.size()) std::memcpy(&value, message.data() + at, sizeof value);
    return value;
}

uint32_t Post::u32(size_t at) const
{
    uint32_t value = 0;
    if (at + sizeof value <= message.size()) std::memcpy(&value, message.data() + at, sizeof value);
    return value;
}

void reset()
{
    State& s = state();
    std::lock_guard<std::recursive_mutex> guard(s.mutex);
    s.posts.clear();
    s.logs.clear();
    s.timers.clear();
    s.calls.clear();
    s.sizes_asked.clear();
    s.incoming.clear();
    s.areas.clear();
    for (const Mapping& mapping : s.mappings)
        munmap(mapping.base, mapping.length);
    s.mappings.clear();
    for (Lock& lock : s.locks)
        lock.held = false;
    s.pno = 0x08C2;
    s.send_answer = s.timer_answer = s.receive_answer = 0;
    s.counted = s.fail_nth = s.fail_from = 0;
    s.fail_only.clear();
    s.at_send = nullptr;
    s.deepest = s.stray = 0;
}

const std::vector<Post>& posts()
{
    return state().posts;
}
const std::vector<LogRecord>& logs()
{
    return state().logs;
}
const std::vector<TimerCall>& timers()
{
    return state().timers;
}
const std::vector<std::string>& calls()
{
    return state().calls;
}
const std::vector<uint32_t>& sizes_asked()
{
    return state().sizes_asked;
}

void set_pno(uint32_t pno)
{
    state().pno = pno;
}
void answer_send(int32_t result)
{
    state().send_answer = result;
}
void answer_timer(int32_t result)
{
    state().timer_answer = result;
}
void at_send(std::function<void()> look)
{
    state().at_send = std::move(look);
}
void incoming(const Bytes& message)
{
    state().incoming.push_back(message);
}
void answer_receive(int32_t result)
{
    state().receive_answer = result;
}

void fail_nth(uint32_t n)
{
    state().fail_nth = n;
    state().counted = 0;
}

void fail_from(uint32_t n)
{
    state().fail_from = n;
    state().counted = 0;
}

void fail_only(const char* call)
{
    state().fail_only = call;
}
uint32_t counted_calls()
{
    return state().counted;
}
bool inside()
{
    return depth > 0;
}

uint8_t* area(const std::string& name, uint32_t size, uint8_t fill)
{
    uint8_t* const at = map_guarded(size);
    std::memset(at, fill, size);
    state().areas[name] = {at, size, size};
    return at;
}

uint8_t* find_area(const std::string& name)
{
    const auto found = state().areas.find(name);
    return found == state().areas.end() ? nullptr : found->second.at;
}

void remove_area(const std::string& name)
{
    state().areas.erase(name);
}
void report_size(const std::string& name, uint32_t size)
{
    state().areas[name].reported = size;
}

void null_area(const std::string& name)
{
    state().areas[name] = {nullptr, UINT32_MAX, 0};
}

uint8_t* guarded(uint32_t size, uint8_t fill)
{
    uint8_t* const at = map_guarded(size);
    std::memset(at, fill, size);
    return at;
}

uint32_t held_locks()
{
    const std::vector<Lock>& locks = state().locks;
    return static_cast<uint32_t>(std::count_if(locks.begin(), locks.end(), [](const Lock& lock) { return lock.held; }));
}

uint32_t deepest_lock()
{
    return state().deepest;
}
uint32_t stray_unlocks()
{
    return state().stray;
}

uint32_t lock_handle(const std::string& name)
{
    const std::vector<Lock>& locks = state().locks;
    for (size_t i = 0; i < locks.size(); ++i)
        if (locks[i].name == name) return kFirstHandle + static_cast<uint32_t>(i);
    return 0;
}

std::optional<int32_t> exit_code_of(const std::function<void()>& body)
{
    jmp_buf target;
    state().exit_target = &target;
    if (setjmp(target) == 0) {
        body();
        state().exit_target = nullptr;
        return std::nullopt;
    }
    state().exit_target = nullptr;
    return state().exit_code;
}

bool in_child(const std::function<void()>& body)
{
    std::fflush(nullptr);
    const pid_t child = fork();
    if (child == 0) {
        body();
        std::fflush(nullptr);
        _exit(testing::Test::HasFailure() ? 1 : 0);
    }
    int status = 0;
    return child > 0 && waitpid(child, &status, 0) == child && WIFEXITED(status) && WEXITSTATUS(status) == 0;
}

const std::string& root()
{
    static const std::string folder = std::getenv("BT_SERVICE_ROOT");
    return folder;
}

std::string write_file(const std::string& unit_path, const Bytes& content)
{
    const std::string path = root() + unit_path;
    std::filesystem::create_directories(std::filesystem::path(path).parent_path());
    std::ofstream file(path, std::ios::binary | std::ios::trunc);
    file.write(reinterpret_cast<const char*>(content.data()), static_cast<std::streamsize>(content.size()));
    return path;
}

std::optional<Bytes> read_file(const std::string& unit_path)
{
    std::ifstream file(root() + unit_path, std::ios::binary);
    if (!file) return std::nullopt;
    return Bytes(std::istreambuf_iterator<char>(file), std::istreambuf_iterator<char>());
}

void remove_file(const std::string& unit_path)
{
    std::filesystem::remove_all(root() + unit_path);
}

Bytes hex(const std::string& text)
{
    Bytes bytes;
    std::istringstream words(text);
    for (std::string word; words >> word;) {
        const size_t star = word.find('*');
        const size_t times = star == std::string::npos ? 1 : std::stoul(word.substr(star + 1));
        const std::string digits = word.substr(0, star);
        Bytes unit;
        for (size_t i = 0; i + 1 < digits.size(); i += 2)
            unit.push_back(static_cast<uint8_t>(std::stoul(digits.substr(i, 2), nullptr, 16)));
        for (size_t i = 0; i < times; ++i)
            bytes.insert(bytes.end(), unit.begin(), unit.end());
    }
    return bytes;
}

std::string to_hex(const Bytes& bytes)
{
    std::string text;
    char digits[4];
    for (const uint8_t byte : bytes) {
        std::snprintf(digits, sizeof digits, "%02X ", byte);
        text += digits;
    }
    return text;
}

} // namespace fake

using namespace fake;

int32_t _sys_SndMsg(uint32_t pno, uint32_t size, const void* message, uint32_t zero)
{
    const Inside inside_platform;
    std::lock_guard<std::recursive_mutex> guard(state().mutex);
    if (fails("SndMsg")) return kSendFailure;
    const auto* const bytes = static_cast<const uint8_t*>(message);
    state().posts.push_back({pno, zero, Bytes(bytes, bytes + size)});
    if (state().at_send) state().at_send();
    return state().send_answer;
}

int32_t _sys_RcvMsg(uint32_t own_pno, uint32_t size, void* buffer, uint32_t)
{
    const Inside inside_platform;
    std::lock_guard<std::recursive_mutex> guard(state().mutex);
    if (fails("RcvMsg", std::to_string(own_pno) + "," + std::to_string(size))) return -1;
    if (state().incoming.empty()) return state().receive_answer;
    const Bytes message = state().incoming.front();
    state().incoming.pop_front();
    std::memcpy(buffer, message.data(), std::min<size_t>(size, message.size()));
    return 1;
}

uint32_t _sys_GetPno()
{
    return state().pno;
}

void _sys_Exit(int32_t code)
{
    state().exit_code = code;
    if (state().exit_target == nullptr) {
        std::fprintf(stderr, "the library ended the process with %d\n", code);
        std::abort();
    }
    std::longjmp(*state().exit_target, 1);
}

uint32_t _sys_CreateSemaphore(const char* name)
{
    const Inside inside_platform;
    std::lock_guard<std::recursive_mutex> guard(state().mutex);
    if (fails("CreateSemaphore", name)) return 0;
    if (lock_handle(name) == 0) state().locks.push_back({name, false, {}});
    return lock_handle(name);
}

int32_t _sys_SemLock(uint32_t handle)
{
    const Inside inside_platform;
    std::unique_lock<std::recursive_mutex> guard(state().mutex);
    const std::thread::id self = std::this_thread::get_id();
    if (fails("SemLock") || lock_of(handle) == nullptr) return kLockFailure;
    state().lock_freed.wait(guard, [&] { return !lock_of(handle)->held || lock_of(handle)->holder == self; });

    Lock* const lock = lock_of(handle);
    if (lock->held) return kLockFailure;
    lock->held = true;
    lock->holder = self;
    state().deepest = std::max(state().deepest, held_locks());
    return 0;
}

int32_t _sys_SemUnlock(uint32_t handle)
{
    const Inside inside_platform;
    std::lock_guard<std::recursive_mutex> guard(state().mutex);
    Lock* const lock = lock_of(handle);
    const bool failing = fails("SemUnlock");
    if (lock == nullptr || !lock->held) {
        ++state().stray;
        return kUnlockFailure;
    }
    lock->held = false;
    state().lock_freed.notify_all();
    return failing ? kUnlockFailure : 0;
}

int32_t _sys_LinkShareData(const char* name, void** address, uint32_t* size)
{
    const Inside inside_platform;
    std::lock_guard<std::recursive_mutex> guard(state().mutex);
    state().sizes_asked.push_back(*size);
    const auto found = state().areas.find(name);
    const bool failing = fails("LinkShareData", name), found_one = found != state().areas.end();
    *address = found_one ? found->second.at : nullptr; // also when the result says that it failed
    if (failing || !found_one || *size > found->second.size) return kLinkFailure;
    *size = found->second.reported;
    return 0;
}

int32_t _sys_ReqTimerStart(uint32_t pno, uint32_t timer_id, uint32_t two, uint32_t time)
{
    const Inside inside_platform;
    state().timers.push_back({"start", pno, timer_id, two, time});
    return fails("ReqTimerStart") ? kTimerFailure : state().timer_answer;
}

int32_t _sys_TimerStop(uint32_t pno, uint32_t timer_id, uint32_t two)
{
    const Inside inside_platform;
    state().timers.push_back({"stop", pno, timer_id, two, 0});
    return fails("TimerStop") ? kTimerFailure : state().timer_answer;
}

int32_t _sys_SetupZX44API(uint32_t value)
{
    const Inside inside_platform;
    state().calls.push_back("SetupZX44API(" + std::to_string(value) + ")");
    return 0;
}

void QvLog(uint32_t facility, uint32_t zone, const char* tag, const char* format, ...)
{
    const Inside inside_platform;
    va_list arguments;
    va_start(arguments, format);
    std::lock_guard<std::recursive_mutex> guard(state().mutex);
    state().logs.push_back({"QvLog", {facility, zone}, tag, formatted(format, arguments)});
    va_end(arguments);
}

void QvLogSetProcessName(const char* name)
{
    const Inside inside_platform;
    std::lock_guard<std::recursive_mutex> guard(state().mutex);
    state().logs.push_back({"QvLogSetProcessName", {}, "", name});
}

void QvLogSetZones(int32_t count, ...)
{
    const Inside inside_platform;
    LogRecord record{"QvLogSetZones", {count}, "", ""};
    va_list arguments;
    va_start(arguments, count);
    for (int32_t i = 0; i < count; ++i)
        record.numbers.push_back(va_arg(arguments, int));
    va_end(arguments);
    std::lock_guard<std::recursive_mutex> guard(state().mutex);
    state().logs.push_back(record);
}

void ZelLog(int32_t level, int32_t line, const char* function, const char* format, ...)
{
    const Inside inside_platform;
    va_list arguments;
    va_start(arguments, format);
    std::lock_guard<std::recursive_mutex> guard(state().mutex);
    state().logs.push_back({"ZelLog", {level, line}, function, formatted(format, arguments)});
    va_end(arguments);
}
