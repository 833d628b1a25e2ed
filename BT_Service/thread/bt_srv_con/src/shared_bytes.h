// Copies to and from memory that other processes and threads write at the same moment.
#pragma once

#include <cstddef>

namespace bt::con {

// Each shared byte is accessed exactly once and an aligned 32-bit word as a whole, with relaxed atomics: a copy made
// without the area's lock may mix old and new words, but it is a copy, and nothing reads behind it again.
void load(void* to, const void* shared, size_t size);
void store(void* shared, const void* from, size_t size);

// True when the shared bytes equal `bytes`.
bool holds(const void* shared, const void* bytes, size_t size);

} // namespace bt::con
