/**
 * @file
 * One-shot timers of the calling process, kept by the platform.
 *
 * A timer is named by an id that the process chooses. Failures are reported in the log and at the platform logger only.
 */
#ifndef BT_SERVICE_BT_TIMER_H
#define BT_SERVICE_BT_TIMER_H

#include <bt_service/bt_types.h>

BT_EXTERN_C_BEGIN

/**
 * Starts a timer, or restarts it. Its expiry is a message in the calling process's own queue.
 *
 * @param timer_id  chosen by the process
 * @param time      milliseconds, handed to the platform as given
 */
BT_API void BT_CMN_startTimer(uint32_t timer_id, uint32_t time);

/**
 * Stops a timer.
 *
 * @param timer_id  as given to BT_CMN_startTimer()
 */
BT_API void BT_CMN_stopTimer(uint32_t timer_id);

BT_EXTERN_C_END

#endif
