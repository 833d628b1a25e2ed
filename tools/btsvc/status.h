// The parts of `btsvc status`; each prints what it finds and survives what it does not.
#pragma once

#include "btsvc/output.h"

#include <string>

namespace bt::client {

// The services of the unit and their supervisor; the unit's root folder, empty when it tells none.
std::string report_services(Output& output);
// True when a live process owns a service's number.
bool report_queues(Output& output);
void report_locks(Output& output);
void report_shared_data(Output& output);
// The listener table, with what the distributor counted for each entry.
void report_listeners(Output& output);
// `unit_root` stands for the root folder where BT_SERVICE_ROOT names none.
void report_image(const std::string& unit_root, Output& output);

} // namespace bt::client
