// Results of browsing a remote player, copied out of the areas that the audio/video service fills.

#include "api/linked_area.h"

#include <bt_service/bt_audio_video.h>

#include <algorithm>
#include <cstring>

namespace bt::avp {
namespace {

constexpr ListLayout kMediaList = list_layout<BtAvpMediaListArea>(BT_AVP_MEDIA_LIST_NAME);
constexpr ListLayout kPlayerList = list_layout<BtAvpPlayerListArea>(BT_AVP_PLAYER_LIST_NAME);

// Both lists begin alike and hold as many entries.
constexpr uint32_t kHeaderAt = offsetof(BtAvpMediaListArea, header);
constexpr uint32_t kCountAt = offsetof(BtAvpMediaListArea, count);
static_assert(kHeaderAt == offsetof(BtAvpPlayerListArea, header) && kCountAt == offsetof(BtAvpPlayerListArea, count));

int32_t copy_list(const ListLayout& list, uint32_t start, uint32_t count, BtAvpListResult* result)
{
    if (result == nullptr) return BT_FAILED;
    if (count > list.capacity || start > list.capacity - count) return BT_FAILED;

    const LinkedArea area(list.name, 0, list.area_size);
    if (!area.has(list.entries_at)) return BT_OK;

    const uint32_t stored = std::min(area.read<uint32_t>(kCountAt), area.room(list));
    const uint32_t copied = start < stored ? std::min(count, stored - start) : 0;
    if (copied != 0 && result->entries == nullptr) return BT_FAILED;

    result->header = area.read<uint32_t>(kHeaderAt);
    result->count = copied;
    area.copy_entries(list, start, copied, result->entries);
    return BT_OK;
}

} // namespace
} // namespace bt::avp

int32_t BT_SRV_AVP_getMediaListData(uint32_t start, uint32_t count, struct list_result* result)
{
    return bt::avp::copy_list(bt::avp::kMediaList, start, count, result);
}

int32_t BT_SRV_AVP_getPlayerListData(uint32_t start, uint32_t count, struct list_result* result)
{
    return bt::avp::copy_list(bt::avp::kPlayerList, start, count, result);
}

int32_t BT_SRV_AVP_getMediaData(void* data)
{
    if (data == nullptr) return BT_FAILED;

    const bt::LinkedArea area(BT_AVP_MEDIA_DATA_NAME, 0, BT_AVP_MEDIA_DATA_SIZE);
    if (!area.has(BT_AVP_MEDIA_DATA_SIZE)) return BT_FAILED;

    std::memcpy(data, area.at(0), BT_AVP_MEDIA_DATA_SIZE);
    return BT_OK;
}
