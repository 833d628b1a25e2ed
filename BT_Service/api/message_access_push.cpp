// The message that an application leaves for the service to push.

#include "api/linked_area.h"

#include <bt_service/bt_message_access.h>

#include <algorithm>
#include <cstring>

namespace bt::map {
namespace {

constexpr uint32_t kBodyAt = sizeof(BtMapPushArea);

// Record and area have one layout up to the body address.
constexpr uint32_t kSameUpTo = offsetof(BtMapPushArea, body_address);
static_assert(kSameUpTo == offsetof(BtMapPushRecord, body_attribute_4) + sizeof(uint16_t),
              "area and record hold the same fields");

void copy_fields(LinkedArea& area, const BtMapPushRecord& record, uint32_t from, uint32_t to)
{
    std::memcpy(area.at(from), reinterpret_cast<const uint8_t*>(&record) + from, to - from);
}

void put_word(LinkedArea& area, uint32_t at, uint32_t value)
{
    std::memcpy(area.at(at), &value, sizeof value);
}

} // namespace
} // namespace bt::map

int32_t BT_SRV_MAP_setPushMessageData(struct push_record record)
{
    using namespace bt::map;
    if (record.body == nullptr && record.body_length != 0) return BT_FAILED;

    bt::LinkedArea area(BT_MAP_PUSH_AREA_NAME, BT_MAP_PUSH_AREA_SIZE, BT_MAP_PUSH_AREA_SIZE);
    if (!area.has(kBodyAt)) return BT_FAILED;

    const uint32_t body_length = std::min(record.body_length, area.size() - kBodyAt);
    const auto body_address = static_cast<uint32_t>(reinterpret_cast<uintptr_t>(area.at(kBodyAt)));

    const bt::AreaWriting writing;
    copy_fields(area, record, 0, offsetof(BtMapPushArea, group) + sizeof(BtMapMessageGroup));
    copy_fields(area, record, offsetof(BtMapPushArea, tail), offsetof(BtMapPushArea, body_length));
    put_word(area, offsetof(BtMapPushArea, body_length), body_length);
    copy_fields(area, record, offsetof(BtMapPushArea, body_attribute_3), kSameUpTo);
    put_word(area, offsetof(BtMapPushArea, body_address), body_address);
    if (body_length != 0) std::memcpy(area.at(kBodyAt), record.body, body_length);
    return BT_OK;
}
