// Lists what the domain holds.
#include "entries.h"
#include "error.h"
#include "number.h"
#include "queues.h"

#include <bt_platform/host.h>

#include <csignal>
#include <cstring>

namespace bt::platform {
namespace {

static_assert(kNameSize == BT_HOST_NAME_MAX, "names are copied whole");

// The queues are looked at after the list is read, since finding a ring takes the lock of the entries itself.
int32_t numbers_of_queues(uint32_t (&out)[kEntryCount])
{
    const ProcessLock lock;
    DomainArea* const area = domain_locked();
    if (area == nullptr) return -1;
    const EntriesLock entries(*area);
    if (!entries.held()) return -1;

    int32_t count = 0;
    for (const Entry& entry : area->entries) {
        if (entry.kind == static_cast<uint32_t>(Kind::queue)) out[count++] = entry.pno;
    }
    return count;
}

bool describe(uint32_t pno, BtHostQueue* out)
{
    int32_t result = 0;
    Ring* const ring = find_queue(pno, &result);
    if (ring == nullptr || ring->owned.load() == 0) return false;

    const RingCounts numbers = counts(*ring);
    const ProcessLock lock;
    *out = BtHostQueue{pno, owner_of(pno), numbers.queued, kQueueCapacity, numbers.posted, numbers.refused};
    return true;
}

uint32_t living(uint32_t pid)
{
    return pid != 0 && kill(static_cast<pid_t>(pid), 0) == 0 ? pid : 0;
}

void describe(const LockSlot& slot, BtHostLock* out)
{
    copy_name(out->name, slot.name);
    out->holder_pid = living(slot.holder_pid.load());
    out->recovered = slot.recovered.load();
}

// Calls `describe(area)` with the domain's lists held still.
template <class Describe>
int32_t list(Describe describe_all)
{
    const ProcessLock lock;
    DomainArea* const area = domain_locked();
    if (area == nullptr) return -1;
    const EntriesLock entries(*area);
    return entries.held() ? describe_all(*area) : -1;
}

} // namespace
} // namespace bt::platform

using namespace bt::platform;

int32_t bt_host_list_queues(BtHostQueue* out, int32_t maximum)
{
    uint32_t numbers[kEntryCount];
    const int32_t known = numbers_of_queues(numbers);
    if (known < 0) return -1;

    int32_t count = 0;
    for (int32_t at = 0; at < known && count < maximum; ++at) {
        if (describe(numbers[at], &out[count])) ++count;
    }
    return count;
}

int32_t bt_host_list_locks(BtHostLock* out, int32_t maximum)
{
    return list([out, maximum](const DomainArea& area) {
        int32_t count = 0;
        for (const LockSlot& slot : area.locks) {
            if (slot.used == 1 && count < maximum) describe(slot, &out[count++]);
        }
        return count;
    });
}

int32_t bt_host_list_data(BtHostData* out, int32_t maximum)
{
    return list([out, maximum](const DomainArea& area) {
        int32_t count = 0;
        for (const Entry& entry : area.entries) {
            if (entry.kind != static_cast<uint32_t>(Kind::data) || count >= maximum) continue;
            Object object;
            if (open_object(entry_object(entry), Kind::data, 0, &object) != Opening::done) continue;
            copy_name(out[count].name, entry.name);
            out[count++].size = object.size - static_cast<uint32_t>(sizeof(Stamp));
            discard(object);
        }
        return count;
    });
}
