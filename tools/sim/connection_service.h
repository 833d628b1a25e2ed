// The connection service: searches, pairs, connects and releases the phones of the scenario.
#pragma once

#include "sim/scenario.h"

namespace bt::sim {

void run_connection_service(const Scenario& scenario);

} // namespace bt::sim
