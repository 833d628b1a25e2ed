/**
 * @file
 * Requests to the object push service: answering and aborting pushes, pulling phonebooks and vCards, session keys.
 *
 * Conventions of this header, in addition to those of bt_types.h:
 *
 *  1. Requests go to the object push service (PNO_BT_OPP), which serves object push, phonebook access and the OBEX
 *     sessions of both. A request returns 0 when it is posted; -1 when an argument is refused, and nothing is sent;
 *     -127 when the message layer is unusable; any other code is what the platform's _sys_SndMsg() returned (1 nobody
 *     owns the process number, 2 its queue is full). The outcome arrives later as an event of the object push service.
 *  2. Functions whose name ends in Req take a length-prefixed record (`BtOppRecord`): two bytes with the number L of
 *     bytes that follow, then the body, which the service defines. Only L + 2 bytes need to exist, at any address. The
 *     payload is the record, length included. A null record and L above 1,006 are refused.
 */
#ifndef BT_SERVICE_BT_OBJECT_PUSH_H
#define BT_SERVICE_BT_OBJECT_PUSH_H

#include <bt_service/bt_types.h>

enum {
    BT_OPP_BODY_MAX = 1006,        /* bytes of a record's body */
    BT_OPP_SESSION_KEY_MAX = 20    /* bytes of a session key   */
};

/** A length-prefixed record of the largest size. */
typedef struct BtOppRecord {
    uint16_t length;               /*  0  bytes of the body in use, 0..1,006              */
    uint8_t body[BT_OPP_BODY_MAX]; /*  2                                                  */
} BtOppRecord;
BT_ASSERT_SIZE(BtOppRecord, 1008);
BT_ASSERT_AT(BtOppRecord, body, 2);

BT_EXTERN_C_BEGIN

/* ---- length-prefixed records; see above for record, results and payload */

/** Answers a push. Request 0x30A0. */
BT_API int32_t BT_SRV_OPP_pushResponseReq(const void *record);

/** Aborts a push. Request 0x30A1. */
BT_API int32_t BT_SRV_OPP_pushAbortReq(const void *record);

/** Sets object push up. Request 0x30A2. */
BT_API int32_t BT_SRV_OPP_fcSettingReq(const void *record);

/** Hands over the session key of object push. Request 0x30A3. */
BT_API int32_t BT_SRV_OPP_sessionKeyWriteReq(const void *record);

/** Hands over the session key of phonebook access. Request 0x30A4. */
BT_API int32_t BT_SRV_PBAP_sessionKeyWriteReq(const void *record);

/** Pulls a phonebook. Request 0x30A5. */
BT_API int32_t BT_SRV_PBAP_pullPhonebookReq(const void *record);

/** Pulls a list of vCards. Request 0x30A6. */
BT_API int32_t BT_SRV_PBAP_pullvCardListReq(const void *record);

/** Pulls one vCard. Request 0x30A7. */
BT_API int32_t BT_SRV_PBAP_pullvCardEntryReq(const void *record);

/** Aborts a pull. Request 0x30A8. */
BT_API int32_t BT_SRV_PBAP_pullAbortReq(const void *record);

/** Sets phonebook access up. Request 0x30A9. */
BT_API int32_t BT_SRV_PBAP_fcSettingReq(const void *record);

/** Hands over user id and session key of an OBEX authentication. Request 0x30AA. */
BT_API int32_t BT_SRV_OBEX_authenticationUseridSessionkeyWriteReq(const void *record);

/* ---- other requests */

/**
 * Tells the service the connection state of a device.
 *
 * @param first   its low byte is sent
 * @param addr    any address; only its six address bytes are read and sent
 * @param second  its low byte is sent
 * @return 0 posted; -1 null address; -127 not posted
 *
 * Request 0x30AB, 8 payload bytes: first (1), address (6), second (1).
 */
BT_API int32_t BT_SRV_OPP_ConStsNotify(uint32_t first, const BtDevAddress *addr, uint32_t second);

/**
 * Hands over the session key of phonebook access as bare bytes. The library does not keep it.
 *
 * @param key     `length` bytes
 * @param length  0..20; 0 sends an empty payload
 * @return 0 posted; -1 null key or length out of range; -127 not posted
 *
 * Request 0x3017, `length` payload bytes: the key, without a length in front.
 */
BT_API int32_t BT_SRV_PBAP_setSessionKey(const void *key, int32_t length);

BT_EXTERN_C_END

#endif
