// The listener table and the distributor's counters.
#include "btsvc/shared_copy.h"
#include "btsvc/status.h"
#include "btsvc/table.h"
#include "btsvc/unit.h"
#include "catalogue/print.h"
#include "catalogue/rows.h"
#include "sim/unit_records.h"

#include <bt_service/bt_events.h>

#include <fmt/format.h>

#include <algorithm>
#include <string>

namespace bt::client {
namespace {

using Json = nlohmann::ordered_json;

constexpr const char* kTableName = "/tmp/shm_eds_regist_table";
constexpr const char* kLockName = "BT_SRV_EDS_SEM_NAME";

// The table as a whole, copied under its lock; without it when the lock is not there or cannot be had.
std::unique_ptr<BtEvtListenerTable> listener_table()
{
    const std::vector<BtHostLock> known = locks();
    const bool exists = std::any_of(known.begin(), known.end(),
                                    [](const BtHostLock& lock) { return bounded_text(lock.name) == kLockName; });
    const uint32_t lock = exists ? _sys_CreateSemaphore(kLockName) : 0;
    const bool held = lock != 0 && _sys_SemLock(lock) == 0;
    auto table = shared_copy<BtEvtListenerTable>(kTableName);
    if (held) _sys_SemUnlock(lock);
    return table;
}

Json event_names(const BtEvtListener& entry)
{
    Json names = Json::array();
    for (uint32_t i = 0; i < std::min<uint32_t>(entry.event_count, BT_EVT_IDS_MAX); ++i) {
        const uint32_t id = entry.event_ids[i];
        const catalogue::Row* row = id <= 0xFFFF ? catalogue::find(static_cast<uint16_t>(id)) : nullptr;
        names.push_back(row ? row->name : catalogue::id_text(id));
    }
    return names;
}

Json listener_json(const BtEvtListener& entry, const BtSimListenerCount* counted)
{
    Json json{
        {"handle", entry.handle},      {"pno", catalogue::id_text(entry.pno)}, {"tag", fmt::format("{:#x}", entry.tag)},
        {"active", entry.active == 1}, {"event_count", entry.event_count},     {"events", event_names(entry)}};
    if (counted != nullptr && counted->handle == entry.handle) {
        json["delivered"] = counted->delivered;
        json["lost"] = uint64_t{counted->full} + counted->gone + counted->failed;
    }
    return json;
}

void report_distributor(const BtSimDistributor* counters, Output& output)
{
    if (counters == nullptr) return;
    if (output.json())
        output.object({{"type", "distributor"},
                       {"events", counters->events},
                       {"unwanted", counters->unwanted},
                       {"deregistered", counters->deregistered}});
    else
        output.line(fmt::format("distributor: {} events taken, {} wanted by nobody, {} dead listeners removed",
                                counters->events, counters->unwanted, counters->deregistered));
}

} // namespace

void report_listeners(Output& output)
{
    const auto table = listener_table();
    const auto counters = shared_copy<BtSimDistributor>(kDistributorDataName);

    Table listeners("listener", {{"handle", "handle"},
                                 {"pno", "number"},
                                 {"tag", "tag"},
                                 {"active", "active"},
                                 {"event_count", "events"},
                                 {"delivered", "delivered"},
                                 {"lost", "lost"}});
    for (size_t i = 0; table && i < BT_EVT_LISTENERS_MAX; ++i)
        if (table->entries[i].handle != 0)
            listeners.add(listener_json(table->entries[i], counters ? &counters->listeners[i] : nullptr));

    const char* none = !table                    ? "the listener table does not exist"
                       : table->next_handle == 0 ? "the listener table is not initialised"
                                                 : "none";
    listeners.print(output, "\nListeners", none);
    report_distributor(counters.get(), output);
}

} // namespace bt::client
