// Registration of event listeners: the application's side of event distribution.
#include "thread/bt_srv_eds/src/listener_table.h"

#include <bt_service/bt_events.h>

#include <algorithm>
#include <atomic>
#include <cstring>

namespace bt::eds {
namespace {

constexpr uint32_t kCountMax = 0x7FFFFFFF;
constexpr uint32_t kFreeEntry = 0;
constexpr uint32_t kNotRegistered = 0;

TableLock g_registration_lock;
std::atomic<BtEvtListenerTable*> g_table{nullptr}; // as linked last

BtEvtListenerTable* linked_table()
{
    BtEvtListenerTable* const table = link_table();
    g_table.store(table);
    return table;
}

// Requires the lock.
uint32_t add_listener(uint32_t pno, uint32_t tag, uint32_t count, const uint32_t* event_ids)
{
    BtEvtListenerTable* const table = linked_table();
    if (table == nullptr) return kNotRegistered;
    const uint32_t handle = table->next_handle;
    if (handle == 0) return kNotRegistered;
    BtEvtListener* const entry = find_HdlList(kFreeEntry);
    if (entry == nullptr) return kNotRegistered;

    entry->handle = handle;
    entry->pno = static_cast<uint16_t>(pno);
    entry->tag = tag;
    entry->active = 1;
    entry->event_count = count;
    std::memcpy(entry->event_ids, event_ids, count * sizeof *event_ids);
    table->next_handle = handle + 1;
    return handle;
}

// Runs `change` on the listener under the lock, if there is such a listener.
template <class Change>
void change_listener(uint32_t handle, Change change)
{
    if (!g_registration_lock.create() || !g_registration_lock.take()) return;

    if (linked_table() != nullptr)
        if (BtEvtListener* const entry = find_HdlList(handle)) change(entry);
    g_registration_lock.release();
}

} // namespace
} // namespace bt::eds

using namespace bt::eds;

uint32_t BT_SRV_EvtSrv_regist(uint32_t pno, uint32_t tag, uint32_t count, const uint32_t* event_ids)
{
    if (event_ids == nullptr || count > kCountMax) return kNotRegistered;
    if (!g_registration_lock.create() || !g_registration_lock.take()) return kNotRegistered;

    const uint32_t handle = add_listener(pno, tag, std::min<uint32_t>(count, BT_EVT_IDS_MAX), event_ids);
    g_registration_lock.release();
    return handle;
}

void BT_SRV_EvtSrv_deregist(uint32_t handle)
{
    change_listener(handle, [](BtEvtListener* entry) { std::memset(entry, 0, sizeof *entry); });
}

void BT_SRV_EvtSrv_suspend(uint32_t handle)
{
    change_listener(handle, [](BtEvtListener* entry) { entry->active = 0; });
}

void BT_SRV_EvtSrv_resume(uint32_t handle)
{
    change_listener(handle, [](BtEvtListener* entry) { entry->active = 1; });
}

BtEvtListener* find_HdlList(uint32_t handle)
{
    BtEvtListenerTable* const table = g_table.load();
    if (table == nullptr) return nullptr;

    BtEvtListener* const end = table->entries + BT_EVT_LISTENERS_MAX;
    BtEvtListener* const found =
        std::find_if(table->entries, end, [handle](const BtEvtListener& entry) { return entry.handle == handle; });
    return found == end ? nullptr : found;
}
