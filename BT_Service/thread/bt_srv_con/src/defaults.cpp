// The default image of the persistent part: no device, every address slot empty.
#include <bt_service/bt_connection_store.h>

namespace {

constexpr void clear(BtDevAddress& slot)
{
    for (uint8_t& byte : slot.address)
        byte = 0xFF;
}

constexpr void clear(BtConOrderList& list)
{
    for (BtDevAddress& slot : list.addr)
        clear(slot);
}

constexpr void clear(BtConRegDevInfo& device)
{
    device.name.char_set = BT_CON_CHAR_SET_US_ASCII;
    clear(device.bd_addr);
    for (uint32_t& word : device.runtime_words)
        word = 7;
    device.ext_info_2[0] = 3;
}

constexpr BtConPersistentData default_image()
{
    BtConPersistentData image{};
    for (BtConRegDevInfo& device : image.registered_device_list_info.device)
        clear(device);
    clear(image.registered_order_list);
    for (BtConOrderList& list : image.profile_connected_order_list)
        clear(list);
    for (BtConDidInfoEntry& entry : image.registered_device_did_info_list)
        clear(entry.bd_addr);
    return image;
}

} // namespace

constexpr BtConPersistentData g_con_data_from_init = default_image();
