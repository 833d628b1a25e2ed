#include "queues.h"

#include "entries.h"
#include "error.h"

namespace bt::platform {
namespace {

// Open addressing on the number; twice as many places as a domain has objects, so a search always ends.
constexpr uint32_t kPlaces = 2 * kEntryCount;
std::atomic<Ring*> g_rings[kPlaces];

Ring* known_queue(uint32_t pno)
{
    for (uint32_t step = 0; step < kPlaces; ++step) {
        Ring* const ring = g_rings[(pno + step) % kPlaces].load(std::memory_order_acquire);
        if (ring == nullptr || ring->pno == pno) return ring;
    }
    return nullptr;
}

Ring* remember(uint32_t pno, Object& object)
{
    close_descriptor(object);
    auto* const ring = static_cast<Ring*>(static_cast<void*>(object.stamp));
    for (uint32_t step = 0; step < kPlaces; ++step) {
        std::atomic<Ring*>& place = g_rings[(pno + step) % kPlaces];
        if (place.load(std::memory_order_relaxed) != nullptr) continue;
        place.store(ring, std::memory_order_release);
        break;
    }
    return ring;
}

Ring* open_queue(DomainArea& area, uint32_t pno, int32_t* result)
{
    *result = -1;
    const EntriesLock entries(area);
    if (!entries.held()) return nullptr;

    Entry* const entry = find_entry(area, Kind::queue, pno, "");
    Object object;
    const Opening opening =
        entry == nullptr ? Opening::absent : open_object(entry_object(*entry), Kind::queue, sizeof(Ring), &object);
    if (opening == Opening::done) return remember(pno, object);
    if (opening != Opening::refused) {
        *result =
            fail(1, "nobody owns process number 0x%X in domain \"%s\"; is its process running?", pno, domain_name());
    }
    return nullptr;
}

} // namespace

Ring* find_queue(uint32_t pno, int32_t* result)
{
    *result = -1;
    if (domain() == nullptr) return nullptr;
    if (Ring* const ring = known_queue(pno)) return ring;

    const ProcessLock lock;
    DomainArea* const area = domain_locked();
    if (area == nullptr) return nullptr;
    Ring* const ring = known_queue(pno);
    return ring != nullptr ? ring : open_queue(*area, pno, result);
}

Ring* obtain_queue(DomainArea& area, uint32_t pno)
{
    if (Ring* const ring = known_queue(pno)) return ring;

    const EntriesLock entries(area);
    Object object;
    if (!entries.held()) return nullptr;
    switch (obtain_object(area, Kind::queue, pno, "", sizeof(Ring), &object)) {
    case Obtained::existing:
        return remember(pno, object);
    case Obtained::failed:
        return nullptr;
    case Obtained::created:
        break;
    }
    if (!make_ring(*static_cast<Ring*>(static_cast<void*>(object.stamp)), pno)) {
        discard(object);
        fail(-1, "the system has no robust mutexes between processes");
        return nullptr;
    }
    publish(object);
    return remember(pno, object);
}

void forget_queues()
{
    for (std::atomic<Ring*>& ring : g_rings)
        ring.store(nullptr, std::memory_order_release);
}

} // namespace bt::platform
