/**
 * @file
 * Debug log of the service's processes: where it goes, how it is switched on, and its hex dump.
 *
 * Everything in the framework and in event distribution logs through one pointer, BT_CMN_logout_wrapperFunc. It leads
 * nowhere until BT_CMN_DebugLogSelecter() or BT_CMN_log_AttachFuncPointer() points it at the console, the log file
 * /tmp/bt_cmn.log, or both.
 *
 * The pointer, the flags and the zone are plain words: they are written at process start, before other threads log, and
 * only read afterwards. The output functions and the dump may be called from any thread; a record is never mixed with
 * that of another thread.
 *
 * A log record is "2026/11/22 09:30:01.250 [CMN] message" with the local time; the newline is added when the format
 * does not end in one.
 */
#ifndef BT_SERVICE_BT_LOG_H
#define BT_SERVICE_BT_LOG_H

#include <bt_service/bt_types.h>
#include <stdio.h>

BT_EXTERN_C_BEGIN

/**
 * A log output: writes one record.
 *
 * @param tag     names the module; null writes nothing
 * @param format  as for printf, with its arguments behind it; null writes nothing
 */
typedef void (*BT_CMN_logout)(const char* tag, const char* format, ...) BT_PRINTF(2, 3);

enum { BT_LOG_FIRST_NAMED_ZONE = 10, BT_LOG_ZONE_NAMES = 502, BT_LOG_ZONE_NAME_SIZE = 24, BT_LOG_ZONE_WORDS = 17 };

/** The platform logger's parameter block: filled by the library, kept by the logger. */
typedef struct BtLogParameters {
    uint8_t version;                                           /*     0  2                                   */
    char zone_names[BT_LOG_ZONE_NAMES][BT_LOG_ZONE_NAME_SIZE]; /*     1  first that of zone 10; zero-filled  */
    uint8_t reserved[3];                                       /* 12049  zero                                */
    uint32_t enabled_zones[BT_LOG_ZONE_WORDS];                 /* 12052  zone z is bit z % 32 of word z / 32 */
} BtLogParameters;
BT_ASSERT_SIZE(BtLogParameters, 12120);
BT_ASSERT_AT(BtLogParameters, zone_names, 1);
BT_ASSERT_AT(BtLogParameters, reserved, 12049);
BT_ASSERT_AT(BtLogParameters, enabled_zones, 12052);

extern BT_API BT_CMN_logout BT_CMN_logout_wrapperFunc; /**< the output in force; the stub when loaded */
extern BT_API uint8_t DebugConsoleLogSts;              /**< 1: log to the console; 0 when loaded */
extern BT_API uint8_t DebugFileOutLogSts;              /**< 1: log to the file; 0 when loaded */
extern BT_API uint8_t DebugSRVOutLogSts;               /**< 1: message trace; 0 when loaded, 1 after each selection */
extern BT_API int32_t DebugStrmLogStsOn;               /**< 1: message trace in the stream process too */
extern BT_API int32_t VEXLOG_Zone;                     /**< zone of the message trace; 28 when loaded */
extern BT_API BtLogParameters g_VexLogParams;          /**< read and kept by the platform logger */
extern BT_API const char AppName[11];                  /**< "BT_Service", the process name given to the logger */

/**
 * Selects the log output from the debug switch file; called once by a service process, before its threads log.
 *
 * Puts all flags back to their defaults (console off, file off, trace on, stream trace off), forgets the log file so
 * that it is opened anew, reads /fs/rwdata/BT/btstack/BT_SERVICE_DEBUG, or /fs/sd0/BT_SERVICE_DEBUG when there is no
 * such file, and attaches the output that the flags ask for. The switches are lines "key=ON;" with the keys
 * @ConsoleLog, @FileOutLog, @ConsoleSRVLog and @StrmLog. Without a file the defaults stand.
 *
 * Not for concurrent use with anything that logs.
 */
BT_API void BT_CMN_DebugLogSelecter(void);

/**
 * Points the log at the output that the flags ask for as they stand, and tells the platform logger the process's name
 * and zones.
 *
 * Not for concurrent use with anything that logs.
 */
BT_API void BT_CMN_log_AttachFuncPointer(void);

/** The output that writes nothing. */
BT_API void _BT_CMN_logout_Stub(const char* tag, const char* format, ...) BT_PRINTF(2, 3);

/** Writes a record to standard output; the tag is cut to 127 characters. */
BT_API void _BT_CMN_logout_Console(const char* tag, const char* format, ...) BT_PRINTF(2, 3);

/** Appends a record to the log file; does nothing when the file cannot be opened. */
BT_API void _BT_CMN_logout_File(const char* tag, const char* format, ...) BT_PRINTF(2, 3);

/** Writes a record to standard output and to the log file, with the same time. */
BT_API void _BT_CMN_logout_Console_And_File(const char* tag, const char* format, ...) BT_PRINTF(2, 3);

/**
 * The stream of the log file /tmp/bt_cmn.log, opened for appending on first use.
 *
 * The stream is the library's own: it is not to be closed, and it stays valid for the life of the process.
 *
 * @return the stream; null when the file could not be opened, without a further attempt until bt_cmn_log_fp_reset()
 */
BT_API FILE* bt_cmn_log_fpget(void);

/** Forgets that the log file was opened or could not be; the next record opens it again. */
BT_API void bt_cmn_log_fp_reset(void);

/**
 * Writes the local time of day, "09:30:01.250 ", to a stream.
 *
 * @param stream  null writes nothing
 */
BT_API void BT_CMN_DebugLogTimePrint(FILE* stream);

/**
 * Tells whether the calling process traces its messages.
 *
 * @param message  not looked at
 * @return DebugStrmLogStsOn in the stream process, whose messages are too many to be traced by default; 1 in all others
 */
BT_API int32_t BT_CMN_DebugLogThreadIdFilter(const void* message);

/**
 * Dumps bytes in hex and as characters, 16 a line, behind a header line with time, tag, size and title.
 *
 * With console output on, the header goes to standard output and the lines to the platform logger; with file output on,
 * both go to the log file. With both off nothing happens.
 *
 * @param tag    module tag; null writes nothing
 * @param title  what the bytes are; null writes nothing
 * @param data   the bytes; null writes nothing
 * @param size   number of bytes; below 1 writes nothing, the first 2,048 are dumped
 */
BT_API void BT_CMN_logdump(const char* tag, const char* title, const uint8_t* data, int32_t size);

BT_EXTERN_C_END

#endif
