// Send and receive wrappers around the platform's message layer.
#include "log_line.h"
#include "message_header.h"
#include "message_trace.h"

#include <bt_platform/platform.h>
#include <bt_service/bt_transport.h>

#include <algorithm>

namespace bt::cmn {
namespace {

constexpr int32_t kLayerUnusable = -1;
constexpr int32_t kDelivered = 1;

const char* name_or_empty(const char* function)
{
    return function == nullptr ? "" : function;
}

// The sum is a 16-bit one, as the header's field is.
uint32_t bytes_to_send(const void* message)
{
    const auto size = static_cast<uint16_t>(header_of(message).len + BT_MESSAGE_HEADER_SIZE);
    return std::min<uint32_t>(size, BT_MESSAGE_SIZE);
}

} // namespace
} // namespace bt::cmn

using namespace bt::cmn;

int32_t BT_CMN_sendMsgWrapper(const char*, const char* function, int32_t, uint32_t pno, const void* message)
{
    CMN_LOG("[API][START] %s %s\n", __func__, name_or_empty(function));
    if (function == nullptr || message == nullptr) {
        CMN_LOG(CMN_AT "param err. data = %p ", CMN_API_PLACE, message);
        return ended(__func__, kFailure);
    }
    CMN_LOG("[API]%s getPno=%x\n", __func__, pno);

    const int32_t sent = _sys_SndMsg(pno, bytes_to_send(message), message, 0);
    if (sent == kLayerUnusable) _sys_Exit(-1);
    if (sent != 0) {
        CMN_LOG(CMN_AT "_sys_SndMsg err. api_ret = %d ", CMN_API_PLACE, sent);
        return ended(__func__, kFailure);
    }
    trace_message(message);
    return ended(__func__, kSuccess);
}

int32_t BT_CMN_recvMsgWrapper(const char*, const char* function, int32_t, void* buffer)
{
    CMN_LOG("[API][START] %s [%s]\n", __func__, name_or_empty(function));
    if (function == nullptr || buffer == nullptr) {
        CMN_LOG(CMN_AT "param err. data = %p ", CMN_API_PLACE, buffer);
        return ended(__func__, kFailure);
    }
    const uint32_t own_pno = _sys_GetPno();
    CMN_LOG("[API]%s getPno=%x\n", __func__, own_pno);

    const int32_t received = _sys_RcvMsg(own_pno, BT_MESSAGE_SIZE, buffer, 0);
    if (received == kLayerUnusable) _sys_Exit(-1);
    if (received != kDelivered) {
        CMN_LOG(CMN_AT "_sys_RcvMsg err. api_ret = %d \n", CMN_API_PLACE, received);
        CMN_LOG("[API][END] %s (%d) \n", __func__, kFailure);
        return kFailure;
    }
    trace_message(buffer);
    return ended(__func__, kSuccess);
}
