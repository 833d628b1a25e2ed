// What a receiver sleeps on: a counter in shared memory that rings when it changes.
#pragma once

#include <atomic>
#include <cstdint>

namespace bt::platform {

enum class Woken { rung_or_late, by_signal };

// Sleeps while the bell still reads `seen`, at most `ns`. May return early without a reason.
Woken wait_for_bell(const std::atomic<uint32_t>& bell, uint32_t seen, uint64_t ns);

// Changes the bell and wakes everybody who waits for it.
void ring_bell(std::atomic<uint32_t>& bell);

} // namespace bt::platform
