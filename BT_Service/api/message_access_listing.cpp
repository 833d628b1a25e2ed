// Counting and listing messages: the parameters go to the service request area, the message is only a notice.

#include "api/linked_area.h"
#include "api/message_access_post.h"

#include <bt_service/bt_message_access.h>

#include <algorithm>
#include <cstring>

namespace bt::map {
namespace {

using DateTime = char[BT_MAP_DATE_TIME_SIZE];

constexpr char kEarliest[] = "19000101T000000Z";
constexpr char kLatest[] = "20991231T235959Z";

const char* given_or(const DateTime& given, const char* otherwise)
{
    static constexpr DateTime kNotGiven = {};
    return std::memcmp(given, kNotGiven, sizeof given) == 0 ? otherwise : given;
}

Payload& append(Payload& block, const BtMapMessageFilter& filter)
{
    const uint32_t folder_length = std::min<uint32_t>(filter.folder_length, sizeof filter.folder);
    return block.be32(folder_length)
        .bytes(filter.folder, folder_length)
        .u8(filter.type)
        .bytes(given_or(filter.period_begin, kEarliest), sizeof filter.period_begin)
        .bytes(given_or(filter.period_end, kLatest), sizeof filter.period_end)
        .u8(filter.read_status)
        .u8(filter.recipient_length)
        .bytes(filter.recipient, filter.recipient_length)
        .u8(filter.originator_length)
        .bytes(filter.originator, filter.originator_length)
        .u8(filter.priority);
}

bool leave_in_area(const uint8_t* block, uint32_t length)
{
    constexpr uint32_t kBlockAt = sizeof(BtMapRequestArea);
    LinkedArea area(BT_MAP_REQUEST_AREA_NAME, 0, kBlockAt + length);
    if (!area.has(kBlockAt)) return false;

    const AreaWriting writing;
    std::memset(area.at(0), 0, area.size());
    std::memcpy(area.at(offsetof(BtMapRequestArea, length)), &length, sizeof length);
    std::memcpy(area.at(kBlockAt), block, std::min(length, area.size() - kBlockAt));
    return true;
}

int32_t post_listing(Request request, Payload& block)
{
    const uint8_t* const bytes = block.framed(static_cast<uint16_t>(request), 0).payload;
    if (!leave_in_area(bytes, block.size())) return BT_FAILED;

    return post(request, Payload().zeros(2));
}

} // namespace
} // namespace bt::map

using bt::Payload;
using bt::Request;
using namespace bt::map;

int32_t BT_SRV_MAP_getMessageNum(uint32_t first, struct message_filter filter)
{
    Payload block;
    append(block.u8(first), filter).zeros(1);
    return post_listing(Request::MAP_getMessageNum, block);
}

int32_t BT_SRV_MAP_getMessageList(uint32_t first, struct message_listing listing)
{
    Payload block;
    append(block.u8(first).be32(listing.max_count).be32(listing.start_offset), listing.filter)
        .u32(listing.mask)
        .zeros(1);
    return post_listing(Request::MAP_getMessageList, block);
}
