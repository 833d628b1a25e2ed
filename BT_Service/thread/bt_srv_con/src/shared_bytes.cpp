#include "thread/bt_srv_con/src/shared_bytes.h"

#include <algorithm>
#include <cstdint>
#include <cstring>

namespace bt::con {
namespace {

using Byte = uint8_t;
using Word = uint32_t;
using Native = uintptr_t;

template <class Unit, class Visit>
bool visit_units(size_t& at, size_t end, const Visit& visit)
{
    for (; at + sizeof(Unit) <= end; at += sizeof(Unit))
        if (!visit(Unit{}, at)) return false;
    return true;
}

template <class Unit>
size_t bytes_to_aligned(const void* shared)
{
    return (0 - reinterpret_cast<uintptr_t>(shared)) % sizeof(Unit);
}

// Visits `size` bytes in the widest units their alignment allows, until a visit says stop.
template <class Visit>
bool visit_all(const void* shared, size_t size, const Visit& visit)
{
    size_t at = 0;
    return visit_units<Byte>(at, std::min(size, bytes_to_aligned<Word>(shared)), visit) &&
           visit_units<Word>(at, std::min(size, bytes_to_aligned<Native>(shared)), visit) &&
           visit_units<Native>(at, size, visit) && visit_units<Word>(at, size, visit) &&
           visit_units<Byte>(at, size, visit);
}

template <class Unit>
Unit load_unit(const void* shared, size_t at)
{
    using Aliased [[gnu::may_alias]] = Unit;
    const void* const place = static_cast<const uint8_t*>(shared) + at;
    return __atomic_load_n(static_cast<const Aliased*>(place), __ATOMIC_RELAXED);
}

template <class Unit>
void store_unit(void* shared, size_t at, Unit value)
{
    using Aliased [[gnu::may_alias]] = Unit;
    void* const place = static_cast<uint8_t*>(shared) + at;
    __atomic_store_n(static_cast<Aliased*>(place), value, __ATOMIC_RELAXED);
}

} // namespace

void load_held(void* to, const void* shared, size_t size)
{
    std::memcpy(to, shared, size);
}

void load(void* to, const void* shared, size_t size)
{
    visit_all(shared, size, [=](auto unit, size_t at) {
        unit = load_unit<decltype(unit)>(shared, at);
        std::memcpy(static_cast<uint8_t*>(to) + at, &unit, sizeof unit);
        return true;
    });
}

void store(void* shared, const void* from, size_t size)
{
    visit_all(shared, size, [=](auto unit, size_t at) {
        std::memcpy(&unit, static_cast<const uint8_t*>(from) + at, sizeof unit);
        store_unit(shared, at, unit);
        return true;
    });
}

bool holds(const void* shared, const void* bytes, size_t size)
{
    return visit_all(shared, size, [=](auto unit, size_t at) {
        std::memcpy(&unit, static_cast<const uint8_t*>(bytes) + at, sizeof unit);
        return load_unit<decltype(unit)>(shared, at) == unit;
    });
}

} // namespace bt::con
