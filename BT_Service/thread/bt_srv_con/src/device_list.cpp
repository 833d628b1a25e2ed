// The operations on the registered device list: add, remove, read, count, empty.
#include "thread/bt_srv_con/src/device_list.h"

#include <cstring>

#include "thread/bt_srv_con/src/area.h"

namespace bt::con {

int32_t slot_of(const BtConRegDevListInfo& list, const BtDevAddress* addr)
{
    if (addr == nullptr) return -1;
    for (int32_t slot = 0; slot < list.device_num; ++slot)
        if (bt_con_IsCompBtDevAddress(addr, &list.device[slot].bd_addr) != 0) return slot;
    return -1;
}

namespace {

bool names_device(const BtDevAddress* addr)
{
    return addr != nullptr && bt_con_IsValidBtDevAddress(addr) != 0;
}

// A null pointer leaves the field as it is.
template <class T>
void replace(T& field, const void* given)
{
    if (given != nullptr) std::memcpy(&field, given, sizeof field);
}

// Slot of the address, a new one at the end of the list when it is not registered; -1 when the list is full.
int32_t slot_for(BtConRegDevListInfo& list, const BtDevAddress* addr)
{
    const int32_t registered = slot_of(list, addr);
    if (registered >= 0 || list.device_num == BT_CON_DEVICE_MAX) return registered;

    bt_con_copyBtDevAddress(&list.device[list.device_num].bd_addr, addr);
    return list.device_num++;
}

void remove_slot(BtConRegDevListInfo& list, int32_t slot)
{
    const int32_t last = list.device_num - 1;
    for (int32_t to = slot; to < last; ++to) {
        list.device[to] = list.device[to + 1];
        list.device_attribute[to] = list.device_attribute[to + 1];
        list.connection_mode[to] = list.connection_mode[to + 1];
        list.local_role[to] = list.local_role[to + 1];
    }
    list.device[last] = g_con_data_from_init.registered_device_list_info.device[0];
    list.device_attribute[last] = 0;
    list.connection_mode[last] = 0;
    list.local_role[last] = 0;
    list.device_num = last;
}

template <class Store, class Change>
int32_t change_list(Store store, Change change)
{
    if (area() == nullptr) return BT_FAILED;
    return change_field<&BtConShareData::registered_device_list_info>(store, change);
}

} // namespace
} // namespace bt::con

using namespace bt::con;

int32_t bt_con_addRegDev(const BtDevAddress* addr, const BtConDeviceName* name, const uint32_t* device_class,
                         const BtConProfileEntry* profile, const uint32_t* runtime_words, const uint8_t* runtime_block,
                         const uint8_t* ext_info_1, const uint32_t* ext_info_2, uint32_t device_attribute,
                         uint32_t connection_mode, const uint8_t* ext_info_3, uint32_t local_role)
{
    if (!names_device(addr)) return BT_BAD_ARGUMENT;

    const bool worth_an_image = name != nullptr || device_class != nullptr || profile != nullptr ||
                                ext_info_1 != nullptr || ext_info_2 != nullptr || ext_info_3 != nullptr;
    const auto set =
        worth_an_image ? bt_con_setRegisteredDeviceListInfo : bt_con_setRegisteredDeviceListInfoNoFROMWrite;

    return change_list(set, [=](BtConRegDevListInfo& list) -> int32_t {
        const int32_t slot = slot_for(list, addr);
        if (slot < 0) return BT_FAILED;

        BtConRegDevInfo& device = list.device[slot];
        replace(device.name, name);
        replace(device.device_class, device_class);
        replace(device.profile, profile);
        replace(device.runtime_words, runtime_words);
        replace(device.runtime_block, runtime_block);
        replace(device.ext_info_1, ext_info_1);
        replace(device.ext_info_2, ext_info_2);
        replace(device.ext_info_3, ext_info_3);
        list.device_attribute[slot] = device_attribute;
        list.connection_mode[slot] = connection_mode;
        list.local_role[slot] = local_role;
        return BT_OK;
    });
}

int32_t bt_con_delRegDev(const BtDevAddress* addr)
{
    if (!names_device(addr)) return BT_BAD_ARGUMENT;

    return change_list(bt_con_setRegisteredDeviceListInfo, [addr](BtConRegDevListInfo& list) -> int32_t {
        const int32_t slot = slot_of(list, addr);
        if (slot < 0) return BT_FAILED;
        remove_slot(list, slot);
        return BT_OK;
    });
}

int32_t bt_con_delpluralRegDev(const BtDevAddress* addrs, int32_t count)
{
    if (addrs == nullptr) return BT_BAD_ARGUMENT;

    return change_list(bt_con_setRegisteredDeviceListInfo, [=](BtConRegDevListInfo& list) -> int32_t {
        for (int32_t i = 0; i < count; ++i) {
            const int32_t slot = slot_of(list, &addrs[i]);
            if (slot >= 0) remove_slot(list, slot);
        }
        return BT_OK;
    });
}

int32_t bt_con_getRegDev(const BtDevAddress* addr, BtConRegDevInfo* record, int32_t* index, uint32_t* attribute,
                         uint32_t* mode, uint32_t* role)
{
    if (index == nullptr) return BT_BAD_ARGUMENT;
    *index = -1;
    if (!names_device(addr) || record == nullptr) return BT_BAD_ARGUMENT;
    if (attribute == nullptr || mode == nullptr || role == nullptr) return BT_BAD_ARGUMENT;
    *attribute = 0;
    if (area() == nullptr) return BT_FAILED;

    return look_at_field<&BtConShareData::registered_device_list_info>([=](const BtConRegDevListInfo& list) -> int32_t {
        const int32_t slot = slot_of(list, addr);
        if (slot < 0) return BT_OK;
        *index = slot;
        *record = list.device[slot];
        *attribute = list.device_attribute[slot];
        *mode = list.connection_mode[slot];
        *role = list.local_role[slot];
        return BT_OK;
    });
}

int32_t bt_con_getRegisterDeviceName(const BtDevAddress* addr, BtConDeviceName* name)
{
    if (addr == nullptr || name == nullptr) return BT_FAILED;

    BtConRegDevInfo device;
    int32_t index = -1;
    uint32_t attribute = 0;
    uint32_t mode = 0;
    uint32_t role = 0;
    const int32_t result = bt_con_getRegDev(addr, &device, &index, &attribute, &mode, &role);
    if (result == BT_OK && index >= 0) {
        *name = device.name;
        return BT_OK;
    }
    *name = BtConDeviceName{BT_CON_CHAR_SET_UTF_8, 0, {}};
    return result == BT_OK ? BT_FAILED : result;
}

int32_t bt_con_getRegisterDeviceIndex(const BtDevAddress* addr)
{
    int32_t count = 0;
    if (addr == nullptr || bt_con_getRegisterDeviceNum(&count) != BT_OK) return -1;

    const BtConRegDevListInfo& list = area()->registered_device_list_info;
    for (int32_t slot = 0; slot < count; ++slot)
        if (holds(list.device[slot].bd_addr.address, addr->address, sizeof addr->address)) return slot;
    return -1;
}

int32_t bt_con_getRegisterDeviceNum(int32_t* count)
{
    const BtConShareData* const attached = area();
    if (count == nullptr || attached == nullptr) return BT_FAILED;

    int32_t stored = 0;
    load(&stored, &attached->registered_device_list_info.device_num, sizeof stored);
    *count = possible(stored, BT_CON_DEVICE_MAX);
    return BT_OK;
}

int32_t bt_con_initRegDev(void)
{
    return bt_con_setRegisteredDeviceListInfo(&g_con_data_from_init.registered_device_list_info, 1);
}

int32_t bt_con_ConnectInitRegDev(void)
{
    return change_list(bt_con_setRegisteredDeviceListInfo, [](BtConRegDevListInfo& list) -> int32_t {
        for (int32_t slot = 0; slot < list.device_num; ++slot)
            for (BtConProfileEntry& entry : list.device[slot].profile)
                entry.connected = 0;
        return BT_OK;
    });
}
