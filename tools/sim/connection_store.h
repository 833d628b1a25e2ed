// The connection service's changes of the connection data area, each one step of the service.
#pragma once

#include "sim/scenario.h"

#include <bt_service/bt_connection_records.h>
#include <bt_sim/events.h>

#include <optional>
#include <vector>

namespace bt::sim::con {

// After a restart nothing is connected.
void load_devices();

std::optional<BtConRegDevInfo> registered(const BtDevAddress& address);
std::vector<BtDevAddress> registered_devices();
bool is_connected(const BtDevAddress& address, uint32_t profile);
std::vector<uint32_t> connected_profiles(const BtDevAddress& address);

BtSimResult register_phone(const Phone& phone);
BtSimResult connect(const Phone& phone, uint32_t profile);
BtSimResult disconnect(const BtDevAddress& address, uint32_t profile);
// Removes the device with everything kept about it.
BtSimResult forget(const BtDevAddress& address);
void keep_device_id(const Phone& phone);

void clear_found();
void add_found(const Phone& phone);

// The profile index of a profile number; none for the number that no index selects.
std::optional<uint32_t> profile_index(uint32_t number);

} // namespace bt::sim::con
