#include "message_trace.h"

#include "hex_digits.h"
#include "message_header.h"

#include <bt_platform/platform.h>
#include <bt_service/bt_log.h>

#include <algorithm>
#include <cstdio>

namespace bt::cmn {
namespace {

constexpr uint32_t kFacility = 137;
constexpr int kBytesTraced = 128;
constexpr int kTextBeforeBytes = 11; // "BTSRV A081 "

struct TraceLine {
    char text[kTextBeforeBytes + 2 * kBytesTraced + 1];
};

TraceLine trace_line(const void* message)
{
    const BtMessageHeaderFields header = header_of(message);
    const uint8_t* const payload = static_cast<const uint8_t*>(message) + BT_MESSAGE_HEADER_SIZE;
    TraceLine line{};
    std::snprintf(line.text, sizeof line.text, "BTSRV %04X ", static_cast<unsigned>(header.cid));
    char* at = line.text + kTextBeforeBytes;
    for (int i = 0; i < std::min<int>(header.len, kBytesTraced); ++i)
        at = put_hex(at, payload[i], kUpperDigits);
    return line;
}

// The platform logger changes the words while the process runs.
bool zone_enabled(int32_t zone)
{
    if (zone < 0 || zone >= 32 * BT_LOG_ZONE_WORDS) return false;
    const uint32_t word = __atomic_load_n(&g_VexLogParams.enabled_zones[zone / 32], __ATOMIC_RELAXED);
    return (word >> (zone % 32) & 1U) != 0;
}

} // namespace

void trace_message(const void* message)
{
    if (DebugSRVOutLogSts != 1 || BT_CMN_DebugLogThreadIdFilter(message) != 1) return;

    const int32_t zone = VEXLOG_Zone;
    const bool to_logger = zone_enabled(zone);
    const bool to_console = DebugConsoleLogSts == 1;
    FILE* const stream = DebugFileOutLogSts == 1 ? bt_cmn_log_fpget() : nullptr;
    if (!to_logger && !to_console && stream == nullptr) return;

    const TraceLine line = trace_line(message);
    if (to_logger) QvLog(kFacility, static_cast<uint32_t>(zone), "CMN", "%s\n", line.text);
    if (to_console) std::printf("%s\n", line.text);
    if (stream != nullptr) std::fprintf(stream, "%s\n", line.text);
}

} // namespace bt::cmn
