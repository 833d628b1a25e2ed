#include "api/message_access_post.h"

#include "wire/post.h"

namespace bt::map {
namespace {

constexpr uint32_t kPayloadMax = 1006; // two bytes less than a message holds

} // namespace

int32_t post(Request request)
{
    return bt::post(PNO_BT_MAP, request);
}

int32_t post(Request request, Payload& payload)
{
    return bt::post(PNO_BT_MAP, request, payload.cut_to(kPayloadMax));
}

} // namespace bt::map
