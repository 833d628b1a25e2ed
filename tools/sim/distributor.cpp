#include "sim/distributor.h"

#include "sim/listener_table.h"
#include "sim/service_process.h"
#include "sim/shared_areas.h"
#include "sim/unit_records.h"

#include <bt_platform/host.h>
#include <fmt/format.h>

#include <vector>

namespace bt::sim {

namespace {

constexpr int32_t kNobodyOwnsNumber = 1;
constexpr int32_t kQueueFull = 2;
// A process that restarts quickly keeps its registration; one that stays away this long loses it.
constexpr uint32_t kFailuresUntilDeregistered = 8;

BtSimDistributor& link_counts()
{
    void* address = nullptr;
    uint32_t size = sizeof(BtSimDistributor);
    if (_sys_LinkShareData(kDistributorDataName, &address, &size) != 0)
        throw UnitError(fmt::format("shared data {}: {}", kDistributorDataName, bt_host_error()));
    return *static_cast<BtSimDistributor*>(address);
}

bool has_live_owner(uint32_t pno)
{
    std::vector<BtHostQueue> queues(4096);
    const int32_t count = bt_host_list_queues(queues.data(), static_cast<int32_t>(queues.size()));
    for (int32_t i = 0; i < count; ++i)
        if (queues[static_cast<size_t>(i)].pno == pno) return queues[static_cast<size_t>(i)].owner_pid != 0;
    return false;
}

class Distributor {
public:
    void deliver(const BtMessage& event)
    {
        table_.refresh();
        ++counts_.events;
        const uint32_t event_id = event.msg_header.hdr.cid;
        bool wanted = false;
        // Listeners that took their last event come first, so that a broken one never stands in their way.
        for (const bool failing : {false, true}) {
            for (uint32_t i = 0; i < ListenerTable::kEntries; ++i) {
                if (!table_.wants(i, event_id)) continue;
                follow_entry(i);
                if ((counts_.listeners[i].failed_in_a_row != 0) != failing || served_[i] == counts_.events) continue;
                served_[i] = counts_.events;
                wanted = true;
                post(i, event);
            }
        }
        if (!wanted) ++counts_.unwanted;
    }

private:
    // An entry of the table may hold another registration than before.
    void follow_entry(uint32_t index)
    {
        BtSimListenerCount& count = counts_.listeners[index];
        if (count.handle == table_.entry(index).handle) return;
        count = {};
        count.handle = table_.entry(index).handle;
        count.pno = table_.entry(index).pno;
    }

    void post(uint32_t index, const BtMessage& event)
    {
        BtSimListenerCount& count = counts_.listeners[index];
        const uint32_t size = BT_MESSAGE_HEADER_SIZE + event.msg_header.hdr.len;
        // An event handed back to this process would circle for ever.
        const uint16_t pno = table_.entry(index).pno;
        const int32_t sent = pno == PNO_BT_EDS ? -1 : _sys_SndMsg(pno, size, &event, 0);
        if (sent == 0) {
            ++count.delivered;
            count.failed_in_a_row = 0;
            return;
        }
        ++(sent == kNobodyOwnsNumber ? count.gone : sent == kQueueFull ? count.full : count.failed);
        if (++count.failed_in_a_row % kFailuresUntilDeregistered == 0 && !has_live_owner(pno)) {
            BT_SRV_EvtSrv_deregist(table_.entry(index).handle);
            ++counts_.deregistered;
        }
    }

    ListenerTable table_;
    BtSimDistributor& counts_ = link_counts();
    uint32_t served_[ListenerTable::kEntries] = {}; // the number of the event last posted to the entry
};

} // namespace

void run_distributor(const Scenario&)
{
    Distributor distributor;
    report_ready();
    BtMessage event;
    while (next_message(event))
        distributor.deliver(event);
}

} // namespace bt::sim
