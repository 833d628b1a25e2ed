#include "wire/post.h"

#include <bt_platform/platform.h>

namespace bt {

int32_t post(BtProcessNumber channel, Request request, Payload& payload)
{
    if (payload.refused()) return BT_FAILED;

    const BtMessage& message = payload.framed(static_cast<uint16_t>(request), 0);
    const int32_t sent = _sys_SndMsg(channel, BT_MESSAGE_HEADER_SIZE + payload.size(), &message, 0);
    return sent == -1 ? BT_NOT_POSTED : sent;
}

int32_t post(BtProcessNumber channel, Request request)
{
    Payload nothing;
    return post(channel, request, nothing);
}

} // namespace bt
