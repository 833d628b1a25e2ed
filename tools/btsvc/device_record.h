// A registered device as text and as JSON.
#pragma once

#include <bt_service/bt_connection_records.h>

#include <nlohmann/json.hpp>

#include <string>
#include <vector>

namespace bt::client {

// The bytes of the name, never more than the record holds.
std::string device_name(const BtConRegDevInfo& device);

// Numbers of the profile entries that are connected, or supported.
std::vector<int> connected_profiles(const BtConRegDevInfo& device);
std::vector<int> supported_profiles(const BtConRegDevInfo& device);

nlohmann::ordered_json device_json(const BtConRegDevInfo& device);

} // namespace bt::client
