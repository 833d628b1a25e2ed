/**
 * @file
 * Message access: folders and messages of a remote device, listing, fetching, sending, deleting and searching them.
 *
 * Conventions of this header, in addition to those of bt_types.h:
 *
 *  1. Requests go to the message access service (PNO_BT_MAP). A request returns 0 posted, -127 when the message layer
 *     is unusable, or the platform's own code; the descriptions list only what comes on top of that.
 *  2. The outcome arrives later as an event of the service; register for it with BT_SRV_EvtSrv_regist(). Messages and
 *     lists are left in shared areas, from which the functions at the end copy them.
 *  3. What modes, options and filter values mean is defined by the service. They are passed on as given. Of a word
 *     described as "low byte sent" the rest is ignored.
 *  4. A name or text longer than 256 bytes is cut to 256 without notice.
 *  5. The shared areas have no lock between processes. Read an area after the event that announces the result and
 *     before the next request of the same kind; issue no listing request before the service has answered the previous
 *     one; let one application at a time fill the push area. Threads of one process never mix their data in an area,
 *     but what comes later replaces what nobody has taken yet.
 *  6. Functions that read or fill a shared area return -1 and write nothing when the service has not shared it.
 */
#ifndef BT_SERVICE_BT_MESSAGE_ACCESS_H
#define BT_SERVICE_BT_MESSAGE_ACCESS_H

#include <bt_service/bt_message_access_records.h>

BT_EXTERN_C_BEGIN

/* ---- notification and folders */

/**
 * Registers for notifications of the remote device, or ends that.
 *
 * @param value  which of them
 *
 * Request 0x5003, 4 payload bytes: value, least significant byte first.
 */
BT_API int32_t BT_SRV_MAP_setNotificationRegist(uint32_t value);

/**
 * Changes to another folder.
 *
 * @param first      low byte sent
 * @param directory  name of the folder
 *
 * Request 0x5004, name length + 5 payload bytes: low byte of first, name length (4 bytes, big-endian), name.
 */
BT_API int32_t BT_SRV_MAP_changeDirectory(uint32_t first, struct directory_record directory);

/** Asks how many folders the current folder has. Request 0x5005, no payload. */
BT_API int32_t BT_SRV_MAP_getFolderNum(void);

/**
 * Asks for the list of folders; then BT_SRV_MAP_getFolderListData().
 *
 * @param max_count     entries at most
 * @param start_offset  folders to leave out at the start
 *
 * Request 0x5006, 8 payload bytes: both words big-endian.
 */
BT_API int32_t BT_SRV_MAP_getFolderList(uint32_t max_count, uint32_t start_offset);

/* ---- message listing */

/**
 * Asks how many messages pass a filter.
 *
 * The parameters are too long for a message. They are written as one block to the area "/tmp/shm_map_serviceapi": the
 * block's length, the block, zeros up to the area's end. The message is only a notice. The block holds, in order:
 *
 *     first                        1  low byte
 *     folder length                4  big-endian, at most 256
 *     folder                       n
 *     message type                 1
 *     period begin                16  "19000101T000000Z" when the filter has none
 *     period end                  16  "20991231T235959Z" when the filter has none
 *     read status                  1  low byte
 *     recipient length and text    1 + n
 *     originator length and text   1 + n
 *     priority                     1  low byte
 *     zero                         1
 *
 * which is 43 bytes plus the three texts. A block that does not fit the area is cut.
 *
 * @param first   low byte sent
 * @param filter  which messages
 * @return -1 the area is not shared or has no room for the length; nothing sent
 *
 * Request 0x5007, 2 payload bytes, both zero.
 */
BT_API int32_t BT_SRV_MAP_getMessageNum(uint32_t first, struct message_filter filter);

/**
 * Asks for the list of messages that pass a filter; then BT_SRV_MAP_getMessageListData().
 *
 * As BT_SRV_MAP_getMessageNum(). The block has three fields more and is 55 bytes plus the three texts: behind `first`
 * the largest count and the start offset (4 bytes each, big-endian), and before the zero the parameter mask (4 bytes).
 *
 * @param first    low byte sent
 * @param listing  which part of which messages
 * @return -1 the area is not shared or has no room for the length; nothing sent
 *
 * Request 0x5008, 2 payload bytes, both zero.
 */
BT_API int32_t BT_SRV_MAP_getMessageList(uint32_t first, struct message_listing listing);

/** Sorts the message list. @param a, b how. Request 0x5012, 8 payload bytes: a, b. */
BT_API int32_t BT_SRV_MAP_sortMessageList(uint32_t a, uint32_t b);

/**
 * Searches the message list.
 *
 * @param record  what for; its first word's low byte is sent
 *
 * Request 0x5013, text length + 2 payload bytes: low byte of first, text length (1 byte), text.
 */
BT_API int32_t BT_SRV_MAP_searchMessageList(struct search_record record);

/* ---- single messages */

/**
 * Fetches a message; then BT_SRV_MAP_getMessageData().
 *
 * @param handle  message and option, the option's low byte sent
 * @return -1 null pointer
 *
 * Request 0x5009, 17 payload bytes: message handle, low byte of option.
 */
BT_API int32_t BT_SRV_MAP_getMessage(const struct message_handle *handle);

/**
 * Marks a message as read or unread.
 *
 * @param handle  message and option, the option's low byte sent
 *
 * Request 0x500A, 17 payload bytes: message handle, low byte of option.
 */
BT_API int32_t BT_SRV_MAP_changeReadStatus(struct message_handle handle);

/**
 * Deletes a message.
 *
 * @param record  message and text; its first word's low byte is sent
 *
 * Request 0x500B, text length + 22 payload bytes: low byte of first, message handle, text length (4 bytes, big-endian),
 * text, a zero byte.
 */
BT_API int32_t BT_SRV_MAP_deleteMessage(struct delete_record record);

/** Fetches an attachment. @param record which one. Request 0x500D, 16 payload bytes: the record. */
BT_API int32_t BT_SRV_MAP_getAttachmentFile(struct attachment_record record);

/**
 * Saves a message.
 *
 * @param record  its data
 *
 * Request 0x500E, data length + 4 payload bytes: data length (4 bytes, big-endian), data.
 */
BT_API int32_t BT_SRV_MAP_saveMessage(struct save_record record);

/** Sends a message. @param a, b low bytes sent. Request 0x500F, 2 payload bytes: low byte of a, low byte of b. */
BT_API int32_t BT_SRV_MAP_sendMessage(uint32_t a, uint32_t b);

/** Moves a message: not supported. @param record not used. @return -1 always; nothing is sent */
BT_API int32_t BT_SRV_MAP_moveMessage(struct move_record record);

/** Asks the remote device to look for new messages. Request 0x5010, no payload. */
BT_API int32_t BT_SRV_MAP_checkMessage(void);

/** Ends the operation that is running. Request 0x5011, no payload. */
BT_API int32_t BT_SRV_MAP_cancel(void);

/** Changes to test mode. @param record not used. Request 0x5014, no payload. */
BT_API int32_t BT_SRV_MAP_testMode(struct test_record record);

/* ---- results */

/**
 * Copies the fetched message.
 *
 * All fields of the record are filled in but the body pointer, which says where the body goes. The body buffer must
 * hold whatever the message has, up to BT_MAP_BODY_MAX bytes; BT_SRV_MAP_getMessageData_ex() takes less.
 *
 * @param record  receives the message; its body pointer is the caller's body buffer
 * @return 0 copied; -1 null pointer, no message area, or null body pointer with a body to copy
 */
BT_API int32_t BT_SRV_MAP_getMessageData(struct message_record *record);

/**
 * Copies the fetched message with a limited body.
 *
 * As BT_SRV_MAP_getMessageData(), but a longer body is cut; the record's body length is that of the cut body.
 *
 * @param maximum  bytes the body buffer holds, at least 1
 * @param record   receives the message; its body pointer is the caller's body buffer
 * @return 0 copied; -1 maximum 0, null pointer, no message area, or null body pointer with a body to copy
 */
BT_API int32_t BT_SRV_MAP_getMessageData_ex(uint32_t maximum, struct message_record *record);

/**
 * Copies the message list.
 *
 * @param count    receives the number of entries copied, 0..150
 * @param entries  receives the entries, 1,648 bytes each; has room for 150 of them
 * @return 0 copied; -1 null pointer, or no list
 */
BT_API int32_t BT_SRV_MAP_getMessageListData(uint32_t *count, void *entries);

/** As BT_SRV_MAP_getMessageListData(), but copies at most `maximum` entries. @return -1 also for maximum 0 */
BT_API int32_t BT_SRV_MAP_getMessageListData_ex(uint32_t maximum, uint32_t *count, void *entries);

/**
 * Copies the folder list.
 *
 * @param count    receives the number of entries copied, 0..100
 * @param entries  receives the entries, 260 bytes each; has room for 100 of them
 * @return 0 copied; -1 null pointer, or no list
 */
BT_API int32_t BT_SRV_MAP_getFolderListData(uint32_t *count, void *entries);

/** As BT_SRV_MAP_getFolderListData(), but copies at most `maximum` entries. @return -1 also for maximum 0 */
BT_API int32_t BT_SRV_MAP_getFolderListData_ex(uint32_t maximum, uint32_t *count, void *entries);

/**
 * Copies the message access servers of the remote device.
 *
 * Only valid instances, and of their names only the valid bytes, are written.
 *
 * @param list  receives the instances
 * @return 0 copied; -1 null pointer, or no instance area
 */
BT_API int32_t BT_SRV_MAP_getMasServiceInfo(BtMapInstanceList *list);

/* ---- message to push */

/**
 * Leaves a message in the push area, for the service to push. Sends nothing.
 *
 * Groups 2 and 3 of the record are not written. A body longer than the area has room for, 1,500 bytes in an area of the
 * usual size, is cut without notice.
 *
 * @param record  the message; its body pointer is read before the call returns
 * @return 0 written; -1 no push area, or null body pointer with a body length
 */
BT_API int32_t BT_SRV_MAP_setPushMessageData(struct push_record record);

BT_EXTERN_C_END

#endif
