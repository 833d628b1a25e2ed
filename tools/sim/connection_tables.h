// The tables by which the library's engine drives the connection service's machines.
#pragma once

#include <bt_service/bt_state_machine.h>

namespace bt::sim::con {

const BtStateRow* search_states();
const BtStateRow* incoming_states();
const BtStateRow* link_states();

const BtDispatchRow* dispatch_table();
const BtFunctionIdRow* machine_table();

} // namespace bt::sim::con
