// The connection queries: answers about registered devices and the local radio out of the connection data area.
#include <bt_service/bt_connection_queries.h>
#include <bt_service/bt_connection_store.h>

#include <algorithm>

#include "thread/bt_srv_con/src/area.h"
#include "thread/bt_srv_con/src/device_list.h"

namespace bt::con {
namespace {

constexpr auto kDevices = &BtConShareData::registered_device_list_info;

// Hands the slot of a registered device to `pick`. 0, -1 not registered, or a lock or copy failure.
template <class Pick>
int32_t pick_device(const BtDevAddress* addr, Pick pick)
{
    return look_at_field<kDevices>([=](const BtConRegDevListInfo& list) -> int32_t {
        const int32_t slot = slot_of(list, addr);
        if (slot < 0) return BT_FAILED;
        pick(list, slot);
        return BT_OK;
    });
}

// Fills `maximum` records: the registered devices, then slots of which only the address is set, to no device.
int32_t copy_devices(const BtConRegDevListInfo& list, int32_t maximum, BtConRegDevInfo* records)
{
    const int32_t copied = std::min(list.device_num, maximum);
    std::copy_n(list.device, copied, records);
    for (int32_t i = copied; i < maximum; ++i)
        bt_con_clearBtDevAddress(&records[i].bd_addr);
    return copied;
}

} // namespace
} // namespace bt::con

using namespace bt::con;

int32_t BT_SRV_CON_getConnectionMode(const BtDevAddress* addr, uint32_t* mode)
{
    const int32_t attached = bt_con_ApiInit(0);
    if (attached != BT_OK) return attached;
    if (mode == nullptr) return BT_BAD_ARGUMENT;

    return pick_device(addr,
                       [=](const BtConRegDevListInfo& list, int32_t slot) { *mode = list.connection_mode[slot]; });
}

int32_t BT_SRV_CON_getLocalDeviceRole(const BtDevAddress* addr, uint32_t* role)
{
    const int32_t attached = bt_con_ApiInit(0);
    if (attached != BT_OK) return attached;
    if (role == nullptr) return BT_BAD_ARGUMENT;

    return pick_device(addr, [=](const BtConRegDevListInfo& list, int32_t slot) { *role = list.local_role[slot]; });
}

int32_t BT_SRV_CON_getRemoteDeviceInfo(const BtDevAddress* addr, BtConRegDevInfo* record)
{
    const int32_t attached = bt_con_ApiInit(0);
    if (attached != BT_OK) return attached;
    if (addr == nullptr || record == nullptr) return BT_BAD_ARGUMENT;

    return pick_device(addr, [=](const BtConRegDevListInfo& list, int32_t slot) { *record = list.device[slot]; });
}

int32_t BT_SRV_CON_getRemoteDeviceList(uint32_t, const int32_t* value, int32_t maximum, BtConRegDevInfo* records)
{
    if (bt_con_ApiInit(0) != BT_OK) return 0;
    if (maximum == 0 || records == nullptr || value == nullptr || *value < 0) return 0;

    AreaLock lock;
    if (lock.taken() != BT_OK) return 0;
    BtConRegDevListInfo list;
    if (copy_held<kDevices>(list) != BT_OK || maximum < 0) return 0;
    return copy_devices(list, maximum, records);
}

int32_t BT_SRV_CON_getScanMode(uint32_t* mode)
{
    const int32_t attached = bt_con_ApiInit(0);
    if (attached != BT_OK) return attached;
    return mode == nullptr ? int32_t{BT_BAD_ARGUMENT} : bt_con_getScanMode(mode, 1);
}

int32_t BT_SRV_CON_getDiscoverableMode(uint32_t* mode)
{
    const int32_t attached = bt_con_ApiInit(0);
    if (attached != BT_OK) return attached;
    return mode == nullptr ? int32_t{BT_BAD_ARGUMENT} : bt_con_getDiscoverableStatus(mode, 1);
}

int32_t BT_SRV_CON_getRemoteDeviceDIDInfo(const BtDevAddress* addr, uint32_t key, uint8_t* value)
{
    const int32_t attached = bt_con_ApiInit(0);
    if (attached != BT_OK) return attached;
    if (addr == nullptr || value == nullptr || key == 0) return BT_BAD_ARGUMENT;

    return bt_con_getRegisteredDeviceDIDInfo(addr, key, value);
}
