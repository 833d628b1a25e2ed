/**
 * @file
 * Requests to the connection service: search, pairing, connecting and disconnecting profiles, connection settings.
 *
 * Conventions of this header, in addition to those of bt_types.h:
 *
 *  1. Requests go to the connection service (PNO_BT_CON). Each travels as a full message of 1,024 bytes, zero behind
 *     its payload; the sizes given here are the payload's.
 *  2. A request returns 0 when it is posted and -1 when it could not be posted, whatever the platform's code was.
 *     Only the two connection requests report -127 instead of -1. A refused argument is -2, and nothing is sent.
 *  3. The outcome arrives later as an event of the connection service; register for it with BT_SRV_EvtSrv_regist().
 *     What the service makes of modes, settings, replies and timer values is the service's; they are sent as given.
 *  4. An address is sent as its whole 8-byte slot. "Refused" for an address means that the pointer is null or the
 *     address is FF FF FF FF FF FF, which stands for no device.
 *  5. A profile is its number, 0..8. Profile 5 has several instances, told apart by a selector, 1..26.
 */
#ifndef BT_SERVICE_BT_CONNECTION_H
#define BT_SERVICE_BT_CONNECTION_H

#include <bt_service/bt_types.h>

/** What a connection request asks for. */
typedef struct BtConParameters {
    uint32_t profile;          /*  0  0..8, not 4                                     */
    uint32_t values[6];        /*  4  meaning depends on the profile                  */
} BtConParameters;
BT_ASSERT_SIZE(BtConParameters, 28);
BT_ASSERT_AT(BtConParameters, values, 4);

/** The profiles to which an accepted connection is limited; begins like a `BtConProfileFilter`. */
typedef struct BtConProfileFilterBlock {
    int32_t count;             /*  0  entries in use; 0 or less: no filter            */
    uint32_t profiles[8];      /*  4  sent whole                                      */
} BtConProfileFilterBlock;
BT_ASSERT_SIZE(BtConProfileFilterBlock, 36);
BT_ASSERT_AT(BtConProfileFilterBlock, profiles, 4);

/** The passkey of an authentication reply; sent as it is. */
typedef struct BtConPasskey {
    uint8_t bytes[8];          /*  0                                                  */
} BtConPasskey;
BT_ASSERT_SIZE(BtConPasskey, 8);

/** The PIN code of an authentication reply; sent as it is. */
typedef struct BtConPinCode {
    uint8_t bytes[20];         /*  0                                                  */
} BtConPinCode;
BT_ASSERT_SIZE(BtConPinCode, 20);

/** The service that a service discovery looks for; sent as it is. */
typedef struct BtConServiceId {
    uint8_t bytes[24];         /*  0                                                  */
} BtConServiceId;
BT_ASSERT_SIZE(BtConServiceId, 24);

/** How lost links are reconnected; sent as it is. Passed by value. */
struct linkloss_behaviour {
    uint32_t words[9];         /*  0                                                  */
};
typedef struct linkloss_behaviour BtConLinklossBehaviour;
BT_ASSERT_SIZE(BtConLinklossBehaviour, 36);

BT_EXTERN_C_BEGIN

/* ---- the sender */

/**
 * Posts a prepared message to a channel as a full message of 1,024 bytes, zero behind the given bytes.
 *
 * The requests below use it; an application has no need to.
 *
 * @param channel  process number of the receiver
 * @param length   bytes of `message`, header included; more than 1,024 are cut to 1,024
 * @param message  header and payload
 * @param zero     not used, 0
 * @return 0 when the low 16 bits of the platform's result are 0; else -1; -1 for a null message, nothing sent
 */
BT_API int32_t _BT_SRV_CON_sys_SndMsg(uint32_t channel, uint32_t length, const void *message, uint32_t zero);

/* ---- search and registration */

/**
 * Starts a search for remote devices.
 *
 * @param value  what to search for, as the service defines it
 * @return 0 posted; -1 not posted
 *
 * Request 0xA091, 4 payload bytes.
 */
BT_API int32_t BT_SRV_CON_search(uint32_t value);

/** Ends a running search. @return 0 posted; -1 not posted. Request 0xA092, 4 payload bytes, all zero. */
BT_API int32_t BT_SRV_CON_cancelSearch(void);

/** Ends the registration of a new device. @return 0 posted; -1 not posted. Request 0xA086, no payload. */
BT_API int32_t BT_SRV_CON_TerminationRegistration(void);

/**
 * Removes a registered device.
 *
 * @param addr  any address, the one for no device included
 * @return 0 posted; -1 not posted; -2 null address
 *
 * Request 0xA084, 8 payload bytes: address.
 */
BT_API int32_t BT_SRV_CON_delete(const BtDevAddress *addr);

/**
 * Asks a remote device for its services.
 *
 * @return 0 posted; -1 not posted; -2 address refused
 *
 * Request 0xA0E4, 8 payload bytes: address.
 */
BT_API int32_t BT_SRV_CON_startServiceDiscovery(const BtDevAddress *addr);

/**
 * Asks a remote device for one service.
 *
 * @return 0 posted; -1 not posted; -2 address refused or null service identifier
 *
 * Request 0xA0F3, 32 payload bytes: address, service identifier.
 */
BT_API int32_t BT_SRV_CON_startServiceDiscovery_UUID(const BtDevAddress *addr, const BtConServiceId *service_id);

/**
 * Asks a remote device for its device ID information.
 *
 * @param addr  any address, the one for no device included
 * @return 0 posted; -1 not posted; -2 null address
 *
 * Request 0xA0F2, 8 payload bytes: address. What is known already: BT_SRV_CON_getRemoteDeviceDIDInfo().
 */
BT_API int32_t BT_SRV_CON_queryRemoteDeviceDIDInfo(const BtDevAddress *addr);

/**
 * Asks for the transmitting power of the link to a remote device.
 *
 * @return 0 posted; -1 not posted; -2 address refused
 *
 * Request 0xA0EC, 8 payload bytes: address.
 */
BT_API int32_t BT_SRV_CON_getTransmittingPower(const BtDevAddress *addr);

/* ---- authentication */

/**
 * Answers the service's question whether the numbers shown on both sides are equal.
 *
 * @param reply  the answer, as the service defines it
 * @return 0 posted; -1 not posted; -2 address refused
 *
 * Request 0xA0A2, 12 payload bytes: reply, address.
 */
BT_API int32_t BT_SRV_CON_authenticateNumericValue(uint32_t reply, const BtDevAddress *addr);

/**
 * Answers the service's question for a passkey.
 *
 * @param reply    0 carries the passkey; with any other value the passkey is sent as zeros
 * @param passkey  read only when `reply` is 0; may be null otherwise
 * @return 0 posted; -1 not posted; -2 address refused, or null passkey with reply 0
 *
 * Request 0xA0A3, 20 payload bytes: reply, address, passkey.
 */
BT_API int32_t BT_SRV_CON_authenticatePasskey(uint32_t reply, const BtDevAddress *addr, const BtConPasskey *passkey);

/**
 * Answers the service's question for a PIN code.
 *
 * @param reply  0 carries the PIN code; with any other value the PIN code is sent as zeros
 * @param pin    read only when `reply` is 0; may be null otherwise
 * @return 0 posted; -1 not posted; -2 address refused, or null PIN code with reply 0
 *
 * Request 0xA0A1, 32 payload bytes: reply, address, PIN code.
 */
BT_API int32_t BT_SRV_CON_authenticatePinCode(uint32_t reply, const BtDevAddress *addr, const BtConPinCode *pin);

/* ---- connecting and disconnecting */

/**
 * Asks for a connection on one profile of a remote device.
 *
 * Of the six values only those are sent that the profile takes: all of them for profile 5; the first for profile 7; the
 * first three and the low 16 bits of the fourth for profile 3; none for the other profiles. The rest is zero.
 *
 * @return 0 posted; -127 not posted; -2 address refused, null parameters, or profile 4 or above 8
 *
 * Request 0xA081, 40 payload bytes: address, profile, six values, 0.
 */
BT_API int32_t BT_SRV_CON_requestConnection(const BtDevAddress *addr, const BtConParameters *parameters);

/**
 * As BT_SRV_CON_requestConnection(), but sends all six values whatever the profile, and names the instance of
 * profile 5.
 *
 * @param selector  1..26; read only for profile 5, may be null otherwise (0 is sent)
 * @return 0 posted; -127 not posted; -2 address refused, null parameters, profile 4 or above 8, or for profile 5 a
 *         null selector or one out of range
 *
 * Request 0xA081, 40 payload bytes: address, profile, six values, selector.
 */
BT_API int32_t BT_SRV_CON_requestConnection_Ex(const BtDevAddress *addr, const BtConParameters *parameters,
                                               const uint32_t *selector);

/**
 * Accepts a connection that a remote device asks for.
 *
 * @param first   sent as given
 * @param filter  limits the accepted profiles; null, or a count of 0 or less, stands for no filter
 * @return 0 posted; -1 not posted; -2 address refused
 *
 * Request 0xA082, 52 payload bytes: first, address, 1 with a filter or 0 without, filter or zeros.
 */
BT_API int32_t BT_SRV_CON_acceptConnection(uint32_t first, const BtDevAddress *addr,
                                           const BtConProfileFilterBlock *filter);

/**
 * Permits a remote device to connect profiles.
 *
 * @param first   sent as given
 * @param addr    any address, the one for no device included
 * @param second  sent as given
 * @return 0 posted; -1 not posted; -2 null address
 *
 * Request 0xA0F1, 16 payload bytes: first, address, second.
 */
BT_API int32_t BT_SRV_CON_permitProfileConnection(uint32_t first, const BtDevAddress *addr, uint32_t second);

/**
 * Gives up a connection that is being made on one profile.
 *
 * @param profile  0..8
 * @return 0 posted; -1 not posted; -2 address refused, or profile above 8
 *
 * Request 0xA083, 16 payload bytes: address, profile, 0.
 */
BT_API int32_t BT_SRV_CON_cancelConnection(const BtDevAddress *addr, uint32_t profile);

/**
 * As BT_SRV_CON_cancelConnection(), but names the instance of profile 5.
 *
 * @param selector  1..26; read only for profile 5, may be null otherwise (0 is sent)
 * @return 0 posted; -1 not posted; -2 address refused, profile above 8, or for profile 5 a null selector or one out of
 *         range
 *
 * Request 0xA083, 16 payload bytes: address, profile, selector.
 */
BT_API int32_t BT_SRV_CON_cancelConnection_Ex(const BtDevAddress *addr, uint32_t profile, const uint32_t *selector);

/**
 * Gives up every connection that is being made to a remote device.
 *
 * @return 0 posted; -1 not posted; -2 address refused
 *
 * Request 0xA0ED, 8 payload bytes: address.
 */
BT_API int32_t BT_SRV_CON_cancelRemoteDeviceConnection(const BtDevAddress *addr);

/**
 * Disconnects one profile.
 *
 * @param profile  0..8
 * @return 0 posted; -1 not posted; -2 address refused, or profile above 8
 *
 * Request 0xA085, 16 payload bytes: address, profile, 0.
 */
BT_API int32_t BT_SRV_CON_requestDisconnection(const BtDevAddress *addr, uint32_t profile);

/**
 * As BT_SRV_CON_requestDisconnection(), but names the instance of profile 5.
 *
 * @param selector  1..26 or 255; read only for profile 5, may be null otherwise (0 is sent)
 * @return 0 posted; -1 not posted; -2 address refused, profile above 8, or for profile 5 a null selector or one out of
 *         range
 *
 * Request 0xA085, 16 payload bytes: address, profile, selector.
 */
BT_API int32_t BT_SRV_CON_requestDisconnection_Ex(const BtDevAddress *addr, uint32_t profile,
                                                  const uint32_t *selector);

/**
 * Disconnects everything.
 *
 * @param flag  0: of the device `addr`; otherwise any address is accepted and sent, the one for no device included
 * @return 0 posted; -1 not posted; -2 null address, or with flag 0 an address refused
 *
 * Request 0xA087, 12 payload bytes: flag, address.
 */
BT_API int32_t BT_SRV_CON_requestAllDisconnection(uint32_t flag, const BtDevAddress *addr);

/* ---- automatic connection */

/** Goes on with automatic connection. @return 0 posted; -1 not posted. Request 0xA0E8, no payload. */
BT_API int32_t BT_SRV_CON_restartAutomaticConnection(void);

/** Holds automatic connection. @return 0 posted; -1 not posted. Request 0xA0E7, no payload. */
BT_API int32_t BT_SRV_CON_suspendAutomaticConnection(void);

/** Sets how devices are connected automatically. @return 0 posted; -1 not posted. Request 0xA0E2, 8 payload bytes. */
BT_API int32_t BT_SRV_CON_setAutomaticConnectionBehavior(uint32_t first, uint32_t second);

/** Sets how failed connections are retried. @return 0 posted; -1 not posted. Request 0xA0EF, 4 payload bytes. */
BT_API int32_t BT_SRV_CON_setConnectionRetrySetting(uint32_t value);

/** Sets how lost links are reconnected. @return 0 posted; -1 not posted. Request 0xA0E6, 36 payload bytes. */
BT_API int32_t BT_SRV_CON_setLinklossReconnectionBehavior(struct linkloss_behaviour behaviour);

/** Sets which side reconnects a lost link. @return 0 posted; -1 not posted. Request 0xA0EE, 8 payload bytes. */
BT_API int32_t BT_SRV_CON_setLinklossReconnectionDirectionSetting(uint32_t first, uint32_t second);

/* ---- settings of the local device; all return 0 posted, -1 not posted */

/** Switches the Bluetooth function. Request 0xA0E9, 4 payload bytes. */
BT_API int32_t BT_SRV_CON_setBluetoothFunction(uint32_t value);

/** As BT_SRV_CON_setBluetoothFunction(), in the name of the system service: the sender is 0x08C1 (PNO_BT_SYS). */
BT_API int32_t BT_SRV_CON_setBluetoothFunction_internal(uint32_t value);

/** Sets whether other devices can find this one. Request 0xA0E1, 4 payload bytes. */
BT_API int32_t BT_SRV_CON_setDiscoverableMode(uint32_t mode);

/** Sets how simple pairing is done. Request 0xA0E3, 8 payload bytes. */
BT_API int32_t BT_SRV_CON_setSimplePairing(uint32_t first, uint32_t second);

/** Sets the debug mode of simple pairing. Request 0xA0E5, 4 payload bytes. */
BT_API int32_t BT_SRV_CON_setSimplePairingDebugMode(uint32_t mode);

/** Sets how devices without security are authenticated. Request 0xA0F0, 8 payload bytes. */
BT_API int32_t BT_SRV_CON_setNoSecurityDeviceAuthenticationSetting(uint32_t first, uint32_t second);

/** Sets whether service discovery is enforced. Request 0xA0EB, 4 payload bytes. */
BT_API int32_t BT_SRV_CON_setSDPEnforcementSetting(uint32_t value);

/** Changes a timer of the service. Request 0xA0EA, 8 payload bytes. */
BT_API int32_t BT_SRV_CON_changeTimerValue(uint32_t first, uint32_t second);

BT_EXTERN_C_END

#endif
