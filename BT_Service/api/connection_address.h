// The address check of the connection requests.
#pragma once

#include <bt_service/bt_connection_store.h>

namespace bt::con {

// True for an address that stands for a device.
inline bool is_device(const BtDevAddress* addr)
{
    return addr != nullptr && bt_con_IsValidBtDevAddress(addr) == 1;
}

} // namespace bt::con
