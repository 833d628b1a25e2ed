/**
 * @file
 * The records of message access: what requests take, what readers fill in, and what lies in the shared areas.
 *
 * Conventions on top of those in bt_types.h:
 *
 *  1. The argument records live in the calling process only and follow the compiler's natural alignment. The areas have
 *     one layout in every build, 32-bit or 64-bit, without gaps.
 *  2. Texts carry a length of their own and need no terminating zero.
 *  3. Words, attributes, texts and entries whose meaning is not given here belong to the message access service. They
 *     are copied as they are.
 */
#ifndef BT_SERVICE_BT_MESSAGE_ACCESS_RECORDS_H
#define BT_SERVICE_BT_MESSAGE_ACCESS_RECORDS_H

#include <bt_service/bt_types.h>

/* Names under which the processes share the areas. */
#define BT_MAP_REQUEST_AREA_NAME "/tmp/shm_map_serviceapi"
#define BT_MAP_MESSAGE_AREA_NAME "/tmp/shm_map_getmsg"
#define BT_MAP_MESSAGE_LIST_NAME "/tmp/shm_map_msglst"
#define BT_MAP_FOLDER_LIST_NAME "/tmp/shm_map_fldlst"
#define BT_MAP_PUSH_AREA_NAME "/tmp/shm_map_pushmsg"
#define BT_MAP_INSTANCE_AREA_NAME "/tmp/shm_map_insinfo"

enum BtMapCapacity {
    BT_MAP_HANDLE_SIZE = 16,           /**< bytes of a message handle */
    BT_MAP_TEXT_MAX = 256,             /**< bytes of a name or text in an argument record */
    BT_MAP_DATE_TIME_SIZE = 16,        /**< characters of a date and time */
    BT_MAP_MESSAGE_MAX = 150,          /**< entries of the message list */
    BT_MAP_MESSAGE_ENTRY_SIZE = 1648,  /**< bytes of a message list entry */
    BT_MAP_FOLDER_MAX = 100,           /**< entries of the folder list */
    BT_MAP_FOLDER_ENTRY_SIZE = 260,    /**< bytes of a folder list entry */
    BT_MAP_INSTANCE_MAX = 12,          /**< server instances */
    BT_MAP_INSTANCE_NAME_MAX = 64,     /**< bytes of an instance's name */
    BT_MAP_BODY_MAX = 65541,           /**< bytes of a fetched body in an area of the usual size */
    BT_MAP_PUSH_BODY_MAX = 1500,       /**< bytes of a body to push in an area of the usual size */
    BT_MAP_MESSAGE_AREA_SIZE = 73713,  /**< bytes of the message area, body included */
    BT_MAP_PUSH_AREA_SIZE = 9652       /**< bytes of the push area, body included */
};

/* ---- arguments of requests */

/** A message and what to do with it. */
struct message_handle {
    uint8_t handle[BT_MAP_HANDLE_SIZE];      /*   0                                            */
    uint32_t option;                         /*  16  its low byte is sent                      */
};
typedef struct message_handle BtMapMessageHandle;
BT_ASSERT(sizeof(BtMapMessageHandle) == 20, BtMapMessageHandle_size);
BT_ASSERT_AT(BtMapMessageHandle, option, 16);

/**
 * Which messages of which folder to count or list.
 *
 * Begin and end of the period are 16 characters each, year to second: "20261122T235959Z".
 */
struct message_filter {
    uint32_t folder_length;                  /*   0  above 256 counts as 256                   */
    uint8_t folder[BT_MAP_TEXT_MAX];         /*   4                                            */
    uint8_t type;                            /* 260  message types                             */
    char period_begin[BT_MAP_DATE_TIME_SIZE]; /* 261  all zero: start of 1900                  */
    char period_end[BT_MAP_DATE_TIME_SIZE];  /* 277  all zero: end of 2099                     */
    uint32_t read_status;                    /* 296  its low byte is sent                      */
    uint8_t recipient_length;                /* 300                                            */
    uint8_t recipient[BT_MAP_TEXT_MAX];      /* 301                                            */
    uint8_t originator_length;               /* 557                                            */
    uint8_t originator[BT_MAP_TEXT_MAX];     /* 558                                            */
    uint32_t priority;                       /* 816  its low byte is sent                      */
};
typedef struct message_filter BtMapMessageFilter;
BT_ASSERT(sizeof(BtMapMessageFilter) == 820, BtMapMessageFilter_size);
BT_ASSERT_AT(BtMapMessageFilter, folder, 4);
BT_ASSERT_AT(BtMapMessageFilter, type, 260);
BT_ASSERT_AT(BtMapMessageFilter, period_begin, 261);
BT_ASSERT_AT(BtMapMessageFilter, period_end, 277);
BT_ASSERT_AT(BtMapMessageFilter, read_status, 296);
BT_ASSERT_AT(BtMapMessageFilter, recipient_length, 300);
BT_ASSERT_AT(BtMapMessageFilter, recipient, 301);
BT_ASSERT_AT(BtMapMessageFilter, originator_length, 557);
BT_ASSERT_AT(BtMapMessageFilter, originator, 558);
BT_ASSERT_AT(BtMapMessageFilter, priority, 816);

/** Which part of a message list to fetch, and with which properties of each message. */
struct message_listing {
    uint32_t max_count;                      /*   0  entries at most                           */
    uint32_t start_offset;                   /*   4  messages to leave out at the start        */
    struct message_filter filter;            /*   8                                            */
    uint32_t mask;                           /* 828  parameter mask                            */
};
typedef struct message_listing BtMapMessageListing;
BT_ASSERT(sizeof(BtMapMessageListing) == 832, BtMapMessageListing_size);
BT_ASSERT_AT(BtMapMessageListing, start_offset, 4);
BT_ASSERT_AT(BtMapMessageListing, filter, 8);
BT_ASSERT_AT(BtMapMessageListing, mask, 828);

/** The folder to change to. */
struct directory_record {
    uint32_t length;                         /*   0  above 256 counts as 256                   */
    uint8_t name[BT_MAP_TEXT_MAX];           /*   4                                            */
};
typedef struct directory_record BtMapDirectory;
BT_ASSERT(sizeof(BtMapDirectory) == 260, BtMapDirectory_size);
BT_ASSERT_AT(BtMapDirectory, name, 4);

/** The message to delete. */
struct delete_record {
    uint32_t first;                          /*   0  its low byte is sent                      */
    uint8_t handle[BT_MAP_HANDLE_SIZE];      /*   4                                            */
    uint32_t length;                         /*  20  above 256 counts as 256                   */
    uint8_t text[BT_MAP_TEXT_MAX];           /*  24                                            */
};
typedef struct delete_record BtMapDelete;
BT_ASSERT(sizeof(BtMapDelete) == 280, BtMapDelete_size);
BT_ASSERT_AT(BtMapDelete, handle, 4);
BT_ASSERT_AT(BtMapDelete, length, 20);
BT_ASSERT_AT(BtMapDelete, text, 24);

/** What to save as a message. */
struct save_record {
    uint32_t length;                         /*   0  above 256 counts as 256                   */
    uint8_t data[BT_MAP_TEXT_MAX];           /*   4                                            */
};
typedef struct save_record BtMapSave;
BT_ASSERT(sizeof(BtMapSave) == 260, BtMapSave_size);
BT_ASSERT_AT(BtMapSave, data, 4);

/** What to search the message list for. */
struct search_record {
    uint32_t first;                          /*   0  its low byte is sent                      */
    uint8_t length;                          /*   4                                            */
    uint8_t text[255];                       /*   5                                            */
};
typedef struct search_record BtMapSearch;
BT_ASSERT(sizeof(BtMapSearch) == 260, BtMapSearch_size);
BT_ASSERT_AT(BtMapSearch, length, 4);
BT_ASSERT_AT(BtMapSearch, text, 5);

/** An attachment, as the service names it. */
struct attachment_record {
    uint8_t bytes[16];                       /*   0                                            */
};
typedef struct attachment_record BtMapAttachment;
BT_ASSERT(sizeof(BtMapAttachment) == 16, BtMapAttachment_size);

/** Argument of BT_SRV_MAP_testMode(); not used. */
struct test_record {
    uint32_t words[2];                       /*   0                                            */
};
typedef struct test_record BtMapTest;
BT_ASSERT(sizeof(BtMapTest) == 8, BtMapTest_size);

/** Argument of BT_SRV_MAP_moveMessage(); not used. */
struct move_record {
    uint32_t words[4];                       /*   0                                            */
};
typedef struct move_record BtMapMove;
BT_ASSERT(sizeof(BtMapMove) == 16, BtMapMove_size);

/* ---- a message */

/** One of the three groups of texts of a message. */
struct message_group {
    uint32_t head;                           /*    0                                           */
    uint8_t first_texts[5][260];             /*    4                                           */
    uint8_t second_texts[5][264];            /* 1304                                           */
};
typedef struct message_group BtMapMessageGroup;
BT_ASSERT_SIZE(BtMapMessageGroup, 2624);
BT_ASSERT_AT(BtMapMessageGroup, first_texts, 4);
BT_ASSERT_AT(BtMapMessageGroup, second_texts, 1304);

/** A fetched message. Set `body` before fetching; everything else is filled in. */
struct message_record {
    uint32_t header[5];                      /*    0                                           */
    struct message_group group[3];           /*   20                                           */
    uint32_t tail;                           /* 7892                                           */
    uint8_t tail_text[256];                  /* 7896                                           */
    uint16_t body_attribute_1;               /* 8152                                           */
    uint16_t body_attribute_2;               /* 8154                                           */
    uint32_t body_length;                    /* 8156  bytes copied to the body buffer          */
    uint16_t body_attribute_3;               /* 8160                                           */
    uint16_t body_attribute_4;               /* 8162                                           */
    uint8_t *body;                           /*       in: the caller's body buffer             */
};
typedef struct message_record BtMapMessageRecord;
BT_ASSERT(sizeof(BtMapMessageRecord) == offsetof(BtMapMessageRecord, body) + sizeof(void *), BtMapMessageRecord_size);
BT_ASSERT_AT(BtMapMessageRecord, group, 20);
BT_ASSERT_AT(BtMapMessageRecord, tail, 7892);
BT_ASSERT_AT(BtMapMessageRecord, tail_text, 7896);
BT_ASSERT_AT(BtMapMessageRecord, body_attribute_1, 8152);
BT_ASSERT_AT(BtMapMessageRecord, body_attribute_2, 8154);
BT_ASSERT_AT(BtMapMessageRecord, body_length, 8156);
BT_ASSERT_AT(BtMapMessageRecord, body_attribute_3, 8160);
BT_ASSERT_AT(BtMapMessageRecord, body_attribute_4, 8162);
BT_ASSERT_AT(BtMapMessageRecord, body, sizeof(void *) == 8 ? 8168 : 8164);

/** A message to push: a message without its first four header words. Passed by value. */
struct push_record {
    uint32_t header_5;                       /*    0                                           */
    struct message_group group[3];           /*    4  the first one is used                    */
    uint32_t tail;                           /* 7876                                           */
    uint8_t tail_text[256];                  /* 7880                                           */
    uint16_t body_attribute_1;               /* 8136                                           */
    uint16_t body_attribute_2;               /* 8138                                           */
    uint32_t body_length;                    /* 8140  bytes at `body`                          */
    uint16_t body_attribute_3;               /* 8144                                           */
    uint16_t body_attribute_4;               /* 8146                                           */
    const uint8_t *body;                     /*       may be null when the length is 0         */
};
typedef struct push_record BtMapPushRecord;
BT_ASSERT(sizeof(BtMapPushRecord) == offsetof(BtMapPushRecord, body) + sizeof(void *), BtMapPushRecord_size);
BT_ASSERT_AT(BtMapPushRecord, group, 4);
BT_ASSERT_AT(BtMapPushRecord, tail, 7876);
BT_ASSERT_AT(BtMapPushRecord, tail_text, 7880);
BT_ASSERT_AT(BtMapPushRecord, body_attribute_1, 8136);
BT_ASSERT_AT(BtMapPushRecord, body_attribute_2, 8138);
BT_ASSERT_AT(BtMapPushRecord, body_length, 8140);
BT_ASSERT_AT(BtMapPushRecord, body_attribute_3, 8144);
BT_ASSERT_AT(BtMapPushRecord, body_attribute_4, 8146);
BT_ASSERT_AT(BtMapPushRecord, body, sizeof(void *) == 8 ? 8152 : 8148);

/* ---- server instances */

/** A message access server of the remote device. */
typedef struct BtMapInstance {
    uint8_t id;                              /*  0                                             */
    uint8_t name_length;                     /*  1  0..64                                      */
    uint8_t name[BT_MAP_INSTANCE_NAME_MAX];  /*  2  the first name_length bytes are valid      */
    uint8_t attribute;                       /* 66                                             */
} BtMapInstance;
BT_ASSERT_SIZE(BtMapInstance, 67);
BT_ASSERT_AT(BtMapInstance, name_length, 1);
BT_ASSERT_AT(BtMapInstance, name, 2);
BT_ASSERT_AT(BtMapInstance, attribute, 66);

/** The message access servers of the remote device. */
typedef struct BtMapInstanceList {
    uint8_t count;                           /*  0  0..12                                      */
    BtMapInstance instance[BT_MAP_INSTANCE_MAX]; /* 1  the first count are valid               */
} BtMapInstanceList;
BT_ASSERT_SIZE(BtMapInstanceList, 805);
BT_ASSERT_AT(BtMapInstanceList, instance, 1);

/* ---- shared areas */

/** The start of the service request area; `length` bytes of a parameter block follow it. */
typedef struct BtMapRequestArea {
    uint32_t length;                         /*  0  bytes of the parameter block               */
} BtMapRequestArea;
BT_ASSERT_SIZE(BtMapRequestArea, 4);

/** The start of the message area; the body follows it, up to the area's end. */
typedef struct BtMapMessageArea {
    uint32_t lead;                           /*    0  belongs to the service                   */
    uint32_t header[5];                      /*    4                                           */
    BtMapMessageGroup group[3];              /*   24                                           */
    uint32_t tail;                           /* 7896                                           */
    uint8_t tail_text[256];                  /* 7900                                           */
    uint16_t body_attribute_1;               /* 8156                                           */
    uint16_t body_attribute_2;               /* 8158                                           */
    uint32_t body_length;                    /* 8160  bytes                                    */
    uint16_t body_attribute_3;               /* 8164                                           */
    uint16_t body_attribute_4;               /* 8166                                           */
    uint32_t body_pointer;                   /* 8168  belongs to the service                   */
} BtMapMessageArea;
BT_ASSERT_SIZE(BtMapMessageArea, 8172);
BT_ASSERT_AT(BtMapMessageArea, header, 4);
BT_ASSERT_AT(BtMapMessageArea, group, 24);
BT_ASSERT_AT(BtMapMessageArea, tail, 7896);
BT_ASSERT_AT(BtMapMessageArea, tail_text, 7900);
BT_ASSERT_AT(BtMapMessageArea, body_attribute_1, 8156);
BT_ASSERT_AT(BtMapMessageArea, body_attribute_2, 8158);
BT_ASSERT_AT(BtMapMessageArea, body_length, 8160);
BT_ASSERT_AT(BtMapMessageArea, body_attribute_3, 8164);
BT_ASSERT_AT(BtMapMessageArea, body_attribute_4, 8166);
BT_ASSERT_AT(BtMapMessageArea, body_pointer, 8168);
BT_ASSERT(sizeof(BtMapMessageArea) + BT_MAP_BODY_MAX == BT_MAP_MESSAGE_AREA_SIZE, BtMapMessageArea_body);

/** The start of the push area; the body follows it, up to the area's end. */
typedef struct BtMapPushArea {
    uint32_t header_5;                       /*    0                                           */
    BtMapMessageGroup group[3];              /*    4  the first one is written                 */
    uint32_t tail;                           /* 7876                                           */
    uint8_t tail_text[256];                  /* 7880                                           */
    uint16_t body_attribute_1;               /* 8136                                           */
    uint16_t body_attribute_2;               /* 8138                                           */
    uint32_t body_length;                    /* 8140  bytes                                    */
    uint16_t body_attribute_3;               /* 8144                                           */
    uint16_t body_attribute_4;               /* 8146                                           */
    uint32_t body_address;                   /* 8148  of the body in the writing process, low 32 bits */
} BtMapPushArea;
BT_ASSERT_SIZE(BtMapPushArea, 8152);
BT_ASSERT_AT(BtMapPushArea, group, 4);
BT_ASSERT_AT(BtMapPushArea, tail, 7876);
BT_ASSERT_AT(BtMapPushArea, tail_text, 7880);
BT_ASSERT_AT(BtMapPushArea, body_attribute_1, 8136);
BT_ASSERT_AT(BtMapPushArea, body_attribute_2, 8138);
BT_ASSERT_AT(BtMapPushArea, body_length, 8140);
BT_ASSERT_AT(BtMapPushArea, body_attribute_3, 8144);
BT_ASSERT_AT(BtMapPushArea, body_attribute_4, 8146);
BT_ASSERT_AT(BtMapPushArea, body_address, 8148);
BT_ASSERT(sizeof(BtMapPushArea) + BT_MAP_PUSH_BODY_MAX == BT_MAP_PUSH_AREA_SIZE, BtMapPushArea_body);

/** The message list area. */
typedef struct BtMapMessageListArea {
    uint32_t count;                          /*  0  entries in use, 0..150                     */
    uint8_t reserved[12];                    /*  4  belongs to the service                     */
    uint8_t entries[BT_MAP_MESSAGE_MAX][BT_MAP_MESSAGE_ENTRY_SIZE]; /* 16                      */
} BtMapMessageListArea;
BT_ASSERT_SIZE(BtMapMessageListArea, 247216);
BT_ASSERT_AT(BtMapMessageListArea, reserved, 4);
BT_ASSERT_AT(BtMapMessageListArea, entries, 16);

/** The folder list area. */
typedef struct BtMapFolderListArea {
    uint32_t count;                          /*  0  entries in use, 0..100                     */
    uint8_t entries[BT_MAP_FOLDER_MAX][BT_MAP_FOLDER_ENTRY_SIZE]; /* 4                         */
} BtMapFolderListArea;
BT_ASSERT_SIZE(BtMapFolderListArea, 26004);
BT_ASSERT_AT(BtMapFolderListArea, entries, 4);

/** An entry of the server instance area. */
typedef struct BtMapInstanceEntry {
    uint8_t reserved[8];                     /*  0  belongs to the service                     */
    uint8_t id;                              /*  8                                             */
    uint8_t name_length;                     /*  9  0..64                                      */
    uint8_t name[BT_MAP_INSTANCE_NAME_MAX];  /* 10                                             */
    uint8_t attribute;                       /* 74                                             */
    uint8_t reserved_end;                    /* 75  belongs to the service                     */
} BtMapInstanceEntry;
BT_ASSERT_SIZE(BtMapInstanceEntry, 76);
BT_ASSERT_AT(BtMapInstanceEntry, id, 8);
BT_ASSERT_AT(BtMapInstanceEntry, name_length, 9);
BT_ASSERT_AT(BtMapInstanceEntry, name, 10);
BT_ASSERT_AT(BtMapInstanceEntry, attribute, 74);
BT_ASSERT_AT(BtMapInstanceEntry, reserved_end, 75);

/** The server instance area. */
typedef struct BtMapInstanceArea {
    uint8_t count;                           /*   0  entries in use, 0..12                     */
    uint8_t reserved[3];                     /*   1  belongs to the service                    */
    BtMapInstanceEntry entries[BT_MAP_INSTANCE_MAX]; /* 4                                      */
    uint8_t reserved_end[24];                /* 916  belongs to the service                    */
} BtMapInstanceArea;
BT_ASSERT_SIZE(BtMapInstanceArea, 940);
BT_ASSERT_AT(BtMapInstanceArea, reserved, 1);
BT_ASSERT_AT(BtMapInstanceArea, entries, 4);
BT_ASSERT_AT(BtMapInstanceArea, reserved_end, 916);

#endif
