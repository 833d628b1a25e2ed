// Requests to the object push service: what each posts, and what is refused.
#include "request_rows.h"

#include <bt_service/bt_object_push.h>

namespace {

using namespace requests;
using RequestsObjectPush = RequestRows;

const struct {
    const char* name;
    uint16_t id;
    int32_t (*send)(const void*);
} kRecordRequests[] = {
    {"BT_SRV_OPP_pushResponseReq", 0x30A0, BT_SRV_OPP_pushResponseReq},
    {"BT_SRV_OPP_pushAbortReq", 0x30A1, BT_SRV_OPP_pushAbortReq},
    {"BT_SRV_OPP_fcSettingReq", 0x30A2, BT_SRV_OPP_fcSettingReq},
    {"BT_SRV_OPP_sessionKeyWriteReq", 0x30A3, BT_SRV_OPP_sessionKeyWriteReq},
    {"BT_SRV_PBAP_sessionKeyWriteReq", 0x30A4, BT_SRV_PBAP_sessionKeyWriteReq},
    {"BT_SRV_PBAP_pullPhonebookReq", 0x30A5, BT_SRV_PBAP_pullPhonebookReq},
    {"BT_SRV_PBAP_pullvCardListReq", 0x30A6, BT_SRV_PBAP_pullvCardListReq},
    {"BT_SRV_PBAP_pullvCardEntryReq", 0x30A7, BT_SRV_PBAP_pullvCardEntryReq},
    {"BT_SRV_PBAP_pullAbortReq", 0x30A8, BT_SRV_PBAP_pullAbortReq},
    {"BT_SRV_PBAP_fcSettingReq", 0x30A9, BT_SRV_PBAP_fcSettingReq},
    {"BT_SRV_OBEX_authenticationUseridSessionkeyWriteReq", 0x30AA, BT_SRV_OBEX_authenticationUseridSessionkeyWriteReq},
};

TEST_F(RequestsObjectPush, PostHeaderAndPayload)
{
    channel = {0x08C6, 0, 0, &kPassedThrough};
    for (const auto& request : kRecordRequests)
        for (const std::string record : {"0000", "0100 A1", "0A00 A1*9 7E", "FF00 A1*254 7E", "EE03 A1*1005 7E"})
            posts(request.name, request.send, request.id, record, record);
    for (const std::string address : {"112233445566", "000000000000", "FFFFFFFFFFFF"})
        POSTS(BT_SRV_OPP_ConStsNotify, 0x30AB, "01" + address + "02", 0xA501, address, 0xFFFFFF02);
    POSTS(BT_SRV_PBAP_setSessionKey, 0x3017, "", kUnreadable, 0);
    POSTS(BT_SRV_PBAP_setSessionKey, 0x3017, "01 A1*14 7E", "01 A1*14 7E", 16);
    POSTS(BT_SRV_PBAP_setSessionKey, 0x3017, "01 A1*18 7E", "01 A1*18 7E", 20);
}

TEST_F(RequestsObjectPush, RefuseNullsAndLengths)
{
    REFUSES(-1, BT_SRV_OPP_ConStsNotify, 1, nullptr, 2);
    REFUSES(-1, BT_SRV_PBAP_setSessionKey, nullptr, 16);
    REFUSES(-1, BT_SRV_PBAP_setSessionKey, nullptr, 0);
    for (const int32_t length : {-1, 21, 256, 0x10000, INT32_MAX, INT32_MIN})
        REFUSES(-1, BT_SRV_PBAP_setSessionKey, kUnreadable, length);
    for (const auto& request : kRecordRequests) // 1007 bytes, 1008, and close to the end
        for (const Given& record : {Given(nullptr), Given("EF03"), Given("F003"), Given("FEFF"), Given("FFFF")})
            refuses(request.name, -1, call(request.send, record));
}

} // namespace
