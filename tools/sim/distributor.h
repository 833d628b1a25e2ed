// The event distributor: takes the events posted to its number and posts each to the listeners that want it.
#pragma once

#include "sim/scenario.h"

namespace bt::sim {

void run_distributor(const Scenario& scenario);

} // namespace bt::sim
