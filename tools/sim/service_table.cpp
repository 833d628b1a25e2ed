#include "sim/service_table.h"

#include "sim/connection_service.h"
#include "sim/distributor.h"

namespace bt::sim {

// The distributor is first: events that the others send at their start find it.
const std::vector<Service>& services()
{
    static const std::vector<Service> table = {
        {"distributor", PNO_BT_EDS, run_distributor},
        {"connection", PNO_BT_CON, run_connection_service},
    };
    return table;
}

const Service* find_service(const std::string& name)
{
    for (const Service& service : services())
        if (service.name == name) return &service;
    return nullptr;
}

} // namespace bt::sim
