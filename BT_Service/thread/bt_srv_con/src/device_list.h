// Lookups in a copy of the registered device list, for the operations and the queries.
#pragma once

#include <bt_service/bt_connection_records.h>

namespace bt::con {

// Slot of a registered address, or -1; a null address is not registered. The list's count must be a possible one.
int32_t slot_of(const BtConRegDevListInfo& list, const BtDevAddress* addr);

} // namespace bt::con
