// Named locks: slots of the domain object.
#include "entries.h"
#include "error.h"
#include "fork.h"
#include "robust_mutex.h"

#include <bt_platform/host.h>

#include <cstdio>
#include <cstring>

namespace bt::platform {
namespace {

constexpr uint32_t kLockWaitMs = 2000;

enum : int32_t { kUnknown = 1, kNotInTime = 2, kAlreadyHeld = 3, kNotHeld = 4, kUnusable = -1 };

// A handle is the place of a name, so it outlives the domain: the slot is looked up again when the domain is another.
struct Handle {
    char name[kNameSize];
    std::atomic<LockSlot*> slot;
};

Handle g_handles[kLockCount];
std::atomic<uint32_t> g_handle_count{0};

bool belongs_to(const LockSlot* slot, const DomainArea& area)
{
    return slot >= area.locks && slot < area.locks + kLockCount;
}

LockSlot* find_slot(DomainArea& area, const char* name)
{
    for (LockSlot& slot : area.locks) {
        if (slot.used == 1 && std::strncmp(slot.name, name, kNameSize) == 0) return &slot;
    }
    return nullptr;
}

LockSlot* make_slot(DomainArea& area, const char* name)
{
    for (LockSlot& slot : area.locks) {
        if (slot.used == 1) continue;
        std::snprintf(slot.name, sizeof slot.name, "%s", name);
        if (!make_mutex(&slot.mutex, Priority::inherited)) {
            fail(kUnusable, "the system has no robust mutexes between processes");
            return nullptr;
        }
        std::atomic_signal_fence(std::memory_order_release); // killed before the next line, the slot is still free
        slot.used = 1;
        return &slot;
    }
    fail(kUnusable, "domain \"%s\" has no place for lock \"%s\"; it holds %u", domain_name(), name, kLockCount);
    return nullptr;
}

LockSlot* obtain_slot(DomainArea& area, const char* name)
{
    const EntriesLock entries(area);
    if (!entries.held()) return nullptr;
    LockSlot* const slot = find_slot(area, name);
    return slot != nullptr ? slot : make_slot(area, name);
}

uint32_t handle_of(const char* name)
{
    const uint32_t count = g_handle_count.load();
    for (uint32_t at = 0; at < count; ++at) {
        if (std::strcmp(g_handles[at].name, name) == 0) return at + 1;
    }
    return 0;
}

Handle* known_handle(uint32_t handle)
{
    if (handle >= 1 && handle <= g_handle_count.load(std::memory_order_acquire)) return &g_handles[handle - 1];
    fail(kUnknown, "there is no lock with handle %u", handle);
    return nullptr;
}

LockSlot* slot_of(Handle& handle)
{
    DomainArea* const mapped = domain();
    if (mapped == nullptr) return nullptr;
    LockSlot* const known = handle.slot.load(std::memory_order_acquire);
    if (belongs_to(known, *mapped)) return known;

    const ProcessLock lock;
    DomainArea* const area = domain_locked();
    LockSlot* const slot = area == nullptr ? nullptr : obtain_slot(*area, handle.name);
    if (slot != nullptr) handle.slot.store(slot, std::memory_order_release);
    return slot;
}

// Tells threads of one process apart; together with the process's number, of all processes.
uint32_t this_thread()
{
    static thread_local char t_mark;
    return static_cast<uint32_t>(reinterpret_cast<uintptr_t>(&t_mark));
}

void note_holder(LockSlot& slot)
{
    slot.holder_thread.store(this_thread(), std::memory_order_relaxed);
    slot.holder_pid.store(own_pid(), std::memory_order_relaxed);
}

// False when the calling thread does not hold it. The mark goes before the release: afterwards the next holder may have
// written its own.
bool erase_holder(LockSlot& slot)
{
    if (slot.holder_pid.load(std::memory_order_relaxed) != own_pid()) return false;
    if (slot.holder_thread.load(std::memory_order_relaxed) != this_thread()) return false;
    slot.holder_thread.store(0, std::memory_order_relaxed);
    slot.holder_pid.store(0, std::memory_order_relaxed);
    return true;
}

} // namespace
} // namespace bt::platform

using namespace bt::platform;

uint32_t _sys_CreateSemaphore(const char* name)
{
    if (!check_name(name)) return 0;
    const ProcessLock lock;
    DomainArea* const area = domain_locked();
    if (area == nullptr) return 0;
    LockSlot* const slot = obtain_slot(*area, name);
    if (slot == nullptr) return 0;

    uint32_t handle = handle_of(name);
    if (handle == 0) {
        const uint32_t count = g_handle_count.load();
        if (count == kLockCount) return fail(0, "the process uses %u locks already", kLockCount), 0;
        std::snprintf(g_handles[count].name, sizeof g_handles[count].name, "%s", name);
        handle = count + 1;
    }
    g_handles[handle - 1].slot.store(slot, std::memory_order_release);
    if (handle > g_handle_count.load()) g_handle_count.store(handle, std::memory_order_release);
    return handle;
}

int32_t _sys_SemLock(uint32_t handle)
{
    Handle* const known = known_handle(handle);
    if (known == nullptr) return kUnknown;
    LockSlot* const slot = slot_of(*known);
    if (slot == nullptr) return kUnusable;

    switch (lock_within(&slot->mutex, kLockWaitMs)) {
    case Locked::from_the_dead:
        slot->recovered.fetch_add(1);
        break;
    case Locked::yes:
        break;
    case Locked::not_in_time:
        return fail(kNotInTime, "lock \"%s\" was not had in %u ms; process %u holds it", known->name, kLockWaitMs,
                    slot->holder_pid.load());
    case Locked::already_by_this_thread:
        return fail(kAlreadyHeld, "this thread holds lock \"%s\" already", known->name);
    case Locked::broken:
        return fail(kUnusable, "lock \"%s\" is damaged; remove the domain and create it again", known->name);
    }
    note_holder(*slot);
    return 0;
}

int32_t _sys_SemUnlock(uint32_t handle)
{
    Handle* const known = known_handle(handle);
    if (known == nullptr) return kUnknown;
    LockSlot* const slot = known->slot.load(std::memory_order_acquire);
    if (erase_holder(*slot) && unlock(&slot->mutex)) return 0;
    return fail(kNotHeld, "this thread does not hold lock \"%s\"", known->name);
}
