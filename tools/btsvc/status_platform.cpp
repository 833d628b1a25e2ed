// Queues, locks and shared data of the domain.
#include "btsvc/shared_copy.h"
#include "btsvc/status.h"
#include "btsvc/table.h"
#include "btsvc/unit.h"
#include "catalogue/print.h"

#include <string>

namespace bt::client {
namespace {

using Json = nlohmann::ordered_json;

Json pid_json(uint32_t pid)
{
    return pid == 0 ? Json() : Json(pid);
}

} // namespace

bool report_queues(Output& output)
{
    Table table("queue", {{"pno", "number"},
                          {"process", "process"},
                          {"owner_pid", "owner"},
                          {"queued", "queued"},
                          {"capacity", "capacity"},
                          {"posted", "posted"},
                          {"refused", "refused"}});
    bool alive = false;
    for (const BtHostQueue& queue : queues()) {
        const std::string name = process_name(queue.pno);
        table.add({{"pno", catalogue::id_text(queue.pno)},
                   {"process", name.empty() ? "application" : name},
                   {"owner_pid", pid_json(queue.owner_pid)},
                   {"queued", queue.queued},
                   {"capacity", queue.capacity},
                   {"posted", queue.posted},
                   {"refused", queue.refused}});
        alive = alive || (!name.empty() && queue.owner_pid != 0);
    }
    table.print(output, "\nQueues", "none: no process has a number in this domain");
    return alive;
}

void report_locks(Output& output)
{
    Table table("lock", {{"name", "name"}, {"holder_pid", "holder"}, {"recovered", "recovered"}});
    for (const BtHostLock& lock : locks())
        table.add({{"name", bounded_text(lock.name)},
                   {"holder_pid", pid_json(lock.holder_pid)},
                   {"recovered", lock.recovered}});
    table.print(output, "\nLocks", "none");
}

void report_shared_data(Output& output)
{
    Table table("data", {{"name", "name"}, {"size", "bytes"}});
    for (const BtHostData& data : shared_data())
        table.add({{"name", bounded_text(data.name)}, {"size", data.size}});
    table.print(output, "\nShared data", "none");
}

} // namespace bt::client
