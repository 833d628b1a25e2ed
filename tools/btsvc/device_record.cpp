#include "btsvc/device_record.h"

#include "catalogue/print.h"

#include <algorithm>

namespace bt::client {
namespace {

std::vector<int> profiles_with(const BtConRegDevInfo& device, uint32_t BtConProfileEntry::*flag)
{
    std::vector<int> numbers;
    for (int i = 0; i < BT_CON_PROFILE_ENTRIES; ++i)
        if (device.profile[i].*flag == 1) numbers.push_back(i);
    return numbers;
}

} // namespace

std::string device_name(const BtConRegDevInfo& device)
{
    const size_t length = std::min<size_t>(device.name.name_length, BT_CON_NAME_TEXT_SIZE);
    return std::string(device.name.name_text, device.name.name_text + length);
}

std::vector<int> connected_profiles(const BtConRegDevInfo& device)
{
    return profiles_with(device, &BtConProfileEntry::connected);
}

std::vector<int> supported_profiles(const BtConRegDevInfo& device)
{
    return profiles_with(device, &BtConProfileEntry::supported);
}

nlohmann::ordered_json device_json(const BtConRegDevInfo& device)
{
    nlohmann::ordered_json json;
    json["address"] = catalogue::address_text(device.bd_addr.address);
    json["name"] = device_name(device);
    json["char_set"] = device.name.char_set;
    json["class"] = catalogue::id_text(device.device_class);
    json["supported_profiles"] = supported_profiles(device);
    json["connected_profiles"] = connected_profiles(device);
    return json;
}

} // namespace bt::client
