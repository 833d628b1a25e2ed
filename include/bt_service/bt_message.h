/**
 * @file
 * The message that all processes of the Bluetooth service exchange.
 *
 * A message is a 16-byte header followed by at most 1,008 payload bytes. A slot that holds a message (receive
 * buffer, queue slot) is always `BtMessage`, 1,024 bytes.
 */
#ifndef BT_SERVICE_BT_MESSAGE_H
#define BT_SERVICE_BT_MESSAGE_H

#include <bt_service/bt_types.h>

enum {
    BT_MESSAGE_HEADER_SIZE = 16,
    BT_MESSAGE_PAYLOAD_MAX = 1008,
    BT_MESSAGE_SIZE = 1024
};

typedef struct BtMessageHeaderFields {
    uint32_t reserved;         /*  0  zero                                            */
    uint16_t src_pno;          /*  4  process number of the sending side              */
    uint16_t alt_pno;          /*  6  0xFF02 in connection requests, else zero        */
    uint16_t cid;              /*  8  command or event id; selects the handling       */
    uint16_t len;              /* 10  payload bytes, 0..1,008                         */
    uint32_t reserved2;        /* 12  zero                                            */
} BtMessageHeaderFields;
BT_ASSERT_SIZE(BtMessageHeaderFields, 16);
BT_ASSERT_AT(BtMessageHeaderFields, src_pno, 4);
BT_ASSERT_AT(BtMessageHeaderFields, alt_pno, 6);
BT_ASSERT_AT(BtMessageHeaderFields, cid, 8);
BT_ASSERT_AT(BtMessageHeaderFields, len, 10);
BT_ASSERT_AT(BtMessageHeaderFields, reserved2, 12);

typedef struct BtMessageHeader {
    BtMessageHeaderFields hdr; /*  0  reached as msg_header.hdr                       */
} BtMessageHeader;
BT_ASSERT_SIZE(BtMessageHeader, 16);

typedef struct BtMessage {
    BtMessageHeader msg_header;               /*  0                                   */
    uint8_t payload[BT_MESSAGE_PAYLOAD_MAX];  /* 16  the first len bytes are valid    */
} BtMessage;
BT_ASSERT_SIZE(BtMessage, 1024);
BT_ASSERT_AT(BtMessage, payload, 16);

#endif
