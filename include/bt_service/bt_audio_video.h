/**
 * @file
 * Remote control of the audio and video a remote device plays: playback, player settings, media information, browsing
 * of players, folders and media lists, search, and streaming control.
 *
 * Conventions of this header, in addition to those of bt_types.h:
 *
 *  1. Requests go to the audio/video service (PNO_BT_AVP). A request returns 0 posted, -127 when the message layer is
 *     unusable, or the platform's own code; the descriptions list only what comes on top of that. Nothing is sent
 *     when an argument is refused.
 *  2. The outcome arrives later as an event of the service; register for it with BT_SRV_EvtSrv_regist().
 *  3. What volumes, modes, settings, words w0..w2 and the bytes of identifiers and list entries mean is defined by the
 *     service. They are passed on as given and never interpreted.
 *  4. Payload fields are in the machine's byte order where their description does not say "big-endian".
 *  5. The three readers at the end copy what the service left in shared memory. The areas have no lock: read after the
 *     event that announces the result and before the next request of the same kind.
 */
#ifndef BT_SERVICE_BT_AUDIO_VIDEO_H
#define BT_SERVICE_BT_AUDIO_VIDEO_H

#include <bt_service/bt_types.h>

/* Names under which the service shares its results. */
#define BT_AVP_MEDIA_LIST_NAME "/tmp/shm_avp_medialst"
#define BT_AVP_PLAYER_LIST_NAME "/tmp/shm_avp_playerlst"
#define BT_AVP_MEDIA_DATA_NAME "/tmp/shm_avp_media"

enum BtAvpCapacity {
    BT_AVP_ITEM_SIZE = 8,            /**< bytes of an item identifier */
    BT_AVP_PLAYER_ID_SIZE = 2,       /**< bytes of a player identifier */
    BT_AVP_CAPABILITY_SIZE = 20,     /**< bytes of a streaming capability record */
    BT_AVP_SEARCH_TEXT_MAX = 490,    /**< bytes of a search text */
    BT_AVP_FILE_NAME_MAX = 494,      /**< bytes of a device file name */
    BT_AVP_LIST_MAX = 100,           /**< entries of a media or player list */
    BT_AVP_MEDIA_ENTRY_SIZE = 288,   /**< bytes of a media list entry */
    BT_AVP_PLAYER_ENTRY_SIZE = 300,  /**< bytes of a player list entry */
    BT_AVP_MEDIA_DATA_SIZE = 1060    /**< bytes of the current media data */
};

/** The character codes an application can show. Passed by value; lives in the process only. */
struct character_code {
    uint8_t first;             /*  0                                                       */
    uint32_t values[5];        /*  4                                                       */
};
typedef struct character_code BtAvpCharacterCode;
BT_ASSERT(sizeof(BtAvpCharacterCode) == 24, BtAvpCharacterCode_size);
BT_ASSERT_AT(BtAvpCharacterCode, values, 4);

/** Where a list reader puts what it copies. Lives in the process only, so it may hold a pointer. */
struct list_result {
    uint32_t header;           /*  0  out: the list's header word, as the service left it  */
    uint32_t count;            /*  4  out: entries copied                                  */
    void *entries;             /*  8  in: room for the entries asked for                   */
};
typedef struct list_result BtAvpListResult;
BT_ASSERT(sizeof(BtAvpListResult) == 8 + sizeof(void *), BtAvpListResult_size);
BT_ASSERT_AT(BtAvpListResult, count, 4);
BT_ASSERT_AT(BtAvpListResult, entries, 8);

/** The media list, shared as "/tmp/shm_avp_medialst". */
typedef struct BtAvpMediaListArea {
    uint32_t header;           /*  0  handed to readers as it is                           */
    uint32_t count;            /*  4  entries in use, 0..100                               */
    uint32_t reserved;         /*  8  belongs to the service                               */
    uint8_t entries[BT_AVP_LIST_MAX][BT_AVP_MEDIA_ENTRY_SIZE]; /* 12                       */
} BtAvpMediaListArea;
BT_ASSERT_SIZE(BtAvpMediaListArea, 28812);
BT_ASSERT_AT(BtAvpMediaListArea, count, 4);
BT_ASSERT_AT(BtAvpMediaListArea, reserved, 8);
BT_ASSERT_AT(BtAvpMediaListArea, entries, 12);

/** The player list, shared as "/tmp/shm_avp_playerlst". */
typedef struct BtAvpPlayerListArea {
    uint32_t header;           /*  0  handed to readers as it is                           */
    uint32_t count;            /*  4  entries in use, 0..100                               */
    uint32_t reserved;         /*  8  belongs to the service                               */
    uint8_t entries[BT_AVP_LIST_MAX][BT_AVP_PLAYER_ENTRY_SIZE]; /* 12                      */
} BtAvpPlayerListArea;
BT_ASSERT_SIZE(BtAvpPlayerListArea, 30012);
BT_ASSERT_AT(BtAvpPlayerListArea, count, 4);
BT_ASSERT_AT(BtAvpPlayerListArea, reserved, 8);
BT_ASSERT_AT(BtAvpPlayerListArea, entries, 12);

BT_EXTERN_C_BEGIN

/* ---- playback */

/** Starts playback. Request 0x1004, no payload. */
BT_API int32_t BT_SRV_AVP_play(void);

/** Starts playback because the user asked for it. Request 0x1026, no payload. */
BT_API int32_t BT_SRV_AVP_userPlay(void);

/** Pauses playback. Request 0x1005, no payload. */
BT_API int32_t BT_SRV_AVP_pause(void);

/** Changes from playing to paused and back. Request 0x1006, no payload. */
BT_API int32_t BT_SRV_AVP_togglePlayPause(void);

/** Stops playback. Request 0x1007, no payload. */
BT_API int32_t BT_SRV_AVP_stop(void);

/** Goes to the next track. Request 0x1008, no payload. */
BT_API int32_t BT_SRV_AVP_trackUp(void);

/** Goes to the previous track. Request 0x1009, no payload. */
BT_API int32_t BT_SRV_AVP_trackDown(void);

/** Goes to the next album. Request 0x100A, no payload. */
BT_API int32_t BT_SRV_AVP_albumUp(void);

/** Goes to the previous album. Request 0x100B, no payload. */
BT_API int32_t BT_SRV_AVP_albumDown(void);

/** Starts or ends fast forward. @param value which of them, 1 byte sent. Request 0x100C, 1 payload byte. */
BT_API int32_t BT_SRV_AVP_fastForward(uint8_t value);

/** Starts or ends rewind. @param value which of them, 1 byte sent. Request 0x100D, 1 payload byte. */
BT_API int32_t BT_SRV_AVP_rewind(uint8_t value);

/* ---- sound and player settings */

/** Changes the volume. @param value as the service defines it. Request 0x100E, 4 payload bytes. */
BT_API int32_t BT_SRV_AVP_changeVolume(uint32_t value);

/**
 * Sets the remote device's absolute volume (AVRCP).
 *
 * @param volume  0..0x7F. Only the low byte is sent, and of the rest only bit 7 is looked at: 0x100 sends 0
 * @return -2 bit 7 of the volume is set
 *
 * Request 0x1027, 1 payload byte.
 */
BT_API int32_t BT_SRV_AVP_setAbsoluteVomule(uint32_t volume);

/** Selects Bluetooth audio. @param value as the service defines it. Request 0x100F, 1 payload byte. */
BT_API int32_t BT_SRV_AVP_setBTAAudio(uint8_t value);

/** Sets the random mode. @param value as the service defines it. Request 0x1011, 4 payload bytes. */
BT_API int32_t BT_SRV_AVP_setRandom(uint32_t value);

/** Sets the equaliser. @param value as the service defines it. Request 0x1012, 4 payload bytes. */
BT_API int32_t BT_SRV_AVP_setEq(uint32_t value);

/** Sets the repeat mode. @param value as the service defines it. Request 0x1013, 4 payload bytes. */
BT_API int32_t BT_SRV_AVP_setRepeat(uint32_t value);

/** Sets the scan mode. @param value as the service defines it. Request 0x1014, 4 payload bytes. */
BT_API int32_t BT_SRV_AVP_setScan(uint32_t value);

/** Asks for the value of a player setting. @param value which setting. Request 0x1015, 4 payload bytes. */
BT_API int32_t BT_SRV_AVP_getPlayerApplicationValue(uint32_t value);

/**
 * Tells the remote device which character codes can be shown.
 *
 * @param code  a byte and five values
 *
 * Request 0x1016, 21 payload bytes: the byte, then the five values big-endian.
 */
BT_API int32_t BT_SRV_AVP_setCharacterCode(struct character_code code);

/* ---- information about the player */

/** Asks which functions the remote player supports. Request 0x1010, no payload. */
BT_API int32_t BT_SRV_AVP_getSupportInfo(void);

/** Asks for the playback status. Request 0x1017, no payload. */
BT_API int32_t BT_SRV_AVP_getPlaybackStatus(void);

/** Asks for the data of the current media; then BT_SRV_AVP_getMediaData(). Request 0x1018, no payload. */
BT_API int32_t BT_SRV_AVP_getMediaInfo(void);

/* ---- browsing */

/**
 * Asks for the list of players; then BT_SRV_AVP_getPlayerListData().
 *
 * @param words  w0 and w1, two words
 * @return -1 null pointer
 *
 * Request 0x101D, 8 payload bytes: w0, w1, both big-endian.
 */
BT_API int32_t BT_SRV_AVP_getPlayerList(const uint32_t *words);

/**
 * Selects a player.
 *
 * @param player  2-byte player identifier; null stands for two zero bytes
 *
 * Request 0x101F, 2 payload bytes.
 */
BT_API int32_t BT_SRV_AVP_selectPlayer(const void *player);

/**
 * Goes to the root folder.
 *
 * @param words  w0, w1 and w2, three words
 * @return -1 null pointer
 *
 * Request 0x1023, 12 payload bytes: w0, w1, w2, all big-endian.
 */
BT_API int32_t BT_SRV_AVP_rootFolder(const uint32_t *words);

/**
 * Goes into a folder.
 *
 * @param item   8-byte item identifier of the folder
 * @param words  w0, w1 and w2, three words
 * @return -1 null pointer, either of them
 *
 * Request 0x1019, 20 payload bytes: identifier, then w0, w1, w2 big-endian.
 */
BT_API int32_t BT_SRV_AVP_selectFolder(const void *item, const uint32_t *words);

/** Goes to the parent folder. Arguments, results and payload as BT_SRV_AVP_selectFolder(); request 0x101C. */
BT_API int32_t BT_SRV_AVP_folderUp(const void *item, const uint32_t *words);

/** Asks how many entries a media list has. @param value which list. Request 0x101A, 4 payload bytes. */
BT_API int32_t BT_SRV_AVP_getMediaListNum(uint32_t value);

/**
 * Asks for a part of a media list; then BT_SRV_AVP_getMediaListData().
 *
 * @param words  w0, w1 and w2, three words
 * @return -1 null pointer
 *
 * Request 0x101B, 12 payload bytes: w0, w1, w2, all big-endian.
 */
BT_API int32_t BT_SRV_AVP_getMediaList(const uint32_t *words);

/**
 * Adds an item to the list of what is played now.
 *
 * @param item  8-byte item identifier
 * @param a, b  as the service defines them
 * @return -1 null pointer
 *
 * Request 0x1020, 14 payload bytes: identifier, then a (2 bytes) and b (4 bytes) big-endian.
 */
BT_API int32_t BT_SRV_AVP_addNowPlaying(const void *item, uint16_t a, uint32_t b);

/** Plays an item. Arguments, results and payload as BT_SRV_AVP_addNowPlaying(); request 0x1022. */
BT_API int32_t BT_SRV_AVP_selectMediaContent(const void *item, uint16_t a, uint32_t b);

/**
 * Searches the player's media.
 *
 * @param value   as the service defines it
 * @param length  bytes of the text, 0..490
 * @param text    the text; may be null when the length is 0
 * @return -1 length above 490, or null text with a length
 *
 * Request 0x101E, length + 6 payload bytes: value (4 bytes) and length (2 bytes) big-endian, then the text.
 */
BT_API int32_t BT_SRV_AVP_searchItem(uint32_t value, uint32_t length, const void *text);

/** Ends a search. Request 0x1021, no payload. */
BT_API int32_t BT_SRV_AVP_cancelSearchItem(void);

/** Ends the browsing command that is running. Request 0x1028, no payload. */
BT_API int32_t BT_SRV_AVP_cancelBrwsCmd(void);

/* ---- streaming control */

/**
 * Names the device file used for streaming.
 *
 * @param length  bytes of the name, 0..494
 * @param name    the name; not null, even when the length is 0
 * @return -1 null pointer, or length above 494
 *
 * Request 0x1024, length + 2 payload bytes: length (2 bytes) big-endian, then the name.
 */
BT_API int32_t BT_SRV_AVP_STRCTL_setDeviceFileName(uint32_t length, const void *name);

/** Sets the streaming capability. @param record 20 bytes. @return -1 null pointer. Request 0x1025, 20 payload bytes. */
BT_API int32_t BT_SRV_AVP_STRCTL_setCapability(const void *record);

/* ---- results of browsing */

/**
 * Copies entries of the media list.
 *
 * Entry `start` and those that follow it go to the caller's array, 288 bytes each. Fewer than `count` are copied when
 * the list ends earlier, none when it ends before `start`.
 *
 * @param start   index of the first entry, from 0
 * @param count   entries wanted; start + count must not exceed 100
 * @param result  receives the list's header word and the number of entries copied; its entries pointer is the caller's
 *                array with room for `count` entries
 * @return 0 copied; 0 also when the service has not shared a list, which leaves the result as it was, so set its count
 *         to 0 beforehand; -1 null result, start + count above 100, or null array with something to copy: nothing is
 *         written
 */
BT_API int32_t BT_SRV_AVP_getMediaListData(uint32_t start, uint32_t count, struct list_result *result);

/** Copies entries of the player list, 300 bytes each. Otherwise as BT_SRV_AVP_getMediaListData(). */
BT_API int32_t BT_SRV_AVP_getPlayerListData(uint32_t start, uint32_t count, struct list_result *result);

/**
 * Copies the data of the current media.
 *
 * @param data  receives 1,060 bytes
 * @return 0 copied; -1 null pointer, or the service has not shared the data
 */
BT_API int32_t BT_SRV_AVP_getMediaData(void *data);

BT_EXTERN_C_END

#endif
