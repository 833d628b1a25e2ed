// The hex dump.
#include "hex_digits.h"
#include "local_time.h"
#include "stream_record.h"

#include <bt_platform/platform.h>
#include <bt_service/bt_log.h>

#include <algorithm>
#include <cstring>

namespace bt::cmn {
namespace {

constexpr int32_t kDumpLevel = 4;
constexpr int32_t kDumpMax = 2048;
constexpr int32_t kBytesPerLine = 16;
constexpr int32_t kLineLength = 62;

struct DumpLine {
    char text[kLineLength + 1];
};

// Two-byte groups of hex from column 2, and two eight-byte blocks of characters from column 44.
DumpLine dump_line(const uint8_t* bytes, int32_t count)
{
    DumpLine line;
    std::memset(line.text, ' ', kLineLength);
    line.text[kLineLength] = '\0';
    for (int32_t i = 0; i < count; ++i) {
        const int32_t hex_column = 2 + 5 * (i / 2) + 2 * (i % 2);
        put_hex(&line.text[hex_column], bytes[i], kLowerDigits);
        const bool printable = bytes[i] >= 0x20 && bytes[i] <= 0x7E;
        line.text[44 + 9 * (i / 8) + i % 8] = printable ? static_cast<char>(bytes[i]) : '.';
    }
    return line;
}

template <class Sink>
void for_each_line(const uint8_t* data, int32_t size, Sink sink)
{
    for (int32_t at = 0; at < size; at += kBytesPerLine)
        sink(dump_line(data + at, std::min(size - at, kBytesPerLine)));
}

void print_header(FILE* stream, const LocalTime& time, const char* tag, const char* title, int32_t size)
{
    print_date_and_time(stream, time);
    std::fprintf(stream, "[%s] <size=%d> : %s\n", tag, size, title);
}

} // namespace
} // namespace bt::cmn

void BT_CMN_logdump(const char* tag, const char* title, const uint8_t* data, int32_t size)
{
    using namespace bt::cmn;

    const bool to_console = DebugConsoleLogSts == 1;
    const bool to_file = DebugFileOutLogSts == 1;
    if (DebugConsoleLogSts == 0 && DebugFileOutLogSts == 0) return;
    if (tag == nullptr || title == nullptr || data == nullptr || size < 1) return;

    const char* const function = __func__;
    const int32_t dumped = std::min(size, kDumpMax);
    const LocalTime time = local_time_now();
    FILE* stream = nullptr;
    if (time.known && to_console) {
        const StreamRecord record(stdout);
        print_header(stdout, time, tag, title, size);
    }
    if (time.known && to_file) {
        stream = bt_cmn_log_fpget();
        if (stream == nullptr) return;
    }
    if (to_console)
        for_each_line(data, dumped,
                      [function](const DumpLine& line) { ZelLog(kDumpLevel, __LINE__, function, "%s\n", line.text); });
    if (stream != nullptr) {
        const StreamRecord record(stream);
        print_header(stream, time, tag, title, size);
        for_each_line(data, dumped, [stream](const DumpLine& line) { std::fprintf(stream, "%s\n", line.text); });
    }
}
