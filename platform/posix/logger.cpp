// The logger: where records go, which zones are on, and how a record looks.
#include "logger.h"

#include "clock.h"

#include <bt_platform/platform.h>

#include <pthread.h>
#include <syslog.h>
#include <unistd.h>

#include <atomic>
#include <cstdarg>
#include <cstdio>
#include <cstdlib>
#include <cstring>

// The parameter block belongs to the service library, which need not be there.
extern "C" __attribute__((weak, visibility("default"))) uint8_t g_VexLogParams[];

namespace bt::platform {
namespace {

constexpr uint32_t kFirstNamedZone = 10;
constexpr uint32_t kLastNamedZone = 31;
constexpr uint32_t kZoneNameSize = 24;
constexpr uint32_t kZoneNamesAt = 1;
constexpr uint32_t kZoneWordsAt = 12052;
constexpr uint32_t kZoneCount = 256;

enum class Output { none, standard_error, system_log, not_chosen };

pthread_once_t g_once = PTHREAD_ONCE_INIT;
Output g_output = Output::not_chosen;
pthread_mutex_t g_lock = PTHREAD_MUTEX_INITIALIZER; // of the process name
char g_process_name[32];

void choose_output()
{
    const char* const choice = std::getenv("BT_PLATFORM_LOG");
    if (choice == nullptr) return;
    if (std::strcmp(choice, "off") == 0) g_output = Output::none;
    if (std::strcmp(choice, "stderr") == 0) g_output = Output::standard_error;
    if (std::strcmp(choice, "syslog") == 0) g_output = Output::system_log;
}

Output output()
{
    pthread_once(&g_once, choose_output);
    return g_output;
}

bool is_on()
{
    return output() == Output::standard_error || output() == Output::system_log;
}

uint32_t* zone_word(uint32_t zone)
{
    if (g_VexLogParams == nullptr || zone >= kZoneCount) return nullptr;
    return static_cast<uint32_t*>(static_cast<void*>(g_VexLogParams + kZoneWordsAt)) + zone / 32;
}

bool is_enabled(uint32_t zone)
{
    const uint32_t* const word = zone_word(zone);
    return word != nullptr && (__atomic_load_n(word, __ATOMIC_RELAXED) >> (zone % 32) & 1) != 0;
}

void name_zone(uint32_t zone, char (&out)[kZoneNameSize + 1])
{
    std::snprintf(out, sizeof out, "zone %u", zone);
    if (g_VexLogParams == nullptr || zone < kFirstNamedZone || zone > kLastNamedZone) return;
    const uint8_t* const slot = g_VexLogParams + kZoneNamesAt + kZoneNameSize * (zone - kFirstNamedZone);
    if (slot[0] == 0) return;
    std::memcpy(out, slot, kZoneNameSize);
    out[kZoneNameSize] = '\0';
}

int priority_of(int32_t level)
{
    constexpr int kPriorities[] = {LOG_DEBUG, LOG_INFO, LOG_NOTICE, LOG_WARNING, LOG_ERR};
    return kPriorities[level < 0 ? 0 : level > 4 ? 4 : level];
}

// One record, built on the stack and written by one call, so that records of threads and processes never mix.
class Record {
public:
    void add(const char* format, ...) __attribute__((format(printf, 2, 3)))
    {
        va_list arguments;
        va_start(arguments, format);
        add(format, arguments);
        va_end(arguments);
    }

    __attribute__((format(printf, 2, 0))) void add(const char* format, va_list arguments)
    {
        const int length = std::vsnprintf(text_ + length_, kLongest - length_, format, arguments);
        if (length > 0) length_ += static_cast<size_t>(length);
        if (length_ > kLongest - 1) length_ = kLongest - 1;
    }

    void add_time()
    {
        timespec now{};
        tm local{};
        clock_gettime(CLOCK_REALTIME, &now);
        if (localtime_r(&now.tv_sec, &local) == nullptr) return;
        add("%04d-%02d-%02d %02d:%02d:%02d.%03d ", local.tm_year + 1900, local.tm_mon + 1, local.tm_mday, local.tm_hour,
            local.tm_min, local.tm_sec, static_cast<int>(now.tv_nsec / 1'000'000));
    }

    void add_process()
    {
        pthread_mutex_lock(&g_lock);
        add("%s[%ld] ", g_process_name[0] != '\0' ? g_process_name : "-", static_cast<long>(getpid()));
        pthread_mutex_unlock(&g_lock);
    }

    void write_out(int priority)
    {
        while (length_ > 0 && text_[length_ - 1] == '\n')
            --length_;
        if (output() == Output::system_log) {
            syslog(LOG_USER | priority, "%.*s", static_cast<int>(length_), text_);
            return;
        }
        text_[length_++] = '\n';
        const ssize_t written = write(STDERR_FILENO, text_, length_);
        static_cast<void>(written);
    }

private:
    static constexpr size_t kLongest = 1200;
    char text_[kLongest + 1];
    size_t length_ = 0;
};

// The system log has a time of its own.
void begin(Record& record)
{
    if (output() != Output::system_log) record.add_time();
    record.add_process();
}

} // namespace

void logger_before_fork()
{
    pthread_mutex_lock(&g_lock);
}

void logger_after_fork()
{
    pthread_mutex_unlock(&g_lock);
}

void log_last_words(const char* text)
{
    if (output() == Output::none) return;
    Record record;
    begin(record);
    record.add("%s", text);
    record.write_out(LOG_ERR);
}

} // namespace bt::platform

using namespace bt::platform;

void QvLog(uint32_t facility, uint32_t zone, const char* tag, const char* format, ...)
{
    if (!is_on() || !is_enabled(zone) || format == nullptr) return;

    char zone_name[kZoneNameSize + 1];
    name_zone(zone, zone_name);
    Record record;
    begin(record);
    record.add("%u/%s %s: ", facility, zone_name, tag == nullptr ? "-" : tag);
    va_list arguments;
    va_start(arguments, format);
    record.add(format, arguments);
    va_end(arguments);
    record.write_out(LOG_INFO);
}

void QvLogSetProcessName(const char* name)
{
    pthread_mutex_lock(&g_lock);
    std::snprintf(g_process_name, sizeof g_process_name, "%s", name == nullptr ? "" : name);
    pthread_mutex_unlock(&g_lock);
}

void QvLogSetZones(int32_t count, ...)
{
    uint32_t words[kZoneCount / 32] = {};
    va_list zones;
    va_start(zones, count);
    for (int32_t at = 0; at < count; ++at) {
        const auto zone = static_cast<uint32_t>(va_arg(zones, int));
        if (zone < kZoneCount) words[zone / 32] |= 1U << (zone % 32);
    }
    va_end(zones);

    for (uint32_t at = 0; at < kZoneCount / 32; ++at) {
        if (uint32_t* const word = zone_word(32 * at)) __atomic_store_n(word, words[at], __ATOMIC_RELAXED);
    }
}

void ZelLog(int32_t level, int32_t line, const char* function, const char* format, ...)
{
    if (!is_on() || format == nullptr) return;

    Record record;
    begin(record);
    record.add("level %d %s:%d: ", level, function == nullptr ? "-" : function, line);
    va_list arguments;
    va_start(arguments, format);
    record.add(format, arguments);
    va_end(arguments);
    record.write_out(priority_of(level));
}
