/**
 * @file
 * The platform interface: everything the Bluetooth service library asks of the system below it, apart from POSIX.
 *
 * On the unit the platform's own implementation stands here; libbt_platform is the one for plain POSIX systems. Each
 * description says what a call must do, what it may do, and what the caller guarantees. Every call may be made by any
 * number of threads at once, but from no signal handler.
 *
 * libbt_platform keeps everything in a domain (host.h) and reads three environment variables:
 *   BT_PLATFORM_DOMAIN  name of the domain, "default" when unset
 *   BT_PLATFORM_PNO     process number of a program that does not claim one itself, for example 0x4001
 *   BT_PLATFORM_LOG     "stderr", "syslog" or "off". Unset, no record is written; only a process that ends because the
 *                       layer is unusable says why on stderr.
 */
#ifndef BT_PLATFORM_PLATFORM_H
#define BT_PLATFORM_PLATFORM_H

#include <stdint.h>

#if defined(__GNUC__)
#define BT_PLATFORM_API __attribute__((visibility("default")))
#define BT_PLATFORM_PRINTF(format_index, first_argument) __attribute__((format(printf, format_index, first_argument)))
#else
#define BT_PLATFORM_API
#define BT_PLATFORM_PRINTF(format_index, first_argument)
#endif

#ifdef __cplusplus
extern "C" {
#endif

/**
 * Posts a message to a process number, without waiting for the receiver.
 *
 * Must copy `size` bytes before it returns, keep one sender's messages in order, and never wait longer than a short,
 * bounded time for other senders. May be called from any number of threads and processes at once.
 *
 * @param pno      process number of the receiver
 * @param size     16..1,024 bytes
 * @param message  the caller guarantees `size` readable bytes
 * @param zero     the caller passes 0
 * @return 0 posted, also when the owner was killed and its successor has yet to come; 1 nobody owns the number; 2 its
 *         queue is full; 3 size out of range or null message; 4 the queue could not be had in time; -1 only when the
 *         layer itself is unusable (its objects are missing or foreign)
 */
BT_PLATFORM_API int32_t _sys_SndMsg(uint32_t pno, uint32_t size, const void* message, uint32_t zero);

/**
 * Takes the calling process's next message, waiting for one.
 *
 * A signal handled by the waiting thread ends the wait. A message stays in the queue until it is copied out: a process
 * killed in between leaves it to its successor.
 *
 * @param own_pno  the process's own number, as _sys_GetPno() gives it
 * @param size     bytes in `buffer`, 1,024
 * @param buffer   receives header and payload; the rest of it is undefined
 * @param zero     the caller passes 0
 * @return 1 a message was delivered; 0 none (a signal ended the wait); -1 the layer is unusable, or the process does not
 *         own the number
 */
BT_PLATFORM_API int32_t _sys_RcvMsg(uint32_t own_pno, uint32_t size, void* buffer, uint32_t zero);

/** Returns the calling process's number, 0 when it has none. Never blocks. */
BT_PLATFORM_API uint32_t _sys_GetPno(void);

/** Ends the process with `code`, as exit() does. Does not return. */
BT_PLATFORM_API void _sys_Exit(int32_t code);

/**
 * Creates or opens the named lock.
 *
 * @return its handle, valid for the life of the process and the same for every call with the same name; 0 on failure
 */
BT_PLATFORM_API uint32_t _sys_CreateSemaphore(const char* name);

/**
 * Takes a lock, waiting a bounded time. A lock whose holder died is handed on.
 *
 * @return 0 held; non-zero not held (unknown handle, not had in time, already held by this thread)
 */
BT_PLATFORM_API int32_t _sys_SemLock(uint32_t handle);

/** Releases a lock. @return 0 released; non-zero when the calling thread does not hold it, which changes nothing */
BT_PLATFORM_API int32_t _sys_SemUnlock(uint32_t handle);

/**
 * Links the named shared data into the process. Any number of calls yield the same address.
 *
 * @param name     name of the data
 * @param address  receives the address; null on failure
 * @param size     in: the size the caller needs, 0 for any; out: the size of the data
 * @return 0 linked; non-zero when there is no such data or it is smaller than asked
 */
BT_PLATFORM_API int32_t _sys_LinkShareData(const char* name, void** address, uint32_t* size);

/**
 * Starts or restarts a one-shot timer of the process. Expiry is a message in the process's own queue: src_pno its own
 * number, cid the low 16 bits of the timer id, len 4, payload the whole timer id. A full queue delays it.
 *
 * @param pno       the calling process's own number
 * @param timer_id  chosen by the process
 * @param two       the caller passes 2
 * @param time      milliseconds on the monotonic clock
 * @return 0 started; non-zero not
 */
BT_PLATFORM_API int32_t _sys_ReqTimerStart(uint32_t pno, uint32_t timer_id, uint32_t two, uint32_t time);

/**
 * Stops a timer.
 *
 * @return 0 stopped, its expiry will not come; non-zero when no such timer runs: it was never started, or its expiry is in
 *         the queue already
 */
BT_PLATFORM_API int32_t _sys_TimerStop(uint32_t pno, uint32_t timer_id, uint32_t two);

/** Sets the platform interface up for the calling process; may be called any number of times. @return 0 */
BT_PLATFORM_API int32_t _sys_SetupZX44API(uint32_t value);

/** Writes one log record under a zone when the zone is enabled in the library's parameter block. */
BT_PLATFORM_API void QvLog(uint32_t facility, uint32_t zone, const char* tag, const char* format, ...)
    BT_PLATFORM_PRINTF(4, 5);

/** Names the process in log records. The text is copied. */
BT_PLATFORM_API void QvLogSetProcessName(const char* name);

/** Enables the `count` zones, 0..255, that follow as ints, and no others. */
BT_PLATFORM_API void QvLogSetZones(int32_t count, ...);

/** Writes one log record at a level, with the line and function it comes from. */
BT_PLATFORM_API void ZelLog(int32_t level, int32_t line, const char* function, const char* format, ...)
    BT_PLATFORM_PRINTF(4, 5);

#ifdef __cplusplus
}
#endif
#endif
