// The four log outputs.
#include "local_time.h"
#include "stream_record.h"

#include <bt_service/bt_log.h>

#include <cstdarg>
#include <cstring>

namespace bt::cmn {
namespace {

enum TagLimit { kWholeTag = -1, kConsoleTag = 127 };

bool ends_in_newline(const char* format)
{
    const std::size_t length = std::strlen(format);
    return length != 0 && format[length - 1] == '\n';
}

BT_PRINTF(5, 0)
void write_record(FILE* stream, TagLimit limit, const LocalTime& time, const char* tag, const char* format,
                  va_list arguments)
{
    const StreamRecord record(stream);
    print_date_and_time(stream, time);
    std::fprintf(stream, "[%.*s] ", static_cast<int>(limit), tag);
    std::vfprintf(stream, format, arguments);
    if (!ends_in_newline(format)) std::putc('\n', stream);
}

BT_PRINTF(3, 0)
void write_to_file(const LocalTime& time, const char* tag, const char* format, va_list arguments)
{
    if (FILE* const stream = bt_cmn_log_fpget()) write_record(stream, kWholeTag, time, tag, format, arguments);
}

} // namespace
} // namespace bt::cmn

using namespace bt::cmn;

void _BT_CMN_logout_Stub(const char*, const char*, ...) {}

void _BT_CMN_logout_Console(const char* tag, const char* format, ...)
{
    if (tag == nullptr || format == nullptr) return;

    va_list arguments;
    va_start(arguments, format);
    write_record(stdout, kConsoleTag, local_time_now(), tag, format, arguments);
    va_end(arguments);
}

void _BT_CMN_logout_File(const char* tag, const char* format, ...)
{
    if (tag == nullptr || format == nullptr) return;

    va_list arguments;
    va_start(arguments, format);
    write_to_file(local_time_now(), tag, format, arguments);
    va_end(arguments);
}

void _BT_CMN_logout_Console_And_File(const char* tag, const char* format, ...)
{
    if (tag == nullptr || format == nullptr) return;

    const LocalTime time = local_time_now();
    va_list arguments;
    va_start(arguments, format);
    write_record(stdout, kConsoleTag, time, tag, format, arguments);
    va_end(arguments);

    va_start(arguments, format);
    write_to_file(time, tag, format, arguments);
    va_end(arguments);
}
