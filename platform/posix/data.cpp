// Named shared data.
#include "entries.h"
#include "error.h"

#include <bt_platform/host.h>

#include <cstdio>
#include <cstring>

namespace bt::platform {
namespace {

constexpr uint32_t kDataMax = INT32_MAX - sizeof(Stamp);

struct Linked {
    char name[kNameSize];
    Stamp* stamp;
    uint32_t size;
};

// What the process has linked; under the process lock. A mapping is never taken back, since its address was handed out.
Linked g_linked[kEntryCount];
uint32_t g_linked_count = 0;
DomainArea* g_linked_in = nullptr;

Linked* find_linked(DomainArea& area, const char* name)
{
    if (g_linked_in != &area) {
        g_linked_in = &area;
        g_linked_count = 0;
    }
    for (uint32_t at = 0; at < g_linked_count; ++at) {
        if (std::strcmp(g_linked[at].name, name) == 0) return &g_linked[at];
    }
    return nullptr;
}

Linked* keep(Linked* at, const char* name, Object& object)
{
    close_descriptor(object);
    if (at == nullptr) at = &g_linked[g_linked_count++];
    std::snprintf(at->name, sizeof at->name, "%s", name);
    at->stamp = object.stamp;
    at->size = object.size - static_cast<uint32_t>(sizeof(Stamp));
    return at;
}

int32_t fail_absent(const char* name)
{
    return fail(1, "there is no shared data \"%s\" in domain \"%s\"; is its owner running?", name, domain_name());
}

Linked* link(DomainArea& area, const char* name, int32_t* result)
{
    Linked* const known = find_linked(area, name);
    if (known != nullptr && known->stamp->retired.load() == 0) return known;

    *result = -1;
    const EntriesLock entries(area);
    if (!entries.held()) return nullptr;
    if (known == nullptr && g_linked_count == kEntryCount) {
        fail(-1, "the process has linked %u shared data already", kEntryCount);
        return nullptr;
    }
    Entry* const entry = find_entry(area, Kind::data, 0, name);
    Object object;
    const Opening opening =
        entry == nullptr ? Opening::absent : open_object(entry_object(*entry), Kind::data, 0, &object);
    if (opening == Opening::done) return keep(known, name, object);
    if (opening != Opening::refused) *result = fail_absent(name);
    return nullptr;
}

} // namespace
} // namespace bt::platform

using namespace bt::platform;

int32_t _sys_LinkShareData(const char* name, void** address, uint32_t* size)
{
    if (address == nullptr) return fail(-1, "shared data is linked without a place for its address");
    *address = nullptr;
    if (!check_name(name)) return -1;

    const ProcessLock lock;
    DomainArea* const area = domain_locked();
    if (area == nullptr) return -1;
    int32_t result = 0;
    const Linked* const linked = link(*area, name, &result);
    if (linked == nullptr) return result;
    if (size != nullptr && *size > linked->size) {
        return fail(2, "shared data \"%s\" has %u bytes, %u are needed; its owner is of another version", name,
                    linked->size, *size);
    }
    *address = linked->stamp + 1;
    if (size != nullptr) *size = linked->size;
    return 0;
}

int32_t bt_host_create_data(const char* name, uint32_t size)
{
    if (!check_name(name)) return -1;
    if (size == 0 || size > kDataMax) return fail(-1, "shared data \"%s\" cannot have %u bytes", name, size);

    const ProcessLock lock;
    DomainArea* const area = domain_locked();
    if (area == nullptr) return -1;
    const EntriesLock entries(*area);
    if (!entries.held()) return -1;

    Object object;
    const auto whole = static_cast<uint32_t>(size + sizeof(Stamp));
    const Obtained obtained = obtain_object(*area, Kind::data, 0, name, whole, &object);
    if (obtained == Obtained::failed) return -1;
    if (obtained == Obtained::created) publish(object);
    discard(object);
    return obtained == Obtained::created ? 0 : 1;
}

int32_t bt_host_remove_data(const char* name)
{
    if (!check_name(name)) return -1;

    const ProcessLock lock;
    DomainArea* const area = domain_locked();
    if (area == nullptr) return -1;
    const EntriesLock entries(*area);
    if (!entries.held()) return -1;
    Entry* const entry = find_entry(*area, Kind::data, 0, name);
    if (entry == nullptr) {
        fail_absent(name);
        return -1;
    }

    Object object;
    const ObjectName full_name = entry_object(*entry);
    if (open_object(full_name, Kind::data, 0, &object) == Opening::done) {
        object.stamp->retired.store(1);
        discard(object);
    }
    if (!remove_object(full_name)) return -1;
    entry->kind = 0;
    return 0;
}
