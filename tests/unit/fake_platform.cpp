#include "fake_state.h"

#include <gtest/gtest.h>
#include <sys/mman.h>
#include <sys/resource.h>
#include <sys/wait.h>
#include <unistd.h>

#include <algorithm>
#include <csignal>
#include <cstring>
#include <filesystem>
#include <fstream>
#include <sstream>

namespace fake {
namespace {

Script& script()
{
    return state().script;
}

} // namespace

State& state()
{
    static State instance;
    return instance;
}

void reset()
{
    State& s = state();
    std::lock_guard<std::recursive_mutex> guard(s.mutex);
    s.script = {};
    for (const auto& [base, length] : s.mappings)
        munmap(base, length);
    s.mappings.clear();
    for (Lock& lock : s.locks)
        lock.held = false;
}

const std::vector<Post>& posts()
{
    return script().posts;
}
const std::vector<LogRecord>& logs()
{
    return script().logs;
}
const std::vector<std::string>& calls()
{
    return script().calls;
}
const std::vector<uint32_t>& sizes_asked()
{
    return script().sizes_asked;
}

void set_pno(uint32_t pno)
{
    script().pno = pno;
}
void answer_send(int32_t result)
{
    script().send_answer = result;
}
void answer_timer(int32_t result)
{
    script().timer_answer = result;
}
void at_send(std::function<void()> look)
{
    script().at_send = std::move(look);
}
void incoming(const Bytes& message)
{
    script().incoming.push_back(message);
}
void answer_receive(int32_t result)
{
    script().receive_answer = result;
}

void fail_nth(uint32_t n)
{
    script().fail_nth = n;
    script().counted = 0;
}
void fail_from(uint32_t n)
{
    script().fail_from = n;
    script().counted = 0;
}
void fail_only(const char* call)
{
    script().fail_only = call;
}
uint32_t counted_calls()
{
    return script().counted;
}
bool inside()
{
    return depth > 0;
}

uint8_t* area(const std::string& name, uint32_t size, uint8_t fill)
{
    uint8_t* const at = guarded(size, fill);
    script().areas[name] = {at, size, size};
    return at;
}

uint8_t* find_area(const std::string& name)
{
    const auto found = script().areas.find(name);
    return found == script().areas.end() ? nullptr : found->second.at;
}

void remove_area(const std::string& name)
{
    script().areas.erase(name);
}
void report_size(const std::string& name, uint32_t size)
{
    script().areas[name].reported = size;
}
void null_area(const std::string& name)
{
    script().areas[name] = {nullptr, UINT32_MAX, 0};
}

uint8_t* guarded(uint32_t size, uint8_t fill)
{
    const auto page = static_cast<size_t>(sysconf(_SC_PAGESIZE));
    const size_t body = std::max<size_t>((size + page - 1) / page, 1) * page, length = body + 2 * page;
    void* const base = mmap(nullptr, length, PROT_NONE, MAP_PRIVATE | MAP_ANONYMOUS, -1, 0);
    if (base == MAP_FAILED || mprotect(static_cast<uint8_t*>(base) + page, body, PROT_READ | PROT_WRITE) != 0) {
        std::perror("fake platform: mmap");
        std::abort();
    }
    std::lock_guard<std::recursive_mutex> guard(state().mutex);
    state().mappings.push_back({base, length});
    uint8_t* const at = static_cast<uint8_t*>(base) + page + body - size;
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
    return script().deepest;
}
uint32_t stray_unlocks()
{
    return script().stray;
}

uint32_t lock_handle(const std::string& name)
{
    const std::vector<Lock>& locks = state().locks;
    for (size_t i = 0; i < locks.size(); ++i)
        if (locks[i].name == name) return kFirstHandle + static_cast<uint32_t>(i);
    return 0;
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

void with_longest_file(size_t bytes, const std::function<void()>& body)
{
    rlimit usual{};
    getrlimit(RLIMIT_FSIZE, &usual);
    const rlimit tight = {bytes, usual.rlim_max};
    const auto handler = signal(SIGXFSZ, SIG_IGN);
    setrlimit(RLIMIT_FSIZE, &tight);
    body();
    setrlimit(RLIMIT_FSIZE, &usual);
    signal(SIGXFSZ, handler);
}

const std::string& root()
{
    static const std::string folder = std::getenv("BT_SERVICE_ROOT");
    return folder;
}

void write_file(const std::string& unit_path, const Bytes& content)
{
    const std::filesystem::path path = root() + unit_path;
    std::filesystem::create_directories(path.parent_path());
    std::ofstream(path, std::ios::binary)
        .write(reinterpret_cast<const char*>(content.data()), static_cast<std::streamsize>(content.size()));
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
        Bytes unit;
        for (size_t i = 0; i + 1 < std::min(star, word.size()); i += 2)
            unit.push_back(static_cast<uint8_t>(std::stoul(word.substr(i, 2), nullptr, 16)));
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
