// What the registered order list and the order lists by profile have in common.
#pragma once

#include <bt_service/bt_connection_store.h>

namespace bt::con {

// First position of the address in a list whose count is a possible one, or -1.
int32_t position_of(const BtConOrderList& list, const BtDevAddress* addr);

// Copies the slot out. 0, or -1 for a position outside the list's 17 slots and for an empty list.
int32_t copy_slot(const BtConOrderList& list, int32_t position, BtDevAddress* out);

// Takes the address out of the list. 0, or kUnchanged when it is not there.
int32_t remove_address(BtConOrderList& list, const BtDevAddress* addr);

} // namespace bt::con
