// Results of message access, copied out of the areas that the service fills.

#include "api/linked_area.h"

#include <bt_service/bt_message_access.h>

#include <fcntl.h>
#include <sys/mman.h>
#include <unistd.h>

#include <algorithm>
#include <cstring>

namespace bt::map {
namespace {

constexpr uint32_t kNoLimit = UINT32_MAX;

// The fields of a message lie in the same order in the area and in the caller's record, from the header words to the
// last body attribute.
constexpr uint32_t kFieldsAt = offsetof(BtMapMessageArea, header);
constexpr uint32_t kFieldsSize = offsetof(BtMapMessageArea, body_pointer) - kFieldsAt;
static_assert(kFieldsSize == offsetof(BtMapMessageRecord, body_attribute_4) + sizeof(uint16_t),
              "area and record hold the same fields");

int32_t copy_message(uint32_t maximum, BtMapMessageRecord* record)
{
    if (maximum == 0 || record == nullptr) return BT_FAILED;

    constexpr uint32_t kBodyAt = sizeof(BtMapMessageArea);
    const LinkedArea area(BT_MAP_MESSAGE_AREA_NAME, BT_MAP_MESSAGE_AREA_SIZE, BT_MAP_MESSAGE_AREA_SIZE);
    if (!area.has(kBodyAt)) return BT_FAILED;

    const uint32_t stored = area.read<uint32_t>(offsetof(BtMapMessageArea, body_length));
    const uint32_t length = std::min({stored, area.size() - kBodyAt, maximum});
    if (length != 0 && record->body == nullptr) return BT_FAILED;

    std::memcpy(record, area.at(kFieldsAt), kFieldsSize);
    record->body_length = length;
    if (length != 0) std::memcpy(record->body, area.at(kBodyAt), length);
    return BT_OK;
}

constexpr ListLayout kMessageList = list_layout<BtMapMessageListArea>(BT_MAP_MESSAGE_LIST_NAME);
constexpr ListLayout kFolderList = list_layout<BtMapFolderListArea>(BT_MAP_FOLDER_LIST_NAME);
constexpr ListLayout kInstances = list_layout<BtMapInstanceArea>(BT_MAP_INSTANCE_AREA_NAME);

// Both lists begin with their count.
static_assert(offsetof(BtMapMessageListArea, count) == 0 && offsetof(BtMapFolderListArea, count) == 0);

int32_t copy_list(const ListLayout& list, uint32_t maximum, uint32_t* count, void* entries)
{
    if (maximum == 0 || count == nullptr || entries == nullptr) return BT_FAILED;

    const LinkedArea area(list.name, list.area_size, list.area_size);
    if (!area.has(list.entries_at)) return BT_FAILED;

    const uint32_t copied = std::min({area.read<uint32_t>(0), area.room(list), maximum});
    *count = copied;
    area.copy_entries(list, 0, copied, entries);
    return BT_OK;
}

// Makes the object exist. Nothing here reads or writes it, and an application that may not create it still gets the
// instances.
void touch_service_info()
{
    const int object = shm_open("BT_SRV_MAP_SERVICE_INFO", O_CREAT | O_RDWR, 0777);
    if (object >= 0) close(object);
}

void copy_instance(const BtMapInstanceEntry& entry, BtMapInstance* instance)
{
    const uint8_t name_length = std::min<uint8_t>(entry.name_length, sizeof entry.name);

    instance->id = entry.id;
    instance->name_length = name_length;
    std::memcpy(instance->name, entry.name, name_length);
    instance->attribute = entry.attribute;
}

int32_t copy_instances(BtMapInstanceList* list)
{
    if (list == nullptr) return BT_FAILED;

    touch_service_info();
    const LinkedArea area(kInstances.name, kInstances.area_size, kInstances.area_size);
    if (!area.has(kInstances.entries_at)) return BT_FAILED;

    const uint32_t stored = area.read<uint8_t>(offsetof(BtMapInstanceArea, count));
    const uint32_t copied = std::min(stored, area.room(kInstances));
    list->count = static_cast<uint8_t>(copied);
    for (uint32_t i = 0; i < copied; ++i) {
        const uint32_t entry_at = kInstances.entries_at + i * kInstances.entry_size;
        copy_instance(area.read<BtMapInstanceEntry>(entry_at), &list->instance[i]);
    }
    return BT_OK;
}

} // namespace
} // namespace bt::map

int32_t BT_SRV_MAP_getMessageData(struct message_record* record)
{
    return bt::map::copy_message(bt::map::kNoLimit, record);
}

int32_t BT_SRV_MAP_getMessageData_ex(uint32_t maximum, struct message_record* record)
{
    return bt::map::copy_message(maximum, record);
}

int32_t BT_SRV_MAP_getMessageListData(uint32_t* count, void* entries)
{
    return bt::map::copy_list(bt::map::kMessageList, bt::map::kNoLimit, count, entries);
}

int32_t BT_SRV_MAP_getMessageListData_ex(uint32_t maximum, uint32_t* count, void* entries)
{
    return bt::map::copy_list(bt::map::kMessageList, maximum, count, entries);
}

int32_t BT_SRV_MAP_getFolderListData(uint32_t* count, void* entries)
{
    return bt::map::copy_list(bt::map::kFolderList, bt::map::kNoLimit, count, entries);
}

int32_t BT_SRV_MAP_getFolderListData_ex(uint32_t maximum, uint32_t* count, void* entries)
{
    return bt::map::copy_list(bt::map::kFolderList, maximum, count, entries);
}

int32_t BT_SRV_MAP_getMasServiceInfo(BtMapInstanceList* list)
{
    return bt::map::copy_instances(list);
}
