/**
 * @file
 * The records of the connection data: what the shared area, its lists and the image file hold.
 *
 * Conventions on top of those in bt_types.h:
 *
 *  1. Every record is made of 32-bit words and bytes, without pointers and without gaps the compiler chooses. It has
 *     one layout in shared memory, in the image file and in every build, 32-bit or 64-bit.
 *  2. Lists are packed from slot 0. A slot that is not in use holds the address FF FF FF FF FF FF.
 *  3. Fields described as "stored as given" belong to the connection service; the store never looks into them.
 *  4. A profile index 0..7 selects one of the nine profile entries of a device: 0 and 1 the entry of the same number,
 *     2..7 the entry of the next higher number. Entry 2 is selected by none.
 */
#ifndef BT_SERVICE_BT_CONNECTION_RECORDS_H
#define BT_SERVICE_BT_CONNECTION_RECORDS_H

#include <bt_service/bt_share_handle.h>
#include <bt_service/bt_types.h>

/* Names under which the processes share the area and its lock, and the file that mirrors the persistent part. */
#define BT_CON_SHARE_DATA_NAME "BT_CON_SHARE_DATA_NAME"
#define BT_CON_SEMAPHORE_NAME "BT_CON_SEMAPHORE_NAME"
#define BT_CON_IMAGE_PATH "/fs/tmpfs/btdevicelist.txt"

enum BtConCapacity {
    BT_CON_DEVICE_MAX = 17,          /**< registered devices, slots of an order list, device ID entries */
    BT_CON_SEARCH_MAX = 32,          /**< devices of the last search */
    BT_CON_PROFILE_ENTRIES = 9,      /**< profile entries of a device */
    BT_CON_PROFILE_INDEXES = 8,      /**< profile indexes, order lists by profile */
    BT_CON_DID_SLOTS = 2,            /**< device ID values of one device */
    BT_CON_DID_VALUE_SIZE = 8,       /**< bytes of a device ID value */
    BT_CON_CONNECT_SETTINGS = 4,     /**< connect setting words */
    BT_CON_NAME_TEXT_SIZE = 248      /**< bytes of a device name */
};

/** Character sets of a device name (IANA MIBenum). */
enum BtConCharSet {
    BT_CON_CHAR_SET_US_ASCII = 3,    /**< in an empty record */
    BT_CON_CHAR_SET_UTF_8 = 106      /**< in the answer for a device without a known name */
};

/** Name of a device. */
typedef struct BtConDeviceName {
    uint32_t char_set;               /*   0  character set of the text, see BtConCharSet   */
    uint32_t name_length;            /*   4  bytes of the text, as given                   */
    uint8_t name_text[BT_CON_NAME_TEXT_SIZE]; /* 8  never interpreted                      */
} BtConDeviceName;
BT_ASSERT_SIZE(BtConDeviceName, 256);
BT_ASSERT_AT(BtConDeviceName, char_set, 0);
BT_ASSERT_AT(BtConDeviceName, name_length, 4);
BT_ASSERT_AT(BtConDeviceName, name_text, 8);

/** One profile of a registered device. */
typedef struct BtConProfileEntry {
    uint32_t connected;              /*  0  1 the profile is connected                     */
    uint32_t supported;              /*  4  1 the device supports the profile              */
    uint32_t profile_value;          /*  8  stored as given                                */
} BtConProfileEntry;
BT_ASSERT_SIZE(BtConProfileEntry, 12);
BT_ASSERT_AT(BtConProfileEntry, connected, 0);
BT_ASSERT_AT(BtConProfileEntry, supported, 4);
BT_ASSERT_AT(BtConProfileEntry, profile_value, 8);

/**
 * A registered (paired) device.
 *
 * The empty record of an unused slot is zero but for the values named in the last column.
 */
typedef struct BtConRegDevInfo {
    BtConDeviceName name;            /*   0                                  char_set 3    */
    BtDevAddress bd_addr;            /* 256                                  FF x 6        */
    uint32_t device_class;           /* 264  stored as given                               */
    BtConProfileEntry profile[BT_CON_PROFILE_ENTRIES]; /* 268                              */
    uint32_t runtime_words[3];       /* 376  stored as given                 7, 7, 7       */
    uint8_t runtime_block[8];        /* 388  stored as given                               */
    uint8_t ext_info_1[56];          /* 396  stored as given                               */
    uint32_t ext_info_2[6];          /* 452  stored as given                 first word 3  */
    uint8_t ext_info_3[532];         /* 476  stored as given                               */
} BtConRegDevInfo;
BT_ASSERT_SIZE(BtConRegDevInfo, 1008);
BT_ASSERT_AT(BtConRegDevInfo, name, 0);
BT_ASSERT_AT(BtConRegDevInfo, bd_addr, 256);
BT_ASSERT_AT(BtConRegDevInfo, device_class, 264);
BT_ASSERT_AT(BtConRegDevInfo, profile, 268);
BT_ASSERT_AT(BtConRegDevInfo, runtime_words, 376);
BT_ASSERT_AT(BtConRegDevInfo, runtime_block, 388);
BT_ASSERT_AT(BtConRegDevInfo, ext_info_1, 396);
BT_ASSERT_AT(BtConRegDevInfo, ext_info_2, 452);
BT_ASSERT_AT(BtConRegDevInfo, ext_info_3, 476);

/** The registered devices in the order in which they were added; word i of each array belongs to the device in slot i. */
typedef struct BtConRegDevListInfo {
    int32_t device_num;              /*     0  0..17                                       */
    BtConRegDevInfo device[BT_CON_DEVICE_MAX];     /*     4  slots behind device_num are empty records   */
    uint32_t device_attribute[BT_CON_DEVICE_MAX];  /* 17140  stored as given; 0 in an unused slot        */
    uint32_t connection_mode[BT_CON_DEVICE_MAX];   /* 17208  stored as given; 0 in an unused slot        */
    uint32_t local_role[BT_CON_DEVICE_MAX];        /* 17276  stored as given; 0 in an unused slot        */
} BtConRegDevListInfo;
BT_ASSERT_SIZE(BtConRegDevListInfo, 17344);
BT_ASSERT_AT(BtConRegDevListInfo, device_num, 0);
BT_ASSERT_AT(BtConRegDevListInfo, device, 4);
BT_ASSERT_AT(BtConRegDevListInfo, device_attribute, 17140);
BT_ASSERT_AT(BtConRegDevListInfo, connection_mode, 17208);
BT_ASSERT_AT(BtConRegDevListInfo, local_role, 17276);

/** Devices in the order in which the service tries them; an address appears at most once. */
typedef struct BtConOrderList {
    int32_t num;                     /*  0  0..17                                          */
    BtDevAddress addr[BT_CON_DEVICE_MAX]; /* 4  slots behind num hold FF x 6               */
} BtConOrderList;
BT_ASSERT_SIZE(BtConOrderList, 140);
BT_ASSERT_AT(BtConOrderList, num, 0);
BT_ASSERT_AT(BtConOrderList, addr, 4);

/** A device ID value under its key. */
typedef struct BtConDidSlot {
    uint32_t did_key;                /*  0  0 marks a free slot                            */
    uint8_t did_value[BT_CON_DID_VALUE_SIZE]; /* 4  stored as given                        */
} BtConDidSlot;
BT_ASSERT_SIZE(BtConDidSlot, 12);
BT_ASSERT_AT(BtConDidSlot, did_key, 0);
BT_ASSERT_AT(BtConDidSlot, did_value, 4);

/** The device ID values of one device; a list of them ends at the first entry whose address is FF x 6. */
typedef struct BtConDidInfoEntry {
    BtDevAddress bd_addr;            /*  0  all 8 bytes as given                           */
    BtConDidSlot slot[BT_CON_DID_SLOTS]; /* 8  filled from slot 0, a key at most once      */
} BtConDidInfoEntry;
BT_ASSERT_SIZE(BtConDidInfoEntry, 32);
BT_ASSERT_AT(BtConDidInfoEntry, bd_addr, 0);
BT_ASSERT_AT(BtConDidInfoEntry, slot, 8);

/** A device found by a search; laid out like the head of BtConRegDevInfo. */
typedef struct BtConDevInfo {
    BtConDeviceName name;            /*   0                                                */
    BtDevAddress bd_addr;            /* 256                                                */
    uint32_t device_class;           /* 264  stored as given                               */
} BtConDevInfo;
BT_ASSERT_SIZE(BtConDevInfo, 268);
BT_ASSERT_AT(BtConDevInfo, name, 0);
BT_ASSERT_AT(BtConDevInfo, bd_addr, 256);
BT_ASSERT_AT(BtConDevInfo, device_class, 264);

/** The devices of the last search in the order in which they were first reported. */
typedef struct BtConSearchDevList {
    int32_t num;                     /*  0  0..32                                          */
    BtConDevInfo device[BT_CON_SEARCH_MAX]; /* 4  slots behind num: zero but for FF x 6    */
} BtConSearchDevList;
BT_ASSERT_SIZE(BtConSearchDevList, 8580);
BT_ASSERT_AT(BtConSearchDevList, num, 0);
BT_ASSERT_AT(BtConSearchDevList, device, 4);

/** The connection data area. The fields up to the search list are persistent: BtConPersistentData has the same bytes. */
typedef struct BtConShareData {
    BtConRegDevListInfo registered_device_list_info;                          /*     0  registered devices   */
    BtConOrderList registered_order_list;                                     /* 17344  oldest first         */
    BtConOrderList profile_connected_order_list[BT_CON_PROFILE_INDEXES];      /* 17484  most recent first    */
    BtConDidInfoEntry registered_device_did_info_list[BT_CON_DEVICE_MAX];     /* 18604  device ID values     */
    BtConSearchDevList search_devlist;                                        /* 19148  last search          */
    uint32_t connect_set_val[BT_CON_CONNECT_SETTINGS];                        /* 27728  by vtype 0..3        */
    uint8_t link_loss_connect_set_val[32];                                    /* 27744  stored as given      */
    uint32_t discoverable_status;                                             /* 27776  stored as given      */
    uint32_t scan_mode;                                                       /* 27780  stored as given      */
    uint8_t simplepairing_capability[8];                                      /* 27784  stored as given      */
    uint32_t bluetooth_set_val;                                               /* 27792  stored as given      */
} BtConShareData;
BT_ASSERT_SIZE(BtConShareData, 27796);
BT_ASSERT_AT(BtConShareData, registered_device_list_info, 0);
BT_ASSERT_AT(BtConShareData, registered_order_list, 17344);
BT_ASSERT_AT(BtConShareData, profile_connected_order_list, 17484);
BT_ASSERT_AT(BtConShareData, registered_device_did_info_list, 18604);
BT_ASSERT_AT(BtConShareData, search_devlist, 19148);
BT_ASSERT_AT(BtConShareData, connect_set_val, 27728);
BT_ASSERT_AT(BtConShareData, link_loss_connect_set_val, 27744);
BT_ASSERT_AT(BtConShareData, discoverable_status, 27776);
BT_ASSERT_AT(BtConShareData, scan_mode, 27780);
BT_ASSERT_AT(BtConShareData, simplepairing_capability, 27784);
BT_ASSERT_AT(BtConShareData, bluetooth_set_val, 27792);

/** The part of the area that survives a restart: its first bytes, field for field. */
typedef struct BtConPersistentData {
    BtConRegDevListInfo registered_device_list_info;                          /*     0  */
    BtConOrderList registered_order_list;                                     /* 17344  */
    BtConOrderList profile_connected_order_list[BT_CON_PROFILE_INDEXES];      /* 17484  */
    BtConDidInfoEntry registered_device_did_info_list[BT_CON_DEVICE_MAX];     /* 18604  */
} BtConPersistentData;
BT_ASSERT_SIZE(BtConPersistentData, 19148);
BT_ASSERT_AT(BtConPersistentData, registered_device_list_info, 0);
BT_ASSERT_AT(BtConPersistentData, registered_order_list, 17344);
BT_ASSERT_AT(BtConPersistentData, profile_connected_order_list, 17484);
BT_ASSERT_AT(BtConPersistentData, registered_device_did_info_list, 18604);

/** The image file that mirrors the persistent part. Bytes behind it in the file are ignored. */
typedef struct BtConFromImage {
    uint8_t magic[5];                /*  0  "BTCN" and a zero byte                         */
    uint8_t init_request;            /*  5  written as 0; anything else asks for defaults  */
    uint8_t reserved[2];             /*  6  written as 0, not looked at                    */
    uint32_t checksum;               /*  8  sum of the bytes of data, wrapping             */
    BtConPersistentData data;        /* 12                                                 */
} BtConFromImage;
BT_ASSERT_SIZE(BtConFromImage, 19160);
BT_ASSERT_AT(BtConFromImage, magic, 0);
BT_ASSERT_AT(BtConFromImage, init_request, 5);
BT_ASSERT_AT(BtConFromImage, reserved, 6);
BT_ASSERT_AT(BtConFromImage, checksum, 8);
BT_ASSERT_AT(BtConFromImage, data, 12);

/**
 * Head of a profile filter; `count` profile indexes, a 32-bit word each, follow it directly.
 *
 * A filter for three profiles is `struct { BtConProfileFilter head; uint32_t indexes[3]; }` with a count of 3. The
 * caller guarantees that as many words follow as the count says.
 */
typedef struct BtConProfileFilter {
    int32_t count;                   /*  0  below 1 matches nothing                        */
} BtConProfileFilter;
BT_ASSERT_SIZE(BtConProfileFilter, 4);
BT_ASSERT_AT(BtConProfileFilter, count, 0);

/** What this process is attached to; `area` points to a BtConShareData. */
typedef struct share_handle BtConShareHandle;

#endif
