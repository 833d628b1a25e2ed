// Timers of the calling process.
#include "log_line.h"

#include <bt_platform/platform.h>
#include <bt_service/bt_timer.h>

namespace bt::cmn {
namespace {

constexpr int32_t kTimerLevel = 4;
constexpr uint32_t kOneShot = 2;

} // namespace
} // namespace bt::cmn

using namespace bt::cmn;

void BT_CMN_startTimer(uint32_t timer_id, uint32_t time)
{
    CMN_LOG_START();
    const int32_t started = _sys_ReqTimerStart(_sys_GetPno(), timer_id, kOneShot, time);
    if (started != 0) {
        ZelLog(kTimerLevel, __LINE__, __func__, "TOVAK_BT CMN - _sys_ReqTimerStart() error : api_ret = %d", started);
        CMN_LOG(CMN_AT "api_ret = %d", CMN_API_PLACE, started);
    }
    CMN_LOG("[API][END] %s", __func__);
}

void BT_CMN_stopTimer(uint32_t timer_id)
{
    CMN_LOG_START();
    const int32_t stopped = _sys_TimerStop(_sys_GetPno(), timer_id, kOneShot);
    if (stopped != 0) {
        ZelLog(kTimerLevel, __LINE__, __func__, "TOVAK_BT CMN - _sys_TimerStop() error : api_ret = %d", stopped);
        CMN_LOG(CMN_AT "api_ret = %d", CMN_API_PLACE, stopped);
    }
    CMN_LOG("[API][END] %s", __func__);
}
