#include "entries.h"

#include "error.h"
#include "robust_mutex.h"

#include <cstdio>
#include <cstring>

namespace bt::platform {
namespace {

constexpr uint32_t kEntriesWaitMs = 2000;

Entry* add_entry(DomainArea& area, Kind kind, uint32_t pno, const char* name)
{
    for (Entry& entry : area.entries) {
        if (entry.kind != 0) continue;
        entry.pno = pno;
        std::snprintf(entry.name, sizeof entry.name, "%s", name);
        std::atomic_signal_fence(std::memory_order_release); // killed before the next line, the entry is still free
        entry.kind = static_cast<uint32_t>(kind);
        return &entry;
    }
    fail(-1, "domain \"%s\" is full (%u queues and data)", domain_name(), kEntryCount);
    return nullptr;
}

Obtained create_for(Entry& entry, Kind kind, uint32_t size, Object* object)
{
    const ObjectName name = entry_object(entry);
    const Opening opening = create_object(name, kind, size, object);
    if (opening == Opening::done) return Obtained::created;

    entry.kind = 0;
    if (opening == Opening::absent) fail(-1, "shared memory object %s was made by somebody else just now", name.text);
    return Obtained::failed;
}

} // namespace

EntriesLock::EntriesLock(DomainArea& area) : area_(area), held_(is_held(lock_within(&area.lock, kEntriesWaitMs)))
{
    if (!held_) {
        fail(-1, "domain \"%s\" is locked by a process that does not go on (stopped in a debugger?)", domain_name());
    } else if (area_.stamp.retired.load() != 0) {
        fail(-1, "domain \"%s\" was removed", domain_name());
        unlock(&area_.lock);
        held_ = false;
    }
}

EntriesLock::~EntriesLock()
{
    if (held_) unlock(&area_.lock);
}

Entry* find_entry(DomainArea& area, Kind kind, uint32_t pno, const char* name)
{
    for (Entry& entry : area.entries) {
        if (entry.kind != static_cast<uint32_t>(kind) || entry.pno != pno) continue;
        if (std::strncmp(entry.name, name, kNameSize) == 0) return &entry;
    }
    return nullptr;
}

ObjectName entry_object(const Entry& entry)
{
    if (entry.kind == static_cast<uint32_t>(Kind::queue)) {
        char number[16];
        std::snprintf(number, sizeof number, "%04X", entry.pno);
        return object_name(domain_name(), Kind::queue, number);
    }
    char name[kNameSize];
    copy_name(name, entry.name);
    return object_name(domain_name(), Kind::data, name);
}

// Whoever makes an object holds the entries' lock until it is ready. So what is not ready, or has no entry yet, was left
// behind by a process that died, and is made anew.
Obtained obtain_object(DomainArea& area, Kind kind, uint32_t pno, const char* name, uint32_t size, Object* object)
{
    Entry* entry = find_entry(area, kind, pno, name);
    const bool listed = entry != nullptr;
    if (!listed) entry = add_entry(area, kind, pno, name);
    if (entry == nullptr) return Obtained::failed;

    const ObjectName full_name = entry_object(*entry);
    const Opening opening = open_object(full_name, kind, listed ? size : 0, object);
    if (opening == Opening::done && listed) return Obtained::existing;
    if (opening == Opening::done) discard(*object);
    if (opening == Opening::refused || (opening != Opening::absent && !remove_object(full_name))) {
        if (!listed) entry->kind = 0;
        return Obtained::failed;
    }
    return create_for(*entry, kind, size, object);
}

void copy_name(char (&to)[kNameSize], const char (&from)[kNameSize])
{
    std::memcpy(to, from, kNameSize);
    to[kNameSize - 1] = '\0';
}

bool check_name(const char* name)
{
    if (name != nullptr && name[0] != '\0' && std::strlen(name) < kNameSize) return true;
    fail(-1, "a name must have 1 to %u characters, not \"%.80s\"", kNameSize - 1, name == nullptr ? "" : name);
    return false;
}

} // namespace bt::platform
