// What every service process of the unit does around its own work: take its number, join event dispatch, receive.
#pragma once

#include "sim/service_table.h"

#include <bt_service/bt_message.h>

namespace bt::sim {

// The life of a service process: takes the service's number, reports on `ready_fd` that it serves, runs it, and gives
// the number back. Returns the exit code.
int run_service_process(const Service& service, const Scenario& scenario, int ready_fd);

// The next message, with every byte behind its end zero and `len` capped to the payload; false when the process has been told to end.
bool next_message(BtMessage& message);

// Tells the supervisor that the service is set up; called by the service before its first message.
void report_ready();

} // namespace bt::sim
