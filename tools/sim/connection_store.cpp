#include "sim/connection_store.h"

#include <bt_service/bt_connection_store.h>

#include <algorithm>
#include <cstring>

namespace bt::sim::con {

namespace {

// A registered device with the words that belong to it.
struct Device {
    BtConRegDevInfo record{};
    uint32_t attribute = 0;
    uint32_t mode = 0;
    uint32_t role = 0;
};

std::optional<Device> read_device(const BtDevAddress& address)
{
    Device device;
    int32_t index = -1;
    const int32_t read =
        bt_con_getRegDev(&address, &device.record, &index, &device.attribute, &device.mode, &device.role);
    if (read != 0 || index < 0) return {};
    return device;
}

BtSimResult store_profiles(const Device& device)
{
    const int32_t stored =
        bt_con_addRegDev(&device.record.bd_addr, nullptr, nullptr, device.record.profile, nullptr, nullptr, nullptr,
                         nullptr, device.attribute, device.mode, nullptr, device.role);
    return stored == 0 ? BT_SIM_OK : BT_SIM_STORE_FAILED;
}

bool any_connected(const BtConRegDevInfo& record)
{
    return std::any_of(std::begin(record.profile), std::end(record.profile),
                       [](const BtConProfileEntry& entry) { return entry.connected == 1; });
}

BtConDeviceName name_of(const Phone& phone)
{
    BtConDeviceName name{};
    name.char_set = BT_CON_CHAR_SET_UTF_8;
    name.name_length = static_cast<uint32_t>(std::min(phone.name.size(), sizeof name.name_text));
    std::memcpy(name.name_text, phone.name.data(), name.name_length);
    return name;
}

} // namespace

void load_devices()
{
    bt_con_checkBackUpData(1);
    bt_con_ConnectInitRegDev();
    for (const BtDevAddress& address : registered_devices()) {
        std::optional<Device> device = read_device(address);
        if (!device) continue;
        device->mode = 0;
        device->role = 0;
        store_profiles(*device);
    }
}

std::optional<BtConRegDevInfo> registered(const BtDevAddress& address)
{
    const std::optional<Device> device = read_device(address);
    if (!device) return {};
    return device->record;
}

std::vector<BtDevAddress> registered_devices()
{
    BtConRegDevListInfo list{};
    if (bt_con_getRegisteredDeviceListInfo(&list, 1) != 0) return {};
    std::vector<BtDevAddress> addresses;
    for (int32_t i = 0; i < std::clamp<int32_t>(list.device_num, 0, BT_CON_DEVICE_MAX); ++i)
        addresses.push_back(list.device[i].bd_addr);
    return addresses;
}

bool is_connected(const BtDevAddress& address, uint32_t profile)
{
    const auto profiles = connected_profiles(address);
    return std::find(profiles.begin(), profiles.end(), profile) != profiles.end();
}

std::vector<uint32_t> connected_profiles(const BtDevAddress& address)
{
    const std::optional<BtConRegDevInfo> record = registered(address);
    std::vector<uint32_t> profiles;
    for (uint32_t i = 0; record && i < BT_CON_PROFILE_ENTRIES; ++i)
        if (record->profile[i].connected == 1) profiles.push_back(i);
    return profiles;
}

BtSimResult register_phone(const Phone& phone)
{
    int32_t count = 0;
    if (bt_con_getRegisterDeviceNum(&count) != 0) return BT_SIM_STORE_FAILED;
    if (count >= BT_CON_DEVICE_MAX && !registered(phone.address)) return BT_SIM_LIST_FULL;

    const BtConDeviceName name = name_of(phone);
    BtConProfileEntry profiles[BT_CON_PROFILE_ENTRIES] = {};
    for (uint32_t i = 0; i < BT_CON_PROFILE_ENTRIES; ++i)
        profiles[i].supported = phone.has_profile(i) ? 1 : 0;
    if (bt_con_addRegDev(&phone.address, &name, &phone.device_class, profiles, nullptr, nullptr, nullptr, nullptr, 0, 0,
                         nullptr, 0) != 0)
        return BT_SIM_STORE_FAILED;
    return bt_con_addOrderList(&phone.address) == 0 ? BT_SIM_OK : BT_SIM_STORE_FAILED;
}

BtSimResult connect(const Phone& phone, uint32_t profile)
{
    std::optional<Device> device = read_device(phone.address);
    if (!device) return BT_SIM_NOT_REGISTERED;
    device->record.profile[profile].connected = 1;
    device->mode = phone.mode;
    device->role = phone.role;
    const BtSimResult stored = store_profiles(*device);
    const std::optional<uint32_t> index = profile_index(profile);
    if (stored != BT_SIM_OK || !index) return stored;
    return bt_con_addConnectOrder(&phone.address, *index) == 0 ? BT_SIM_OK : BT_SIM_STORE_FAILED;
}

BtSimResult disconnect(const BtDevAddress& address, uint32_t profile)
{
    std::optional<Device> device = read_device(address);
    if (!device) return BT_SIM_NOT_REGISTERED;
    device->record.profile[profile].connected = 0;
    if (!any_connected(device->record)) {
        device->mode = 0;
        device->role = 0;
    }
    return store_profiles(*device);
}

BtSimResult forget(const BtDevAddress& address)
{
    const bool deleted = bt_con_delRegDev(&address) == 0;
    bt_con_delOrderList(&address);
    for (uint32_t index = 0; index < BT_CON_PROFILE_INDEXES; ++index)
        bt_con_delConnectOrder(&address, index);
    bt_con_delRegisteredDeviceDIDInfo(&address);
    return deleted ? BT_SIM_OK : BT_SIM_STORE_FAILED;
}

void keep_device_id(const Phone& phone)
{
    for (const DeviceIdValue& entry : phone.device_id)
        bt_con_addRegisteredDeviceDIDInfo(&phone.address, entry.key, entry.value.data());
}

void clear_found()
{
    bt_con_delSearchdevlist();
}

void add_found(const Phone& phone)
{
    BtConDevInfo found{};
    found.name = name_of(phone);
    found.bd_addr = phone.address;
    found.device_class = phone.device_class;
    bt_con_addSearchdevlist(&found);
}

std::optional<uint32_t> profile_index(uint32_t number)
{
    if (number == 2) return {};
    return number < 2 ? number : number - 1;
}

} // namespace bt::sim::con
