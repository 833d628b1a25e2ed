/**
 * @file
 * The connection data store: the shared record of registered devices, order lists, device IDs, the last search and
 * connection settings. The connection service keeps it current with these operations.
 *
 * Conventions on top of those in bt_types.h:
 *
 *  1. Results: 0; -1 failure, the area not being attached included; -2 bad argument: a null pointer unless stated
 *     otherwise, a profile index outside 0..7, the address FF FF FF FF FF FF (no device) where a device is meant. A
 *     lock that could not be taken or released gives the platform's code. A refused operation changes nothing.
 *  2. One lock guards the area in all processes. It is never nested: an operation that takes it must not be called by
 *     a thread that holds it. Without a semaphore (-4 from bt_con_ApiInit) operations run unguarded.
 *  3. `lock_flag` 1: the call takes the lock itself; anything else: the caller holds it, or reads without it.
 *  4. An operation that changes a persistent list rewrites the image file when the list's bytes change. Whether that
 *     succeeds is not reported: the area holds the new content.
 *  5. A stored count that cannot be is taken for 0 when negative, for the capacity when too large; the operation's
 *     next store writes a possible one. The field accessors alone hand out the bytes as they are stored.
 */
#ifndef BT_SERVICE_BT_CONNECTION_STORE_H
#define BT_SERVICE_BT_CONNECTION_STORE_H

#include <bt_service/bt_connection_records.h>

BT_EXTERN_C_BEGIN

/* ---------------------------------------------------------------------------------------------- area and lock */

/** What the process is attached to; both words 0 at start, filled by bt_con_ApiInit and kept from then on. */
extern BT_API BtConShareHandle g_bt_con_share;

/** The persistent part without any device: what a reset writes. */
extern BT_API const BtConPersistentData g_con_data_from_init;

/** @return the address of g_bt_con_share; never null */
BT_API BtConShareHandle *bt_con_getShareMemAccessPtr(void);

/**
 * Attaches the process to the area and opens its lock; what is done already is not done again.
 *
 * The call that first opens the lock in the process loads the image file into the area when `mode` is 1, whatever
 * comes of that. Threads that call meanwhile wait.
 *
 * @param mode  1 load the image; anything else do not
 * @return 0; -4 the lock could not be created, the area stays attached; else the platform's code for the link
 */
BT_API int32_t bt_con_ApiInit(uint32_t mode);

/** Takes the lock. @return 0, also while there is no semaphore; else the platform's code, the lock not being held */
BT_API int32_t bt_con_semLock(void);

/** Releases the lock. @return 0, also while there is no semaphore; else the platform's code */
BT_API int32_t bt_con_semUnlock(void);

/**
 * Copies bytes of the area out.
 *
 * @return 0; -1 not attached, null pointer or size 0; the code of a lock that could not be taken or released
 */
BT_API int32_t bt_con_getter(const void *field, void *buffer, uint32_t size, uint32_t lock_flag);

/**
 * Copies bytes into the area, when they differ from what is there. The comparison is made before the lock is taken.
 *
 * @param write_from  1 writes the image file after a change, behind the lock when the call took it
 * @return 0, unchanged bytes and a failed image write included; -1 not attached, null pointer or size 0; the code of a
 *         lock that could not be taken or released
 */
BT_API int32_t bt_con_setter(void *field, const void *buffer, uint32_t size, uint32_t write_from, uint32_t lock_flag);

/* ------------------------------------------------------------------------------------------- field accessors
 * Each copies one whole field, out with `get` and in with `set`, and returns 0, or -1 for any failure of
 * bt_con_getter() or bt_con_setter(). Arrays are passed by their first element. The `set` of a persistent field
 * rewrites the image file on a change, except the one named NoFROMWrite; both getters of that field are the same.
 */
BT_API int32_t bt_con_getRegisteredDeviceListInfo(BtConRegDevListInfo *buffer, uint32_t lock_flag);
BT_API int32_t bt_con_setRegisteredDeviceListInfo(const BtConRegDevListInfo *buffer, uint32_t lock_flag);
BT_API int32_t bt_con_getRegisteredDeviceListInfoNoFROMWrite(BtConRegDevListInfo *buffer, uint32_t lock_flag);
BT_API int32_t bt_con_setRegisteredDeviceListInfoNoFROMWrite(const BtConRegDevListInfo *buffer, uint32_t lock_flag);
BT_API int32_t bt_con_getRegisteredOrderList(BtConOrderList *buffer, uint32_t lock_flag);
BT_API int32_t bt_con_setRegisteredOrderList(const BtConOrderList *buffer, uint32_t lock_flag);
/** Eight lists, by profile index. */
BT_API int32_t bt_con_getProfileConnectedOrderList(BtConOrderList *buffer, uint32_t lock_flag);
BT_API int32_t bt_con_setProfileConnectedOrderList(const BtConOrderList *buffer, uint32_t lock_flag);
/** Seventeen entries. */
BT_API int32_t bt_con_getRegisteredDeviceDIDInfoList(BtConDidInfoEntry *buffer, uint32_t lock_flag);
BT_API int32_t bt_con_setRegisteredDeviceDIDInfoList(const BtConDidInfoEntry *buffer, uint32_t lock_flag);
BT_API int32_t bt_con_getSearchDevlist(BtConSearchDevList *buffer, uint32_t lock_flag);
BT_API int32_t bt_con_setSearchDevlist(const BtConSearchDevList *buffer, uint32_t lock_flag);
/** Four words. */
BT_API int32_t bt_con_getConnectSetVal(uint32_t *buffer, uint32_t lock_flag);
BT_API int32_t bt_con_setConnectSetVal(const uint32_t *buffer, uint32_t lock_flag);
/** 32 bytes. */
BT_API int32_t bt_con_getLinkLossConnectSetVal(uint8_t *buffer, uint32_t lock_flag);
BT_API int32_t bt_con_setLinkLossConnectSetVal(const uint8_t *buffer, uint32_t lock_flag);
BT_API int32_t bt_con_getDiscoverableStatus(uint32_t *buffer, uint32_t lock_flag);
BT_API int32_t bt_con_setDiscoverableStatus(const uint32_t *buffer, uint32_t lock_flag);
BT_API int32_t bt_con_getScanMode(uint32_t *buffer, uint32_t lock_flag);
BT_API int32_t bt_con_setScanMode(const uint32_t *buffer, uint32_t lock_flag);
/** Eight bytes. */
BT_API int32_t bt_con_getSimplepairingCapability(uint8_t *buffer, uint32_t lock_flag);
BT_API int32_t bt_con_setSimplepairingCapability(const uint8_t *buffer, uint32_t lock_flag);
BT_API int32_t bt_con_getBluetoothSetVal(uint32_t *buffer, uint32_t lock_flag);
BT_API int32_t bt_con_setBluetoothSetVal(const uint32_t *buffer, uint32_t lock_flag);

/* ------------------------------------------------------------------------------------------------ image file */

/** @return the sum of `length` bytes, wrapping at 32 bits; 0 for a length below 1 or null */
BT_API uint32_t bt_con_calcSum(const uint8_t *bytes, int32_t length);

/**
 * Rewrites the image file with the persistent part as it stands, without taking the lock. The file must exist.
 *
 * @return 0; -1 not attached, or the file could not be opened or written whole
 */
BT_API int32_t bt_con_writeFROM(void);

/**
 * Loads the image file into the area. A missing, short or damaged image, and one that asks for it, is replaced by the
 * defaults in area and file.
 *
 * @return 0; -1 not attached, or the defaults are in the area but not in the file; the code of a lock that could not
 *         be taken or released
 */
BT_API int32_t bt_con_readFROM(void);

/**
 * Resets the persistent part to the defaults, without taking the lock, and writes the image file. Meant for start-up:
 * whoever reads or changes the area meanwhile may meet a mix of old and default bytes.
 *
 * @return 0; -1 not attached, or the defaults are in the area but not in the file
 */
BT_API int32_t bt_con_initFROM(void);

/**
 * Attaches with bt_con_ApiInit(1) at start-up and keeps or resets what it loaded. What becomes of either is not told.
 *
 * @param status  0 or 2 reset to the defaults; 1 keep; 3 do nothing at all
 * @return 1 for 0, 2 and 3; 0 for 1; -1 any other status, nothing done
 */
BT_API int32_t bt_con_checkBackUpData(int32_t status);

/* ------------------------------------------------------------------------------------- registered device list */

/**
 * Adds a device at the end of the list, or updates a registered one.
 *
 * A null pointer but `addr` leaves that field as it is; in a new device, as the empty slot has it. The image file is
 * rewritten only when one of `name`, `device_class`, `profile` and the three `ext_info` was given; the rest reaches
 * the file with its next write.
 *
 * @param profile     nine entries
 * @param runtime_words  three words        @param runtime_block  8 bytes
 * @param ext_info_1  56 bytes              @param ext_info_2  six words        @param ext_info_3  532 bytes
 * @return 0; -1 not attached, the list is full, or it could not be stored; -2 bad `addr`; a lock's code
 */
BT_API int32_t bt_con_addRegDev(const BtDevAddress *addr, const BtConDeviceName *name, const uint32_t *device_class,
                                const BtConProfileEntry *profile, const uint32_t *runtime_words,
                                const uint8_t *runtime_block, const uint8_t *ext_info_1, const uint32_t *ext_info_2,
                                uint32_t device_attribute, uint32_t connection_mode, const uint8_t *ext_info_3,
                                uint32_t local_role);

/** Removes a device and closes the gap. @return 0; -1 not attached or not registered; -2 bad `addr`; a lock's code */
BT_API int32_t bt_con_delRegDev(const BtDevAddress *addr);

/**
 * Removes those of `count` devices that are registered.
 *
 * @param addrs  `count` address slots; a negative count removes nothing
 * @return 0; -1 not attached; -2 null `addrs`; a lock's code
 */
BT_API int32_t bt_con_delpluralRegDev(const BtDevAddress *addrs, int32_t count);

/**
 * Copies a registered device's record and its three words.
 *
 * @param index      receives the slot, or -1 when the device is not registered or the call is refused
 * @param attribute  receives the word; 0 when the device is not registered. The other outputs then stay as they are.
 * @return 0, also for a device that is not registered; -1 not attached; -2 bad `addr` or a null output; a lock's code
 */
BT_API int32_t bt_con_getRegDev(const BtDevAddress *addr, BtConRegDevInfo *record, int32_t *index, uint32_t *attribute,
                                uint32_t *mode, uint32_t *role);

/**
 * Copies a registered device's name. On a failure, null pointers aside, `name` receives an empty UTF-8 name.
 *
 * @return 0; -1 a null pointer, or not registered; the failure of bt_con_getRegDev()
 */
BT_API int32_t bt_con_getRegisterDeviceName(const BtDevAddress *addr, BtConDeviceName *name);

/** Looks an address up in the area, for a caller that holds the lock. @return the slot; -1 not registered or null */
BT_API int32_t bt_con_getRegisterDeviceIndex(const BtDevAddress *addr);

/** Reads the number of registered devices, 0..17, without the lock. @return 0; -1 null or not attached */
BT_API int32_t bt_con_getRegisterDeviceNum(int32_t *count);

/** Empties the list. @return 0; -1 */
BT_API int32_t bt_con_initRegDev(void);

/** Marks every registered device as connected on no profile. @return 0; -1 not attached; a lock's code */
BT_API int32_t bt_con_ConnectInitRegDev(void);

/** @return 1 when the entry that the profile index selects says supported, exactly 1; else 0, for null too */
BT_API int32_t bt_con_IsCheckRegDevSupportProfile(const BtConRegDevInfo *record, uint32_t profile_index);

/** @return 1 when the entry that the profile index selects says connected, exactly 1; else 0, for null too */
BT_API int32_t bt_con_IsCheckRegDevConnectProfile(const BtConRegDevInfo *record, uint32_t profile_index);

/** @return 1 when the filter names the profile index; else 0, for null too */
BT_API int32_t bt_con_IsCheckProfileFilter(const BtConProfileFilter *filter, uint32_t profile_index);

/** @return 1 when the device supports a profile that the filter names; else 0, for null too */
BT_API int32_t bt_con_IsCheckRegDevSupportProfile4Filter(const BtConRegDevInfo *record,
                                                         const BtConProfileFilter *filter);

/* ------------------------------------------------------------------------------------------------ order lists
 * The readers (getone, getall, Searsh) do not take the lock: a caller that needs a consistent view holds it. Only the
 * six bytes of an address are copied. Positions are 0..16.
 */

/** Empties the registered order list. @return 0; -1; a lock's code */
BT_API int32_t bt_con_initOrderList(void);

/** Appends a device, unless it is in the list. @return 0; -1 the list is full; -2 bad `addr`; a lock's code */
BT_API int32_t bt_con_addOrderList(const BtDevAddress *addr);

/** Removes a device, if it is in the list. @return 0; -1; -2 null; a lock's code */
BT_API int32_t bt_con_delOrderList(const BtDevAddress *addr);

/** Copies the address at a position, FF x 6 behind the last. @return 0; -1 empty list or bad position; -2 null */
BT_API int32_t bt_con_getoneOrderList(BtDevAddress *addr, int32_t position);

/** Copies the registered order list. @return 0; -1 not attached; -2 null */
BT_API int32_t bt_con_getallOrderList(BtConOrderList *list);

/** Finds a device; -1 in `position` when it is not in the list. @return 0; -1 not attached; -2 null */
BT_API int32_t bt_con_SearshOrderListAddr(const BtDevAddress *addr, int32_t *position);

/** Empties the order lists of all profiles. @return 0; -1; a lock's code */
BT_API int32_t bt_con_initConnectOrderList(void);

/** Puts a device first in a profile's list; a full list drops its last. @return 0; -1; -2 bad argument; a lock's code */
BT_API int32_t bt_con_addConnectOrder(const BtDevAddress *addr, uint32_t profile_index);

/** Removes a device, if it is in the profile's list. @return 0; -1; -2 null or bad index; a lock's code */
BT_API int32_t bt_con_delConnectOrder(const BtDevAddress *addr, uint32_t profile_index);

/** Copies the address at a position. @return 0; -1 null, empty list or bad position; -2 bad profile index */
BT_API int32_t bt_con_getoneConnectOrder(BtDevAddress *addr, uint32_t profile_index, int32_t position);

/** Copies a profile's list. @return 0; -1 not attached; -2 null or bad profile index */
BT_API int32_t bt_con_getallConnectOrder(BtConOrderList *list, uint32_t profile_index);

/** Removes the slot at a position of the caller's list, closing the gap. @return 0; -1 null or no such slot in use */
BT_API int32_t bt_con_moveupOrderList(BtConOrderList *list, int32_t position);

/**
 * Puts an address at position `to` of the caller's list.
 *
 * @param from    with `insert` 0 the slot that is overwritten: slots `to`..`from`-1 move back one place
 * @param insert  1 moves slot `from` back as well and counts one more; a 17th slot's entry falls off
 * @return 0; -1 null, or not 0 <= `to` <= `from` <= 16
 */
BT_API int32_t bt_con_movedownOrderList(const BtDevAddress *addr, BtConOrderList *list, int32_t to, int32_t from,
                                        int32_t insert);

/* -------------------------------------------------------------------------------------------- device ID records
 * The first three work on a caller's list of 17 entries. Keys are not 0; a value is 8 bytes.
 */

/**
 * Finds a device's entry.
 *
 * @param index  receives the entry; without one the first empty entry (-2), or 17 when all are in use (0)
 * @return 0; -2 not in the list, or a null pointer, which leaves `index` as it is
 */
BT_API int32_t bt_con_searchRegisteredDeviceDIDInfo(const BtDevAddress *addr, const BtConDidInfoEntry *list,
                                                    int32_t *index);

/** Copies a value out of an entry. @return 0; -1 no such key; -2 key 0, index outside 0..16, null */
BT_API int32_t bt_con_getDeviceDIDInfo(int32_t index, uint32_t key, const BtConDidInfoEntry *list, uint8_t *value);

/** Stores a value and all 8 bytes of `addr` in an entry. @return 0; -1 other keys in both slots; -2 bad argument */
BT_API int32_t bt_con_setDeviceDIDInfo(int32_t index, const BtDevAddress *addr, uint32_t key, BtConDidInfoEntry *list,
                                       const uint8_t *value);

/** Reads a value of a device. @return 0; -1 no such key; -2 unknown device, key 0 or null; a lock's code */
BT_API int32_t bt_con_getRegisteredDeviceDIDInfo(const BtDevAddress *addr, uint32_t key, uint8_t *value);

/**
 * Stores a value for a device. A third key, an 18th device and a bad argument are not stored and not reported.
 *
 * @return 0; -1 the area could not be copied or stored; the code of a lock that could not be taken
 */
BT_API int32_t bt_con_addRegisteredDeviceDIDInfo(const BtDevAddress *addr, uint32_t key, const uint8_t *value);

/** Removes a device's entry. @return 0; -1; -2 unknown device or null; the code of a lock that could not be taken */
BT_API int32_t bt_con_delRegisteredDeviceDIDInfo(const BtDevAddress *addr);

/* ---------------------------------------------------------------------------------- search list and settings */

/** Finds a device in the caller's list. @return 1 found, its slot in `index`; 0 not; -2 null `index` */
BT_API int32_t bt_con_SerchDevInfo(const BtConSearchDevList *list, const BtConDevInfo *devinfo, int32_t *index);

/** Copies name, six address bytes and class word. Does nothing for a null pointer. */
BT_API void bt_con_setDevInfo(BtConDevInfo *dst, const BtConDevInfo *src);

/** Adds or refreshes a found device; a 33rd is dropped. @return 0; -1; -2 null or no device; a lock's code */
BT_API int32_t bt_con_addSearchdevlist(const BtConDevInfo *devinfo);

/** Empties the search list. @return 0; -1 */
BT_API int32_t bt_con_delSearchdevlist(void);

/** Reads connect setting word `vtype`, 0..3. @return 0; -1; -2 null or bad `vtype`; a lock's code */
BT_API int32_t bt_con_getSettingStatusVtype(uint32_t *value, uint32_t vtype);

/** Writes connect setting word `vtype`, 0..3. @return 0; -1; -2 bad `vtype`; a lock's code */
BT_API int32_t bt_con_setSettingStatusVtype(uint32_t value, uint32_t vtype);

/* --------------------------------------------------------------------------------------------- device address
 * The four primitives touch the six address bytes of a slot and nothing else; their pointers must not be null.
 */

/** Copies an address. @return `destination` */
BT_API BtDevAddress *bt_con_copyBtDevAddress(BtDevAddress *destination, const BtDevAddress *source);

/** Writes FF FF FF FF FF FF, no device. @return `destination` */
BT_API BtDevAddress *bt_con_clearBtDevAddress(BtDevAddress *destination);

/** @return 1 when the addresses are equal, else 0 */
BT_API int32_t bt_con_IsCompBtDevAddress(const BtDevAddress *a, const BtDevAddress *b);

/** @return 0 for FF FF FF FF FF FF, else 1 */
BT_API int32_t bt_con_IsValidBtDevAddress(const BtDevAddress *addr);

BT_EXTERN_C_END

#endif
