// The queue of one process number: a bounded ring of messages in shared memory, many senders, one owner.
#pragma once

#include "object.h"

#include <pthread.h>

namespace bt::platform {

constexpr uint32_t kQueueCapacity = 256;
constexpr uint32_t kMessageMin = 16;
constexpr uint32_t kMessageMax = 1024;

struct Slot {
    uint32_t size;
    uint8_t message[kMessageMax];
    uint8_t gap[60];
};
static_assert(sizeof(Slot) % 64 == 0, "slots do not share cache lines");

// Senders write what stands behind the lock, the owner what stands behind `head`; neither waits for the other. Both
// move on only after their copy is done, so whoever dies in between leaves the ring as it was.
struct Ring {
    Stamp stamp;
    uint32_t pno;
    std::atomic<uint32_t> owned; // 1 from claim to release; stays 1 when the owner dies, messages wait for the next

    alignas(64) pthread_mutex_t lock; // among senders
    std::atomic<uint32_t> tail;
    uint64_t posted;
    uint64_t refused;

    alignas(64) std::atomic<uint32_t> head;

    alignas(64) std::atomic<uint32_t> bell;
    std::atomic<uint32_t> sleepers;

    alignas(64) Slot slots[kQueueCapacity];
};

bool make_ring(Ring& ring, uint32_t pno);

// Opens the ring for a new owner. Messages that wait are kept, or dropped when `fresh`.
void open_ring(Ring& ring, bool fresh);

// Closes it for senders, drops what waits and wakes whoever sleeps on it.
void close_ring(Ring& ring);

// The results are those of _sys_SndMsg().
int32_t post(Ring& ring, uint32_t size, const void* message);

uint32_t waiting(const Ring& ring);

// Takes the oldest message, cut to `size` and padded with zeros up to it. Only the owner calls it, one thread at a
// time. False when none waits.
bool take(Ring& ring, void* buffer, uint32_t size);

enum class Slept { message, late, by_signal };

// Waits until a message may be there, at most `ns`.
Slept sleep_on(Ring& ring, uint64_t ns);

struct RingCounts {
    uint32_t queued;
    uint64_t posted;
    uint64_t refused;
};
RingCounts counts(Ring& ring);

} // namespace bt::platform
