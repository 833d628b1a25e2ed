#include "api/connection_post.h"

#include <bt_platform/platform.h>
#include <bt_service/bt_connection.h>

#include <algorithm>
#include <cstring>

namespace bt::con {

int32_t post(Request request, Payload& payload)
{
    if (payload.refused()) return BT_FAILED;

    const BtMessage& message = payload.framed(static_cast<uint16_t>(request), PNO_BT_EDS);
    return _BT_SRV_CON_sys_SndMsg(PNO_BT_CON, BT_MESSAGE_HEADER_SIZE + payload.size(), &message, 0);
}

int32_t post(Request request)
{
    Payload nothing;
    return post(request, nothing);
}

} // namespace bt::con

int32_t _BT_SRV_CON_sys_SndMsg(uint32_t channel, uint32_t length, const void* message, uint32_t)
{
    if (message == nullptr) return BT_FAILED;

    uint8_t whole[BT_MESSAGE_SIZE] = {};
    std::memcpy(whole, message, std::min<uint32_t>(length, sizeof whole));

    // The platform's result counts by its low half only.
    const int32_t sent = _sys_SndMsg(channel, sizeof whole, whole, 0);
    return static_cast<uint16_t>(sent) == 0 ? BT_OK : BT_FAILED;
}
