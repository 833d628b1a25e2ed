// Copies to and from memory that other processes and threads write at the same moment.
#pragma once

#include <cstddef>

namespace bt::con {

// All of these access each shared byte once, and callers go on with their copy only. They stay functions of their own,
// so that no compiler can read the shared bytes again in place of the copy.

// For a caller that holds the lock all writers hold.
void load_held(void* to, const void* shared, size_t size);

// Without it. Relaxed atomics, an aligned 32-bit word as a whole: a copy may mix old and new words, no word is torn.
void load(void* to, const void* shared, size_t size);
void store(void* shared, const void* from, size_t size);

// True when the shared bytes equal `bytes`.
bool holds(const void* shared, const void* bytes, size_t size);

} // namespace bt::con
