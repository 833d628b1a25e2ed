// The field accessors of the connection data area: one line each, so that every exported name can be found.
#include "thread/bt_srv_con/src/area.h"

using bt::con::Image;
using bt::con::read_field;
using bt::con::write_field;

int32_t bt_con_getRegisteredDeviceListInfo(BtConRegDevListInfo* buffer, uint32_t lock_flag)
{
    return read_field<&BtConShareData::registered_device_list_info>(buffer, lock_flag);
}

int32_t bt_con_setRegisteredDeviceListInfo(const BtConRegDevListInfo* buffer, uint32_t lock_flag)
{
    return write_field<&BtConShareData::registered_device_list_info>(buffer, Image::kWrite, lock_flag);
}

int32_t bt_con_getRegisteredDeviceListInfoNoFROMWrite(BtConRegDevListInfo* buffer, uint32_t lock_flag)
{
    return read_field<&BtConShareData::registered_device_list_info>(buffer, lock_flag);
}

int32_t bt_con_setRegisteredDeviceListInfoNoFROMWrite(const BtConRegDevListInfo* buffer, uint32_t lock_flag)
{
    return write_field<&BtConShareData::registered_device_list_info>(buffer, Image::kLeave, lock_flag);
}

int32_t bt_con_getRegisteredOrderList(BtConOrderList* buffer, uint32_t lock_flag)
{
    return read_field<&BtConShareData::registered_order_list>(buffer, lock_flag);
}

int32_t bt_con_setRegisteredOrderList(const BtConOrderList* buffer, uint32_t lock_flag)
{
    return write_field<&BtConShareData::registered_order_list>(buffer, Image::kWrite, lock_flag);
}

int32_t bt_con_getProfileConnectedOrderList(BtConOrderList* buffer, uint32_t lock_flag)
{
    return read_field<&BtConShareData::profile_connected_order_list>(buffer, lock_flag);
}

int32_t bt_con_setProfileConnectedOrderList(const BtConOrderList* buffer, uint32_t lock_flag)
{
    return write_field<&BtConShareData::profile_connected_order_list>(buffer, Image::kWrite, lock_flag);
}

int32_t bt_con_getRegisteredDeviceDIDInfoList(BtConDidInfoEntry* buffer, uint32_t lock_flag)
{
    return read_field<&BtConShareData::registered_device_did_info_list>(buffer, lock_flag);
}

int32_t bt_con_setRegisteredDeviceDIDInfoList(const BtConDidInfoEntry* buffer, uint32_t lock_flag)
{
    return write_field<&BtConShareData::registered_device_did_info_list>(buffer, Image::kWrite, lock_flag);
}

int32_t bt_con_getSearchDevlist(BtConSearchDevList* buffer, uint32_t lock_flag)
{
    return read_field<&BtConShareData::search_devlist>(buffer, lock_flag);
}

int32_t bt_con_setSearchDevlist(const BtConSearchDevList* buffer, uint32_t lock_flag)
{
    return write_field<&BtConShareData::search_devlist>(buffer, Image::kLeave, lock_flag);
}

int32_t bt_con_getConnectSetVal(uint32_t* buffer, uint32_t lock_flag)
{
    return read_field<&BtConShareData::connect_set_val>(buffer, lock_flag);
}

int32_t bt_con_setConnectSetVal(const uint32_t* buffer, uint32_t lock_flag)
{
    return write_field<&BtConShareData::connect_set_val>(buffer, Image::kLeave, lock_flag);
}

int32_t bt_con_getLinkLossConnectSetVal(uint8_t* buffer, uint32_t lock_flag)
{
    return read_field<&BtConShareData::link_loss_connect_set_val>(buffer, lock_flag);
}

int32_t bt_con_setLinkLossConnectSetVal(const uint8_t* buffer, uint32_t lock_flag)
{
    return write_field<&BtConShareData::link_loss_connect_set_val>(buffer, Image::kLeave, lock_flag);
}

int32_t bt_con_getDiscoverableStatus(uint32_t* buffer, uint32_t lock_flag)
{
    return read_field<&BtConShareData::discoverable_status>(buffer, lock_flag);
}

int32_t bt_con_setDiscoverableStatus(const uint32_t* buffer, uint32_t lock_flag)
{
    return write_field<&BtConShareData::discoverable_status>(buffer, Image::kLeave, lock_flag);
}

int32_t bt_con_getScanMode(uint32_t* buffer, uint32_t lock_flag)
{
    return read_field<&BtConShareData::scan_mode>(buffer, lock_flag);
}

int32_t bt_con_setScanMode(const uint32_t* buffer, uint32_t lock_flag)
{
    return write_field<&BtConShareData::scan_mode>(buffer, Image::kLeave, lock_flag);
}

int32_t bt_con_getSimplepairingCapability(uint8_t* buffer, uint32_t lock_flag)
{
    return read_field<&BtConShareData::simplepairing_capability>(buffer, lock_flag);
}

int32_t bt_con_setSimplepairingCapability(const uint8_t* buffer, uint32_t lock_flag)
{
    return write_field<&BtConShareData::simplepairing_capability>(buffer, Image::kLeave, lock_flag);
}

int32_t bt_con_getBluetoothSetVal(uint32_t* buffer, uint32_t lock_flag)
{
    return read_field<&BtConShareData::bluetooth_set_val>(buffer, lock_flag);
}

int32_t bt_con_setBluetoothSetVal(const uint32_t* buffer, uint32_t lock_flag)
{
    return write_field<&BtConShareData::bluetooth_set_val>(buffer, Image::kLeave, lock_flag);
}
