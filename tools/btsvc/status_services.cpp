// The unit's services, as its supervisor tells them.
#include "btsvc/shared_copy.h"
#include "btsvc/status.h"
#include "btsvc/table.h"
#include "btsvc/unit.h"
#include "catalogue/print.h"
#include "sim/unit_records.h"

#include <fmt/format.h>

#include <algorithm>
#include <cerrno>
#include <csignal>
#include <iterator>

namespace bt::client {
namespace {

using Json = nlohmann::ordered_json;

// The record of a unit that was killed still names its processes.
bool process_lives(uint32_t pid)
{
    return pid != 0 && (::kill(static_cast<pid_t>(pid), 0) == 0 || errno == EPERM);
}

bool owns_number(const std::vector<BtHostQueue>& known, const BtSimService& service)
{
    return service.pid != 0 && std::any_of(known.begin(), known.end(), [&service](const BtHostQueue& queue) {
               return queue.pno == service.pno && queue.owner_pid == service.pid;
           });
}

void print_unit(const BtSimUnit* unit, const std::string& root, Output& output)
{
    const bool lives = unit != nullptr && process_lives(unit->supervisor_pid);
    if (output.json()) {
        output.object({{"type", "unit"},
                       {"domain", bt_host_domain()},
                       {"supervisor_pid", unit ? Json(unit->supervisor_pid) : Json()},
                       {"alive", lives},
                       {"root", root}});
        return;
    }
    const std::string told = unit == nullptr ? ""
                                             : fmt::format(": unit of process {}{}, root {}", unit->supervisor_pid,
                                                           lives ? "" : " (gone)", catalogue::printable(root));
    output.line(fmt::format("Domain \"{}\"{}", bt_host_domain(), told));
}

} // namespace

std::string report_services(Output& output)
{
    const auto unit = shared_copy<BtSimUnit>(kUnitDataName);
    const std::string root = unit ? bounded_text(unit->root) : "";

    print_unit(unit.get(), root, output);
    if (!unit) return root;

    Table table("service",
                {{"pno", "number"}, {"name", "service"}, {"pid", "process"}, {"alive", "alive"}, {"starts", "starts"}});
    const std::vector<BtHostQueue> known = queues();
    const size_t count = std::min<size_t>(unit->service_count, std::size(unit->services));
    for (size_t i = 0; i < count; ++i) {
        const BtSimService& service = unit->services[i];
        table.add({{"pno", catalogue::id_text(service.pno)},
                   {"name", bounded_text(service.name)},
                   {"pid", service.pid == 0 ? Json() : Json(service.pid)},
                   {"alive", owns_number(known, service)},
                   {"starts", service.starts}});
    }
    table.print(output, "\nServices", "none");
    return root;
}

} // namespace bt::client
