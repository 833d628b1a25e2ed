#include "local_time.h"

#include <bt_service/bt_log.h>

#include <pthread.h>
#include <sys/time.h>
#include <time.h>

namespace bt::cmn {
namespace {

pthread_once_t g_zone_read = PTHREAD_ONCE_INIT;

} // namespace

LocalTime local_time_now()
{
    LocalTime time{};
    timeval now{};
    if (gettimeofday(&now, nullptr) != 0) return time;

    pthread_once(&g_zone_read, tzset); // localtime_r() need not read TZ by itself
    time.known = localtime_r(&now.tv_sec, &time.calendar) != nullptr;
    time.milliseconds = static_cast<int>(now.tv_usec / 1000);
    return time;
}

void print_date_and_time(std::FILE* stream, const LocalTime& time)
{
    if (!time.known) return;

    const std::tm& at = time.calendar;
    std::fprintf(stream, "%4d/%02d/%02d %02d:%02d:%02d.%03d ", at.tm_year + 1900, at.tm_mon + 1, at.tm_mday, at.tm_hour,
                 at.tm_min, at.tm_sec, time.milliseconds);
}

} // namespace bt::cmn

void BT_CMN_DebugLogTimePrint(FILE* stream)
{
    if (stream == nullptr) return;

    const bt::cmn::LocalTime time = bt::cmn::local_time_now();
    if (!time.known) return;

    const std::tm& at = time.calendar;
    std::fprintf(stream, "%02d:%02d:%02d.%03d ", at.tm_hour, at.tm_min, at.tm_sec, time.milliseconds);
}
