// The words of the log that programs can reach: output pointer, flags, zone and the platform logger's parameter block.
#include <bt_service/bt_log.h>

BT_CMN_logout BT_CMN_logout_wrapperFunc = _BT_CMN_logout_Stub;
uint8_t DebugConsoleLogSts = 0;
uint8_t DebugFileOutLogSts = 0;
uint8_t DebugSRVOutLogSts = 0;
int32_t DebugStrmLogStsOn = 0;
int32_t VEXLOG_Zone = 28;

// clang-format off
BtLogParameters g_VexLogParams = {
    2,
    {"Init", "Function", "Memory", "Console Logs", "File Logs", // zones 10 to 14
     "", "", "", "", "", "", "", "", "", "", "", "", "", "",    // zones 15 to 28
     "Info", "Warning", "Error"},                               // zones 29 to 31
    {},
    {31, 30, 29, 14, 13, 12, 11, 10},
};
// clang-format on

const char AppName[11] = "BT_Service";
