#include "sim/connection_service.h"

#include "sim/connection_machines.h"
#include "sim/connection_store.h"
#include "sim/connection_tables.h"
#include "sim/service_process.h"

namespace bt::sim {

namespace con {

const Scenario* scenario = nullptr;

} // namespace con

// A message that no machine has a row for is dropped by the engine.
void run_connection_service(const Scenario& scenario)
{
    con::scenario = &scenario;
    con::load_devices();
    con::set_initial_settings();
    con::start_incoming();
    report_ready();

    BtMessage message;
    while (next_message(message)) {
        BT_CMN_doMtxFunc(&message, con::dispatch_table(), con::machine_table());
        con::take_deferred();
    }
}

} // namespace bt::sim
