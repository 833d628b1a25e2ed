/**
 * @file
 * What every header of the Bluetooth service interface builds on: result codes, process numbers, the device
 * address and the layout assertions.
 *
 * Conventions that hold for every function of the interface and are not repeated there:
 *
 *  1. Results are signed 32-bit codes; 0 is success. The codes are those of `BtResult`; a code that is not listed
 *     is the platform's own and is passed through unchanged.
 *  2. A request returns as soon as its message is posted. It never waits for the answer, which arrives later as
 *     an event (bt_events.h). A request that returns anything but 0 posted nothing.
 *  3. A query copies out of shared memory at once and sends nothing. It writes the caller's memory only on success,
 *     unless its description says otherwise.
 *  4. Every buffer belongs to the caller. No pointer is kept after a call returns, and nothing has to be freed.
 *  5. Functions may be called from any number of threads at once, unless their description says otherwise.
 *  6. Integers in messages and shared records are in the machine's byte order (little-endian on all supported
 *     machines); fields in another order say so.
 *  7. A device address is passed as a pointer to its 8-byte slot (`BtDevAddress`).
 *  8. Counts, lengths and indexes read from shared memory are capped to the capacity of the record they belong to.
 */
#ifndef BT_SERVICE_BT_TYPES_H
#define BT_SERVICE_BT_TYPES_H

#include <stddef.h>
#include <stdint.h>

#ifdef __cplusplus
#include <type_traits>
#define BT_EXTERN_C_BEGIN extern "C" {
#define BT_EXTERN_C_END }
#else
#define BT_EXTERN_C_BEGIN
#define BT_EXTERN_C_END
#endif

#if defined(__GNUC__)
#define BT_API __attribute__((visibility("default")))
#define BT_PRINTF(format_index, first_argument) __attribute__((format(printf, format_index, first_argument)))
#else
#define BT_API
#define BT_PRINTF(format_index, first_argument)
#endif

/* Layout assertions. In C++ a record that crosses a process boundary must also be free of padding. */
#if defined(__cplusplus) && __cplusplus >= 201703L
#define BT_ASSERT(condition, name) static_assert(condition, #name)
#define BT_ASSERT_SIZE(type, bytes)                                                                        \
    static_assert(sizeof(type) == (bytes), #type " has another size");                                     \
    static_assert(std::is_trivially_copyable<type>::value && std::is_standard_layout<type>::value &&       \
                      std::has_unique_object_representations<type>::value,                                 \
                  #type " is not a plain record without padding")
#elif defined(__cplusplus)
#define BT_ASSERT(condition, name) static_assert(condition, #name)
#define BT_ASSERT_SIZE(type, bytes) static_assert(sizeof(type) == (bytes), #type " has another size")
#elif defined(__STDC_VERSION__) && __STDC_VERSION__ >= 201112L
#define BT_ASSERT(condition, name) _Static_assert(condition, #name)
#define BT_ASSERT_SIZE(type, bytes) _Static_assert(sizeof(type) == (bytes), #type " has another size")
#else
#define BT_ASSERT(condition, name) typedef char bt_assert_##name[(condition) ? 1 : -1]
#define BT_ASSERT_SIZE(type, bytes) typedef char bt_assert_size_##type[sizeof(type) == (bytes) ? 1 : -1]
#endif
#define BT_ASSERT_AT(type, field, at) BT_ASSERT(offsetof(type, field) == (at), type##_##field##_offset)

/** Result codes of the interface. */
enum BtResult {
    BT_OK = 0,                 /**< done, or posted */
    BT_FAILED = -1,            /**< failure; bad argument where a function says so */
    BT_BAD_ARGUMENT = -2,      /**< bad argument in connection requests, connection queries and the data store */
    BT_NO_SEMAPHORE = -4,      /**< the semaphore of the connection data area could not be created */
    BT_NOT_POSTED = -127       /**< the message layer is not usable */
};

/** Process numbers of the service's processes; requests are posted to them. */
enum BtProcessNumber {
    PNO_BT_SYS = 0x08C1,       /**< system, test mode and debug */
    PNO_BT_CON = 0x08C2,       /**< connection */
    PNO_BT_HFP = 0x08C3,       /**< hands-free */
    PNO_BT_AVP = 0x08C4,       /**< audio/video remote control */
    PNO_BT_STRM = 0x08C5,      /**< stream; takes no request */
    PNO_BT_OPP = 0x08C6,       /**< object push, OBEX and phonebook */
    PNO_BT_MAP = 0x08CA,       /**< message access */
    PNO_BT_EDS = 0xFF02        /**< event distribution */
};

/**
 * A device address (BD_ADDR, Bluetooth Core Specification) in its 8-byte slot.
 *
 * Only the six address bytes are compared. FF FF FF FF FF FF means no device; all zero is a valid address.
 */
typedef struct BtDevAddress {
    uint8_t address[6];        /*  0  in the order in which the caller gives them */
    uint8_t padding[2];        /*  6  carried along, never compared               */
} BtDevAddress;
BT_ASSERT_SIZE(BtDevAddress, 8);
BT_ASSERT_AT(BtDevAddress, padding, 6);

#endif
