/**
 * @file
 * The events of the simulated unit: their ids, their payloads and the reasons that answers give.
 *
 * An event is a BtMessage whose cid is the event id. Two rules give the ids:
 *
 *  - The answer to request R is event R | 0x0800. Its payload begins with a `result` word (`BtSimResult`); the fields
 *    behind it are meaningful as far as the result says, and are always present.
 *  - What happens without a request, or while one is under way, has the id of the request it belongs to | 0x0C00.
 *
 * Every request is answered exactly once, even one that is malformed. An answer that is not listed here carries the
 * result word alone.
 *
 * Payload fields are listed in order as "name:type", separated by blanks: u32 and i32 in the machine's byte order, addr
 * a device address slot of 8 bytes, bytes[n] and text[n] with a number or the name of an earlier field.
 *
 * What the interface leaves to the service, the simulated unit reads so:
 *
 *  - `reply` of an authentication, and `first` of CON_acceptConnection: 0 agrees, anything else refuses.
 *  - PIN block: a length word and up to 16 characters. Passkey block: up to 8 digits, ended by a zero byte.
 *  - Service identifier block: a length word, 2, 4 or 16, and that many bytes of the UUID, most significant first.
 *  - Discoverable mode 0 is not discoverable; then the scan mode is 2 (page scan), else 3 (inquiry and page scan).
 *  - `flag` of CON_requestAllDisconnection: 0 the given device, anything else every device.
 */
#ifndef BT_SIM_EVENTS_H
#define BT_SIM_EVENTS_H

#include <bt_service/bt_types.h>

/* X(name, id, payload fields) */
/* clang-format off */
#define BT_SIM_EVENTS(X)                                                                                              \
    /* connection: answers */                                                                                         \
    X(CON_CONNECTION,                    0xA881, "result:u32 address:addr profile:u32 selector:u32")                  \
    X(CON_ACCEPT_CONNECTION,             0xA882, "result:u32 address:addr profile:u32")                               \
    X(CON_CANCEL_CONNECTION,             0xA883, "result:u32 address:addr profile:u32 selector:u32")                  \
    X(CON_DELETE,                        0xA884, "result:u32 address:addr")                                           \
    X(CON_DISCONNECTION,                 0xA885, "result:u32 address:addr profile:u32 selector:u32")                  \
    X(CON_TERMINATION_REGISTRATION,      0xA886, "result:u32")                                                        \
    X(CON_ALL_DISCONNECTION,             0xA887, "result:u32 address:addr count:u32")                                 \
    X(CON_SEARCH,                        0xA891, "result:u32 count:u32")                                              \
    X(CON_CANCEL_SEARCH,                 0xA892, "result:u32")                                                        \
    X(CON_AUTHENTICATE_PIN,              0xA8A1, "result:u32 address:addr")                                           \
    X(CON_AUTHENTICATE_NUMERIC,          0xA8A2, "result:u32 address:addr")                                           \
    X(CON_AUTHENTICATE_PASSKEY,          0xA8A3, "result:u32 address:addr")                                           \
    X(CON_DISCOVERABLE_MODE,             0xA8E1, "result:u32 mode:u32")                                               \
    X(CON_AUTOMATIC_CONNECTION,          0xA8E2, "result:u32")                                                        \
    X(CON_SIMPLE_PAIRING,                0xA8E3, "result:u32")                                                        \
    X(CON_SERVICE_DISCOVERY,             0xA8E4, "result:u32 address:addr profiles:u32")                              \
    X(CON_SIMPLE_PAIRING_DEBUG,          0xA8E5, "result:u32")                                                        \
    X(CON_LINK_LOSS_BEHAVIOUR,           0xA8E6, "result:u32")                                                        \
    X(CON_SUSPEND_AUTOMATIC_CONNECTION,  0xA8E7, "result:u32")                                                        \
    X(CON_RESTART_AUTOMATIC_CONNECTION,  0xA8E8, "result:u32")                                                        \
    X(CON_BLUETOOTH_FUNCTION,            0xA8E9, "result:u32")                                                        \
    X(CON_TIMER_VALUE,                   0xA8EA, "result:u32")                                                        \
    X(CON_SDP_ENFORCEMENT,               0xA8EB, "result:u32")                                                        \
    X(CON_TRANSMITTING_POWER,            0xA8EC, "result:u32 address:addr power:i32")                                 \
    X(CON_CANCEL_REMOTE_CONNECTION,      0xA8ED, "result:u32 address:addr")                                           \
    X(CON_LINK_LOSS_DIRECTION,           0xA8EE, "result:u32")                                                        \
    X(CON_CONNECTION_RETRY,              0xA8EF, "result:u32")                                                        \
    X(CON_NO_SECURITY_AUTHENTICATION,    0xA8F0, "result:u32")                                                        \
    X(CON_PERMIT_PROFILE_CONNECTION,     0xA8F1, "result:u32")                                                        \
    X(CON_REMOTE_DID,                    0xA8F2, "result:u32 address:addr count:u32 "                                 \
                                                 "key_1:u32 value_1:bytes[8] key_2:u32 value_2:bytes[8]")             \
    X(CON_SERVICE_DISCOVERY_UUID,        0xA8F3, "result:u32 address:addr found:u32")                                 \
    /* connection: unsolicited */                                                                                     \
    X(CON_CONNECTED,                     0xAC81, "address:addr profile:u32")                                          \
    X(CON_CONNECTION_INDICATION,         0xAC82, "address:addr profile:u32")                                          \
    X(CON_DISCONNECTED,                  0xAC85, "address:addr profile:u32 reason:u32")                               \
    X(CON_DEVICE_FOUND,                  0xAC91, "address:addr device_class:u32 name_length:u32 "                     \
                                                 "name:text[name_length]")                                            \
    X(CON_PIN_REQUEST,                   0xACA1, "address:addr")                                                      \
    X(CON_NUMERIC_REQUEST,               0xACA2, "address:addr value:u32")                                            \
    X(CON_PASSKEY_REQUEST,               0xACA3, "address:addr")                                                      \
    X(CON_REGISTERED,                    0xACA4, "address:addr")
/* clang-format on */

enum BtSimEvent {
#define BT_SIM_EVENT_ID(name, id, fields) BT_SIM_EVENT_##name = (id),
    BT_SIM_EVENTS(BT_SIM_EVENT_ID)
#undef BT_SIM_EVENT_ID
    BT_SIM_EVENT_ANSWER = 0x0800,     /**< or'ed to a request id: its answer                */
    BT_SIM_EVENT_UNSOLICITED = 0x0C00 /**< or'ed to a request id: what happens besides      */
};

/** What an answer says in its `result`, and CON_DISCONNECTED in its `reason`. */
enum BtSimResult {
    BT_SIM_OK = 0,                    /**< done; as a reason: asked for by an application   */
    BT_SIM_MALFORMED = 1,             /**< the payload is too short or its values impossible */
    BT_SIM_UNKNOWN_DEVICE = 2,        /**< no such phone in the scenario                    */
    BT_SIM_OUT_OF_RANGE = 3,          /**< the phone does not answer                        */
    BT_SIM_BUSY = 4,                  /**< something else is under way; ask again           */
    BT_SIM_NOT_REGISTERED = 5,        /**< the device is not in the registered device list  */
    BT_SIM_NOT_SUPPORTED = 6,         /**< the phone does not have the profile or service   */
    BT_SIM_REFUSED = 7,               /**< the phone, or the application, said no           */
    BT_SIM_AUTHENTICATION_FAILED = 8, /**< wrong PIN or passkey                             */
    BT_SIM_CANCELLED = 9,             /**< an application cancelled it                      */
    BT_SIM_NOT_CONNECTED = 10,        /**< the profile is not connected                     */
    BT_SIM_ALREADY_CONNECTED = 11,    /**< the profile is connected already                 */
    BT_SIM_LIST_FULL = 12,            /**< 17 devices are registered; delete one first      */
    BT_SIM_NOT_EXPECTED = 13,         /**< nothing waits for this: no search, no prompt     */
    BT_SIM_STORE_FAILED = 14,         /**< the connection data area could not be written    */
    BT_SIM_LINK_LOST = 15             /**< as a reason: the phone went away                 */
};

/** Payload of CON_CONNECTION, CON_CANCEL_CONNECTION and CON_DISCONNECTION. */
typedef struct BtSimConnectionResult {
    uint32_t result;                  /*  0  BtSimResult                                    */
    BtDevAddress address;             /*  4                                                 */
    uint32_t profile;                 /* 12  profile number 0..8                            */
    uint32_t selector;                /* 16  as in the request                              */
} BtSimConnectionResult;
BT_ASSERT_SIZE(BtSimConnectionResult, 20);

/** Payload of CON_DEVICE_FOUND; travels without the unused end of the name. */
typedef struct BtSimDeviceFound {
    BtDevAddress address;             /*  0                                                 */
    uint32_t device_class;            /*  8  class of device                                */
    uint32_t name_length;             /* 12  bytes in name, 0..248                          */
    uint8_t name[248];                /* 16  UTF-8, not terminated                          */
} BtSimDeviceFound;
BT_ASSERT_SIZE(BtSimDeviceFound, 264);

/** Payload of CON_SEARCH. */
typedef struct BtSimSearchResult {
    uint32_t result;                  /*  0  BtSimResult; BT_SIM_CANCELLED when cut short   */
    uint32_t count;                   /*  4  devices found                                  */
} BtSimSearchResult;
BT_ASSERT_SIZE(BtSimSearchResult, 8);

/** Payload of CON_NUMERIC_REQUEST; answered with BT_SRV_CON_authenticateNumericValue(). */
typedef struct BtSimNumericRequest {
    BtDevAddress address;             /*  0                                                 */
    uint32_t value;                   /*  8  six decimal digits that both sides show        */
} BtSimNumericRequest;
BT_ASSERT_SIZE(BtSimNumericRequest, 12);

#endif
