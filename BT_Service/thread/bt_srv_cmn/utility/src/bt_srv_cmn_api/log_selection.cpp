// Chooses where the log goes.
#include "switch_file.h"

#include <bt_platform/platform.h>
#include <bt_service/bt_log.h>

#include "base/rooted_path.h"

namespace bt::cmn {
namespace {

constexpr char kSwitchFile[] = "/fs/rwdata/BT/btstack/BT_SERVICE_DEBUG";
constexpr char kFallbackSwitchFile[] = "/fs/sd0/BT_SERVICE_DEBUG";
constexpr int32_t kErrorLevel = 1;
constexpr int32_t kConsoleZone = 13;
constexpr int32_t kFileZone = 14;

FILE* open_switch_file(const char* path)
{
    return fopen(RootedPath(path).c_str(), "r");
}

} // namespace
} // namespace bt::cmn

using namespace bt::cmn;

void BT_CMN_DebugLogSelecter(void)
{
    DebugConsoleLogSts = 0;
    DebugFileOutLogSts = 0;
    DebugSRVOutLogSts = 1;
    DebugStrmLogStsOn = 0;
    bt_cmn_log_fp_reset();

    FILE* file = open_switch_file(kSwitchFile);
    if (file == nullptr) {
        ZelLog(kErrorLevel, __LINE__, __func__, "BT_SERVICE_DEBUG：fopen_error(USB)\n");
        file = open_switch_file(kFallbackSwitchFile);
        if (file == nullptr) ZelLog(kErrorLevel, __LINE__, __func__, "BT_SERVICE_DEBUG：fopen_error(SD)\n");
    }
    if (file != nullptr) {
        read_switches(file);
        ZelLog(kErrorLevel, __LINE__, __func__,
               "DebugConsoleLogSts:[%d] DebugFileOutLogSts:[%d] DebugSRVOutLogSts:[%d]\n", DebugConsoleLogSts,
               DebugFileOutLogSts, DebugSRVOutLogSts);
        fclose(file);
    }
    BT_CMN_log_AttachFuncPointer();
}

void BT_CMN_log_AttachFuncPointer(void)
{
    QvLogSetZones(8, 31, 30, 29, 14, 13, 12, 11, 10);
    QvLogSetProcessName(AppName);

    VEXLOG_Zone = kConsoleZone;
    if (DebugConsoleLogSts == 0 && DebugFileOutLogSts == 0) {
        BT_CMN_logout_wrapperFunc = _BT_CMN_logout_Stub;
    } else if (DebugConsoleLogSts == 0 && DebugFileOutLogSts == 1) {
        BT_CMN_logout_wrapperFunc = _BT_CMN_logout_File;
        VEXLOG_Zone = kFileZone;
    } else if (DebugConsoleLogSts == 1 && DebugFileOutLogSts == 0) {
        BT_CMN_logout_wrapperFunc = _BT_CMN_logout_Console;
    } else {
        BT_CMN_logout_wrapperFunc = _BT_CMN_logout_Console_And_File;
    }
}

int32_t BT_CMN_DebugLogThreadIdFilter(const void*)
{
    return _sys_GetPno() == PNO_BT_STRM ? DebugStrmLogStsOn : 1;
}
