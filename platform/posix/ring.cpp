#include "ring.h"

#include "clock.h"
#include "doorbell.h"
#include "error.h"
#include "robust_mutex.h"

#include <algorithm>
#include <cstring>

namespace bt::platform {
namespace {

constexpr uint32_t kLockWaitMs = 250;

// A sender can die between its message and the ring, so nobody sleeps longer than this without looking.
constexpr uint64_t kLongestSleepNs = 100 * kMillisecond;

int32_t store(Ring& ring, uint32_t size, const void* message)
{
    if (ring.owned.load(std::memory_order_relaxed) == 0) return fail(1, "nobody owns process number 0x%X", ring.pno);

    const uint32_t tail = ring.tail.load(std::memory_order_relaxed);
    if (tail - ring.head.load(std::memory_order_acquire) >= kQueueCapacity) {
        ++ring.refused;
        return fail(2, "the queue of process number 0x%X is full (%u messages); its owner does not receive", ring.pno,
                    kQueueCapacity);
    }

    Slot& slot = ring.slots[tail % kQueueCapacity];
    slot.size = size;
    std::memcpy(slot.message, message, size);
    ring.tail.store(tail + 1); // sequentially consistent with `sleepers`: see sleep_on()
    ++ring.posted;
    return 0;
}

} // namespace

bool make_ring(Ring& ring, uint32_t pno)
{
    ring.pno = pno;
    return make_mutex(&ring.lock, Priority::plain);
}

void open_ring(Ring& ring, bool fresh)
{
    const bool held = is_held(lock_within(&ring.lock, kLockWaitMs));
    ring.sleepers.store(0);
    if (fresh || waiting(ring) == 0) ring.head.store(ring.tail.load());
    ring.owned.store(1);
    if (held) unlock(&ring.lock);
}

void close_ring(Ring& ring)
{
    const bool held = is_held(lock_within(&ring.lock, kLockWaitMs));
    ring.owned.store(0);
    ring.head.store(ring.tail.load());
    if (held) unlock(&ring.lock);
    ring_bell(ring.bell);
}

int32_t post(Ring& ring, uint32_t size, const void* message)
{
    const Locked locked = lock_within(&ring.lock, kLockWaitMs);
    if (locked == Locked::not_in_time)
        return fail(4, "the queue of process number 0x%X is held by another sender (stopped in a debugger?)", ring.pno);
    if (!is_held(locked))
        return fail(-1, "the queue of process number 0x%X is damaged; remove the domain and create it again", ring.pno);

    const int32_t result = store(ring, size, message);
    unlock(&ring.lock);
    if (result == 0 && ring.sleepers.load() != 0) ring_bell(ring.bell);
    return result;
}

uint32_t waiting(const Ring& ring)
{
    const uint32_t head = ring.head.load(std::memory_order_relaxed);
    const uint32_t count = ring.tail.load() - head;
    return count <= kQueueCapacity ? count : 0;
}

bool take(Ring& ring, void* buffer, uint32_t size)
{
    const uint32_t head = ring.head.load(std::memory_order_relaxed);
    const uint32_t tail = ring.tail.load(std::memory_order_acquire);
    if (tail == head) return false;
    if (tail - head > kQueueCapacity) {
        ring.head.store(tail, std::memory_order_release); // no state the ring can get into by itself
        return false;
    }

    const Slot& slot = ring.slots[head % kQueueCapacity];
    const uint32_t stored = std::clamp(slot.size, kMessageMin, kMessageMax);
    const uint32_t copied = std::min(stored, size);
    std::memcpy(buffer, slot.message, copied);
    std::memset(static_cast<uint8_t*>(buffer) + copied, 0, size - copied);
    ring.head.store(head + 1, std::memory_order_release);
    return true;
}

Slept sleep_on(Ring& ring, uint64_t ns)
{
    // The sender stores its message, then looks for sleepers; the receiver makes itself known, then looks for a message.
    // One of the two sees the other. The bell is read before the look, so that a ring after it ends the wait at once.
    ring.sleepers.fetch_add(1);
    const uint32_t seen = ring.bell.load();
    Woken woken = Woken::rung_or_late;
    if (waiting(ring) == 0) woken = wait_for_bell(ring.bell, seen, std::min(ns, kLongestSleepNs));
    ring.sleepers.fetch_sub(1);

    if (waiting(ring) != 0) return Slept::message;
    return woken == Woken::by_signal ? Slept::by_signal : Slept::late;
}

RingCounts counts(Ring& ring)
{
    RingCounts out{waiting(ring), 0, 0};
    if (!is_held(lock_within(&ring.lock, kLockWaitMs))) return out;
    out.posted = ring.posted;
    out.refused = ring.refused;
    unlock(&ring.lock);
    return out;
}

} // namespace bt::platform
