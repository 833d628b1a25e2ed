// btsvc status: what lives in a domain and in what state it is.
#include "btsvc/commands.h"
#include "btsvc/status.h"
#include "btsvc/unit.h"

namespace bt::client {
namespace {

ExitCode run_status(Output& output)
{
    require_domain();
    const std::string root = report_services(output);
    const bool alive = report_queues(output);
    report_locks(output);
    report_shared_data(output);
    report_listeners(output);
    report_image(root, output);
    return alive ? kDone : kNoUnit;
}

} // namespace

Command add_status(CLI::App& program)
{
    CLI::App* line = program.add_subcommand("status", "Show the processes, queues, locks and data of a unit");
    line->footer("Exit code 3 when there is no such domain, or no live service process in it.\n\n"
                 "Examples:\n  btsvc status\n  btsvc status --json | jq 'select(.type == \"queue\")'");
    return {line, run_status};
}

} // namespace bt::client
