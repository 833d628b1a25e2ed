// The device ID records: up to two values of eight bytes per device, each under a key.
#include <cstring>

#include "thread/bt_srv_con/src/area.h"

namespace bt::con {
namespace {

constexpr auto kList = &BtConShareData::registered_device_did_info_list;
using Entries = Field<kList>;

constexpr int32_t kEntries = BT_CON_DEVICE_MAX;

bool is_entry(int32_t index)
{
    return index >= 0 && index < kEntries;
}

void remove_entry(Entries& list, int32_t index)
{
    int32_t to = index;
    for (; to < kEntries - 1 && bt_con_IsValidBtDevAddress(&list[to].bd_addr) != 0; ++to)
        list[to] = list[to + 1];
    if (to == kEntries - 1) list[to] = g_con_data_from_init.registered_device_did_info_list[0];
}

} // namespace
} // namespace bt::con

using namespace bt::con;

int32_t bt_con_searchRegisteredDeviceDIDInfo(const BtDevAddress* addr, const BtConDidInfoEntry* list, int32_t* index)
{
    if (addr == nullptr || list == nullptr || index == nullptr) return BT_BAD_ARGUMENT;

    for (*index = 0; *index < kEntries; ++*index) {
        const BtDevAddress* const used = &list[*index].bd_addr;
        if (bt_con_IsValidBtDevAddress(used) == 0) return BT_BAD_ARGUMENT;
        if (bt_con_IsCompBtDevAddress(used, addr) != 0) return BT_OK;
    }
    return BT_OK;
}

int32_t bt_con_getDeviceDIDInfo(int32_t index, uint32_t key, const BtConDidInfoEntry* list, uint8_t* value)
{
    if (key == 0 || !is_entry(index) || list == nullptr || value == nullptr) return BT_BAD_ARGUMENT;

    for (const BtConDidSlot& slot : list[index].slot) {
        if (slot.did_key != key) continue;
        std::memcpy(value, slot.did_value, sizeof slot.did_value);
        return BT_OK;
    }
    return BT_FAILED;
}

int32_t bt_con_setDeviceDIDInfo(int32_t index, const BtDevAddress* addr, uint32_t key, BtConDidInfoEntry* list,
                                const uint8_t* value)
{
    if (key == 0 || !is_entry(index) || list == nullptr || value == nullptr) return BT_BAD_ARGUMENT;
    if (addr == nullptr || bt_con_IsValidBtDevAddress(addr) == 0) return BT_BAD_ARGUMENT;

    for (BtConDidSlot& slot : list[index].slot) {
        if (slot.did_key != key && slot.did_key != 0) continue;
        list[index].bd_addr = *addr;
        slot.did_key = key;
        std::memcpy(slot.did_value, value, sizeof slot.did_value);
        return BT_OK;
    }
    return BT_FAILED;
}

int32_t bt_con_getRegisteredDeviceDIDInfo(const BtDevAddress* addr, uint32_t key, uint8_t* value)
{
    AreaLock lock;
    if (lock.taken() != BT_OK) return lock.taken();

    Entries list;
    const int32_t read = copy_held<kList>(list);
    if (read != BT_OK) return read;

    int32_t index = kEntries;
    if (bt_con_searchRegisteredDeviceDIDInfo(addr, list, &index) != BT_OK) return BT_BAD_ARGUMENT;
    return bt_con_getDeviceDIDInfo(index, key, list, value);
}

int32_t bt_con_addRegisteredDeviceDIDInfo(const BtDevAddress* addr, uint32_t key, const uint8_t* value)
{
    AreaLock lock;
    if (lock.taken() != BT_OK) return lock.taken();

    return change_held<kList>(bt_con_setRegisteredDeviceDIDInfoList, [=](Entries& list) -> int32_t {
        // Not found leaves the first empty entry. What does not fit is not stored, and that is no failure.
        int32_t index = kEntries;
        bt_con_searchRegisteredDeviceDIDInfo(addr, list, &index);
        bt_con_setDeviceDIDInfo(index, addr, key, list, value);
        return BT_OK;
    });
}

int32_t bt_con_delRegisteredDeviceDIDInfo(const BtDevAddress* addr)
{
    AreaLock lock;
    if (lock.taken() != BT_OK) return lock.taken();

    return change_held<kList>(bt_con_setRegisteredDeviceDIDInfoList, [=](Entries& list) -> int32_t {
        int32_t index = kEntries;
        if (bt_con_searchRegisteredDeviceDIDInfo(addr, list, &index) != BT_OK) return BT_BAD_ARGUMENT;
        remove_entry(list, index);
        return BT_OK;
    });
}
