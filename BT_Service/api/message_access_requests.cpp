// Requests to the message access service whose parameters travel in the message.

#include "api/message_access_post.h"

#include <bt_service/bt_message_access.h>

#include <algorithm>

namespace bt::map {
namespace {

uint32_t text_length(uint32_t length)
{
    return std::min<uint32_t>(length, BT_MAP_TEXT_MAX);
}

int32_t post_handle(Request request, const BtMapMessageHandle& handle)
{
    return post(request, Payload().bytes(handle.handle, sizeof handle.handle).u8(handle.option));
}

} // namespace
} // namespace bt::map

using bt::Payload;
using bt::Request;
using namespace bt::map;

int32_t BT_SRV_MAP_setNotificationRegist(uint32_t value)
{
    return post(Request::MAP_setNotificationRegist, Payload().u8(value).u8(value >> 8).u8(value >> 16).u8(value >> 24));
}

int32_t BT_SRV_MAP_changeDirectory(uint32_t first, struct directory_record directory)
{
    const uint32_t length = text_length(directory.length);
    return post(Request::MAP_changeDirectory, Payload().u8(first).be32(length).bytes(directory.name, length));
}

int32_t BT_SRV_MAP_getFolderNum()
{
    return post(Request::MAP_getFolderNum);
}

int32_t BT_SRV_MAP_getFolderList(uint32_t max_count, uint32_t start_offset)
{
    return post(Request::MAP_getFolderList, Payload().be32(max_count).be32(start_offset));
}

int32_t BT_SRV_MAP_sortMessageList(uint32_t a, uint32_t b)
{
    return post(Request::MAP_sortMessageList, Payload().u32(a).u32(b));
}

int32_t BT_SRV_MAP_searchMessageList(struct search_record record)
{
    return post(Request::MAP_searchMessageList,
                Payload().u8(record.first).u8(record.length).bytes(record.text, record.length));
}

int32_t BT_SRV_MAP_getMessage(const struct message_handle* handle)
{
    if (handle == nullptr) return BT_FAILED;

    return post_handle(Request::MAP_getMessage, *handle);
}

int32_t BT_SRV_MAP_changeReadStatus(struct message_handle handle)
{
    return post_handle(Request::MAP_changeReadStatus, handle);
}

int32_t BT_SRV_MAP_deleteMessage(struct delete_record record)
{
    const uint32_t length = text_length(record.length);
    return post(Request::MAP_deleteMessage, Payload()
                                                .u8(record.first)
                                                .bytes(record.handle, sizeof record.handle)
                                                .be32(length)
                                                .bytes(record.text, length)
                                                .zeros(1));
}

int32_t BT_SRV_MAP_getAttachmentFile(struct attachment_record record)
{
    return post(Request::MAP_getAttachmentFile, Payload().bytes(record.bytes, sizeof record.bytes));
}

int32_t BT_SRV_MAP_saveMessage(struct save_record record)
{
    const uint32_t length = text_length(record.length);
    return post(Request::MAP_saveMessage, Payload().be32(length).bytes(record.data, length));
}

int32_t BT_SRV_MAP_sendMessage(uint32_t a, uint32_t b)
{
    return post(Request::MAP_sendMessage, Payload().u8(a).u8(b));
}

int32_t BT_SRV_MAP_moveMessage(struct move_record)
{
    return BT_FAILED;
}

int32_t BT_SRV_MAP_checkMessage()
{
    return post(Request::MAP_checkMessage);
}

int32_t BT_SRV_MAP_cancel()
{
    return post(Request::MAP_cancel);
}

int32_t BT_SRV_MAP_testMode(struct test_record)
{
    return post(Request::MAP_testMode);
}
