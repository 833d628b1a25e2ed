// Requests to the object push service.

#include "wire/post.h"

#include <bt_service/bt_object_push.h>

#include <cstring>

using bt::Payload;
using bt::Request;

namespace {

int32_t post(Request request, Payload& payload)
{
    return bt::post(PNO_BT_OPP, request, payload);
}

// The record may stand at any address and ends where its length says.
int32_t post_record(Request request, const void* record)
{
    if (record == nullptr) return BT_FAILED;
    uint16_t length;
    std::memcpy(&length, record, sizeof length);
    if (length > BT_OPP_BODY_MAX) return BT_FAILED;

    const auto* const body = static_cast<const uint8_t*>(record) + sizeof length;
    return post(request, Payload().u16(length).bytes(body, length));
}

} // namespace

int32_t BT_SRV_OPP_pushResponseReq(const void* record)
{
    return post_record(Request::OPP_pushResponseReq, record);
}

int32_t BT_SRV_OPP_pushAbortReq(const void* record)
{
    return post_record(Request::OPP_pushAbortReq, record);
}

int32_t BT_SRV_OPP_fcSettingReq(const void* record)
{
    return post_record(Request::OPP_fcSettingReq, record);
}

int32_t BT_SRV_OPP_sessionKeyWriteReq(const void* record)
{
    return post_record(Request::OPP_sessionKeyWriteReq, record);
}

int32_t BT_SRV_PBAP_sessionKeyWriteReq(const void* record)
{
    return post_record(Request::PBAP_sessionKeyWriteReq, record);
}

int32_t BT_SRV_PBAP_pullPhonebookReq(const void* record)
{
    return post_record(Request::PBAP_pullPhonebookReq, record);
}

int32_t BT_SRV_PBAP_pullvCardListReq(const void* record)
{
    return post_record(Request::PBAP_pullvCardListReq, record);
}

int32_t BT_SRV_PBAP_pullvCardEntryReq(const void* record)
{
    return post_record(Request::PBAP_pullvCardEntryReq, record);
}

int32_t BT_SRV_PBAP_pullAbortReq(const void* record)
{
    return post_record(Request::PBAP_pullAbortReq, record);
}

int32_t BT_SRV_PBAP_fcSettingReq(const void* record)
{
    return post_record(Request::PBAP_fcSettingReq, record);
}

int32_t BT_SRV_OBEX_authenticationUseridSessionkeyWriteReq(const void* record)
{
    return post_record(Request::OBEX_authenticationUseridSessionkeyWriteReq, record);
}

int32_t BT_SRV_OPP_ConStsNotify(uint32_t first, const BtDevAddress* addr, uint32_t second)
{
    if (addr == nullptr) return BT_FAILED;

    return post(Request::OPP_ConStsNotify, Payload().u8(first).bytes(addr->address, sizeof addr->address).u8(second));
}

int32_t BT_SRV_PBAP_setSessionKey(const void* key, int32_t length)
{
    if (key == nullptr) return BT_FAILED;
    if (length < 0 || length > BT_OPP_SESSION_KEY_MAX) return BT_FAILED;

    return post(Request::PBAP_setSessionKey, Payload().bytes(key, static_cast<uint32_t>(length)));
}
