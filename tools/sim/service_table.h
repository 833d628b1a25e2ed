// The service processes of a unit, in the order in which they start.
#pragma once

#include "sim/scenario.h"

#include <cstdint>
#include <vector>

namespace bt::sim {

struct Service {
    const char* name;
    uint32_t pno;
    // The body of the process; returns when the process has been told to end.
    void (*run)(const Scenario& scenario);
};

const std::vector<Service>& services();

// Null when there is none.
const Service* find_service(const std::string& name);

} // namespace bt::sim
