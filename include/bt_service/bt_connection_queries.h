/**
 * @file
 * Connection queries: what is known about registered devices and the local radio, answered at once.
 *
 * Conventions on top of those in bt_types.h:
 *
 *  1. A query sends nothing. It attaches the process to the connection data area on first use, takes the area's lock,
 *     copies out of the area and releases the lock.
 *  2. A query that cannot attach returns why: -4 when the area's lock could not be created, else the platform's code
 *     for the link. A lock that cannot be had is returned as the platform's code.
 *  3. The answer stands once it is copied: a lock that could not be released afterwards is reported, with the answer
 *     in place.
 *  4. The answers are consistent at the moment of the copy; the service may change the area right after it.
 */
#ifndef BT_SERVICE_BT_CONNECTION_QUERIES_H
#define BT_SERVICE_BT_CONNECTION_QUERIES_H

#include <bt_service/bt_connection_records.h>

BT_EXTERN_C_BEGIN

/**
 * Reads the connection mode word of a registered device.
 *
 * @param addr  device address; null is not registered
 * @param mode  receives the word as the service stored it
 * @return 0; -1 not registered, or the area could not be copied; -2 null `mode`; else see convention 2
 */
BT_API int32_t BT_SRV_CON_getConnectionMode(const BtDevAddress *addr, uint32_t *mode);

/**
 * Reads the word for the local radio's role towards a registered device.
 *
 * @param addr  device address; null is not registered
 * @param role  receives the word as the service stored it
 * @return 0; -1 not registered, or the area could not be copied; -2 null `role`; else see convention 2
 */
BT_API int32_t BT_SRV_CON_getLocalDeviceRole(const BtDevAddress *addr, uint32_t *role);

/**
 * Copies the record of a registered device.
 *
 * @param addr    device address
 * @param record  receives the whole record, 1,008 bytes
 * @return 0; -1 not registered, or the area could not be copied; -2 a null pointer, without taking the lock; else see
 *         convention 2
 */
BT_API int32_t BT_SRV_CON_getRemoteDeviceInfo(const BtDevAddress *addr, BtConRegDevInfo *record);

/**
 * Copies the records of the registered devices in the order of their registration.
 *
 * Slots of `records` behind the last copied one, up to `maximum`, get the address FF FF FF FF FF FF; the rest of their
 * bytes stays what it was. On a failure nothing is written.
 *
 * @param unused   not looked at
 * @param value    must not be negative; not used otherwise
 * @param maximum  number of records that fit into `records`
 * @param records  receives at most `maximum` records of 1,008 bytes
 * @return records copied, 0..17; 0 also on every failure: not attached, lock not had, null pointer, negative `value`,
 *         `maximum` below 1
 */
BT_API int32_t BT_SRV_CON_getRemoteDeviceList(uint32_t unused, const int32_t *value, int32_t maximum,
                                              BtConRegDevInfo *records);

/**
 * Reads the scan mode of the local radio.
 *
 * @param mode  receives the word as the service stored it
 * @return 0; -1 lock not had or not released; -2 null `mode`; else why the area could not be attached
 */
BT_API int32_t BT_SRV_CON_getScanMode(uint32_t *mode);

/**
 * Reads whether the local radio can be discovered.
 *
 * @param mode  receives the word as the service stored it
 * @return 0; -1 lock not had or not released; -2 null `mode`; else why the area could not be attached
 */
BT_API int32_t BT_SRV_CON_getDiscoverableMode(uint32_t *mode);

/**
 * Copies a device ID value of a device.
 *
 * @param addr   device address
 * @param key    key under which the service stored the value; not 0
 * @param value  receives the 8 bytes as the service stored them
 * @return 0; -1 no value under that key, or the area could not be copied; -2 no value of that device at all, a null
 *         pointer or key 0; else see convention 2
 */
BT_API int32_t BT_SRV_CON_getRemoteDeviceDIDInfo(const BtDevAddress *addr, uint32_t key, uint8_t *value);

BT_EXTERN_C_END

#endif
