/**
 * @file
 * Hands-free: requests to place, answer and end calls, and queries of the phone's status.
 *
 * Conventions of this header, in addition to those of bt_types.h:
 *
 *  1. Requests go to the hands-free service (PNO_BT_HFP). A request returns 0 when it is posted and -127 when the
 *     message layer is unusable; any other code is what the platform's _sys_SndMsg() returned (1 nobody owns the
 *     process number, 2 its queue is full). A refused argument is -1 or -2, as each function says, and nothing is sent.
 *     The outcome arrives later as an event of the hands-free service.
 *  2. Queries copy out of the hands-free status area (`BtHfpStatusArea`), which the hands-free service keeps up to
 *     date. They return 0 after the copy and -1, with the output untouched, for a null output and while the area or its
 *     lock cannot be had, that is until the service has created them; calling again later is all it takes. The copy is
 *     made under the area's lock, so an output of several words is of one moment; a lock that is not had in time does
 *     not stop the copy.
 *  3. What values other than the initial ones mean is the hands-free service's; they are carried as they are.
 */
#ifndef BT_SERVICE_BT_HANDS_FREE_H
#define BT_SERVICE_BT_HANDS_FREE_H

#include <bt_service/bt_share_handle.h>
#include <bt_service/bt_types.h>

/* ---- records of requests */

/** An AT command; sent as it is. */
typedef struct BtHfpAtCommand {
    uint8_t bytes[48];         /*  0                                                  */
} BtHfpAtCommand;
BT_ASSERT_SIZE(BtHfpAtCommand, 48);

/** The number to dial; sent as it is. */
typedef struct BtHfpDialNumber {
    uint8_t bytes[84];         /*  0                                                  */
} BtHfpDialNumber;
BT_ASSERT_SIZE(BtHfpDialNumber, 84);

/** DTMF tones to send. */
typedef struct BtHfpDtmf {
    int32_t count;             /*  0  characters in use, up to 256; 0 or less: none   */
    char characters[256];      /*  4  0-9 A-D a-d # *; always sent whole              */
} BtHfpDtmf;
BT_ASSERT_SIZE(BtHfpDtmf, 260);
BT_ASSERT_AT(BtHfpDtmf, characters, 4);

/** A volume of the phone. */
typedef struct BtHfpVolume {
    uint32_t target;           /*  0  0 or 1                                          */
    uint8_t level;             /*  4  1..15                                           */
    uint8_t further[3];        /*  5  sent as they are                                */
} BtHfpVolume;
BT_ASSERT_SIZE(BtHfpVolume, 8);
BT_ASSERT_AT(BtHfpVolume, level, 4);
BT_ASSERT_AT(BtHfpVolume, further, 5);

/** Codec values; sent as they are. */
typedef struct BtHfpCodec {
    uint8_t bytes[57];         /*  0                                                  */
} BtHfpCodec;
BT_ASSERT_SIZE(BtHfpCodec, 57);

/* ---- the status area */

enum {
    BT_HFP_CALLS = 10          /* entries of the call list */
};

/** What the phone (the audio gateway) supports. */
typedef struct BtHfpAgFunctions {
    uint32_t words[4];         /*  0                                                  */
    uint32_t inband_ring_tone; /* 16  the phone sends its own ring tone               */
    uint32_t more_words[4];    /* 20                                                  */
} BtHfpAgFunctions;
BT_ASSERT_SIZE(BtHfpAgFunctions, 36);
BT_ASSERT_AT(BtHfpAgFunctions, inband_ring_tone, 16);
BT_ASSERT_AT(BtHfpAgFunctions, more_words, 20);

/** What the phone supports of calls with three parties. */
typedef struct BtHfpThreewayCall {
    uint32_t words[7];         /*  0                                                  */
} BtHfpThreewayCall;
BT_ASSERT_SIZE(BtHfpThreewayCall, 28);

/** One call, as the hands-free service writes it. */
typedef struct BtHfpCall {
    uint8_t bytes[100];        /*  0                                                  */
} BtHfpCall;
BT_ASSERT_SIZE(BtHfpCall, 100);

/** The call list, as the hands-free service writes it. */
typedef struct BtHfpCallList {
    uint32_t header;           /*  0                                                  */
    BtHfpCall calls[BT_HFP_CALLS]; /*  4                                              */
} BtHfpCallList;
BT_ASSERT_SIZE(BtHfpCallList, 1004);
BT_ASSERT_AT(BtHfpCallList, calls, 4);

/** The hands-free status area: shared data "BT_HFP_SHARE_DATA_NAME", lock "BT_HFP_SEMAPHORE_NAME". */
typedef struct BtHfpStatusArea {
    uint32_t signal_level;     /*   0  initially 6                                    */
    uint32_t service_area;     /*   4  initially 2, as all words up to the call list  */
    uint32_t roaming;          /*   8                                                 */
    uint32_t audio_link;       /*  12                                                 */
    BtHfpAgFunctions ag_functions;   /*  16                                           */
    BtHfpThreewayCall threeway_call; /*  52                                           */
    BtHfpCallList call_list;   /*  80  initially all zero                             */
} BtHfpStatusArea;
BT_ASSERT_SIZE(BtHfpStatusArea, 1084);
BT_ASSERT_AT(BtHfpStatusArea, service_area, 4);
BT_ASSERT_AT(BtHfpStatusArea, roaming, 8);
BT_ASSERT_AT(BtHfpStatusArea, audio_link, 12);
BT_ASSERT_AT(BtHfpStatusArea, ag_functions, 16);
BT_ASSERT_AT(BtHfpStatusArea, threeway_call, 52);
BT_ASSERT_AT(BtHfpStatusArea, call_list, 80);

BT_EXTERN_C_BEGIN

/* ---- requests: calls */

/** Dials a number. @return 0 posted; -1 null record; -127 not posted. Request 0x2005, 84 payload bytes: the record. */
BT_API int32_t BT_SRV_HFP_dialNumber(const BtHfpDialNumber *record);

/**
 * Dials a number from the phone's memory.
 *
 * @param number  place in the memory, 0..9999
 * @return 0 posted; -1 number above 9999; -127 not posted
 *
 * Request 0x2004, 4 payload bytes: number.
 */
BT_API int32_t BT_SRV_HFP_dialMemoryNumber(uint32_t number);

/**
 * Answers a call.
 *
 * @param a  0 or more
 * @param b  sent as given
 * @return 0 posted; -1 negative a; -127 not posted
 *
 * Request 0x2009, 8 payload bytes: a, b.
 */
BT_API int32_t BT_SRV_HFP_answerCall(int32_t a, uint32_t b);

/**
 * Ends a call.
 *
 * @param value  0 or more
 * @return 0 posted; -1 negative value; -127 not posted
 *
 * Request 0x2006, 4 payload bytes: value.
 */
BT_API int32_t BT_SRV_HFP_terminateCall(int32_t value);

/** Ends all calls. @return 0 posted; -127 not posted. Request 0x2103, 4 payload bytes: value. */
BT_API int32_t BT_SRV_HFP_terminateAllCall(uint32_t value);

/**
 * Holds a call.
 *
 * @param value  0 or more
 * @return 0 posted; -1 negative value; -127 not posted
 *
 * Request 0x200A, 4 payload bytes: value.
 */
BT_API int32_t BT_SRV_HFP_holdCall(int32_t value);

/** Swaps the active and the held call. @return 0 posted; -127 not posted. Request 0x2101, no payload. */
BT_API int32_t BT_SRV_HFP_swapCall(void);

/** Joins the active and the held call. @return 0 posted; -127 not posted. Request 0x2102, no payload. */
BT_API int32_t BT_SRV_HFP_mergeCall(void);

/**
 * Controls the calls of a conversation with several parties.
 *
 * @param a  sent as given
 * @param b  0 or more
 * @return 0 posted; -1 negative b; -127 not posted
 *
 * Request 0x2002, 8 payload bytes: a, b.
 */
BT_API int32_t BT_SRV_HFP_controlCall(uint32_t a, int32_t b);

/**
 * Sends DTMF tones into the active call.
 *
 * A count of 0 or less is sent without looking at the characters.
 *
 * @return 0 posted; -1 null record, count above 256, or one of the first `count` characters is no DTMF character;
 *         -127 not posted
 *
 * Request 0x2007, 260 payload bytes: the record.
 */
BT_API int32_t BT_SRV_HFP_sendDtmf(const BtHfpDtmf *dtmf);

/** Ends the sending of DTMF tones. @return 0 posted; -127 not posted. Request 0x2008, no payload. */
BT_API int32_t BT_SRV_HFP_cancelDtmf(void);

/* ---- requests: audio and phone */

/**
 * Answers the service's question about an audio connection.
 *
 * @return 0 posted; -127 not posted
 *
 * Request 0x2001, 4 payload bytes: value.
 */
BT_API int32_t BT_SRV_HFP_responceSCOConnection(uint32_t value);

/**
 * Moves the audio of a call between phone and unit.
 *
 * @param value  any but 2
 * @return 0 posted; -1 value 2; -127 not posted
 *
 * Request 0x200B, 4 payload bytes: value.
 */
BT_API int32_t BT_SRV_HFP_switchAudioLink(uint32_t value);

/**
 * Sets a volume of the phone.
 *
 * @return 0 posted; -2 null record, target above 1, or level not 1..15; -127 not posted
 *
 * Request 0x2104, 8 payload bytes: the record.
 */
BT_API int32_t BT_SRV_HFP_setRemoteVolume(const BtHfpVolume *volume);

/**
 * Sets codec values.
 *
 * @return 0 posted; -2 null record; -127 not posted
 *
 * Request 0x2105, 57 payload bytes: the record.
 */
BT_API int32_t BT_SRV_HFP_setCodecValue(const BtHfpCodec *codec);

/**
 * Sends an AT command.
 *
 * @return 0 posted; -1 null record; -127 not posted
 *
 * Request 0x2003, 48 payload bytes: the record.
 */
BT_API int32_t BT_SRV_HFP_sendATCommand(const BtHfpAtCommand *command);

/**
 * Sends one of the general AT commands of a phone.
 *
 * @param command  2..8, 10, 12, 13 or 19
 * @param p1       sent as given
 * @param p2       sent as given
 * @return 0 posted; -2 any other command; -127 not posted
 *
 * Request 0x2106, 12 payload bytes: command, p1, p2.
 */
BT_API int32_t BT_SRV_HFP_sendGeneralPhoneATCommand(uint32_t command, uint32_t p1, uint32_t p2);

/** Kept for applications that call it: sends nothing. @return 0 */
BT_API int32_t BT_SRV_HFP_setMuteStatus(void);

/* ---- queries; all return 0 copied, -1 not (see above) */

/** Signal level of the phone's network; 6 until the service knows it. */
BT_API int32_t BT_SRV_HFP_getSignalLevel(uint32_t *out);

/** Whether the phone has service; 2 until the service knows it. */
BT_API int32_t BT_SRV_HFP_getServiceAreaStatus(uint32_t *out);

/** Whether the phone is roaming; 2 until the service knows it. */
BT_API int32_t BT_SRV_HFP_getRoamingStatus(uint32_t *out);

/** State of the audio link; 2 until the service knows it. */
BT_API int32_t BT_SRV_HFP_getAudioLinkStatus(uint32_t *out);

/** What the phone supports; 2 in each word until the service knows it. */
BT_API int32_t BT_SRV_HFP_getAGSupportFunction(BtHfpAgFunctions *out);

/** Whether the phone sends its own ring tone, as in BT_SRV_HFP_getAGSupportFunction(). */
BT_API int32_t BT_SRV_HFP_getSupportInbandRingTone(uint32_t *out);

/** What the phone supports of calls with three parties; 2 in each word until the service knows it. */
BT_API int32_t BT_SRV_HFP_getSupportThreewayCall(BtHfpThreewayCall *out);

/** The whole call list. */
BT_API int32_t BT_SRV_HFP_getCallList(BtHfpCallList *out);

/** One entry of the call list. @param index 0..9 @return 0 copied; -1 not, or index above 9, nothing touched */
BT_API int32_t BT_SRV_HFP_getCallInfo(uint32_t index, BtHfpCall *out);

/* ---- the area and its lock; for the hands-free service, applications need only the queries */

/** The process's handle of the status area; its address is what bt_hfp_getShareMemAccessPtr() returns. */
extern BT_API struct share_handle g_bt_hfp_share;

/** Returns the process's handle of the status area, never null. */
BT_API struct share_handle *bt_hfp_getShareMemAccessPtr(void);

/**
 * Links the status area and creates its lock, each if not yet done; a failure of one does not stop the other.
 *
 * @return 0 both steps done; -1 a step failed, to be tried again by the next call
 */
BT_API int32_t bt_hfp_ShareMemAccessInit(void);

/** Takes the lock of the status area. @return 0 held; -1 not held, or area and lock are not both there */
BT_API int32_t bt_hfp_SemLock(void);

/** Releases the lock of the status area. @return 0 released; -1 not held, or area and lock are not both there */
BT_API int32_t bt_hfp_SemUnlock(void);

/**
 * Writes the initial values over the whole status area, under its lock. For the owner of the area, at its start.
 *
 * @return 0 done; -1 area or lock cannot be had, or the lock was not released
 */
BT_API int32_t bt_hfp_InitShareMemData(void);

BT_EXTERN_C_END

#endif
