#include "sim/listener_table.h"

#include "sim/shared_areas.h"

#include <bt_platform/host.h>
#include <fmt/format.h>

#include <algorithm>
#include <cstring>

namespace bt::sim {

ListenerTable::ListenerTable() : lock_(_sys_CreateSemaphore("BT_SRV_EDS_SEM_NAME"))
{
    void* address = nullptr;
    uint32_t size = sizeof(BtEvtListenerTable);
    if (lock_ == 0 || _sys_LinkShareData("/tmp/shm_eds_regist_table", &address, &size) != 0)
        throw UnitError(fmt::format("listener table: {}", bt_host_error()));
    shared_ = static_cast<const BtEvtListenerTable*>(address);
}

void ListenerTable::refresh()
{
    if (_sys_SemLock(lock_) != 0) return;
    std::memcpy(&copy_, shared_, sizeof copy_);
    _sys_SemUnlock(lock_);
}

bool ListenerTable::wants(uint32_t index, uint32_t event_id) const
{
    const BtEvtListener& listener = copy_.entries[index];
    if (listener.handle == 0 || listener.active != 1) return false;
    const uint32_t count = std::min<uint32_t>(listener.event_count, BT_EVT_IDS_MAX);
    return std::find(listener.event_ids, listener.event_ids + count, event_id) != listener.event_ids + count;
}

} // namespace bt::sim
