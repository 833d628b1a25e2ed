// What went wrong, kept per thread for bt_host_error().
#pragma once

#include <cstdint>

namespace bt::platform {

// Keeps the text for the calling thread and returns `result`, so that a failing path is one statement. The text names
// the object, says what is wrong with it and how to mend it.
int32_t fail(int32_t result, const char* format, ...) __attribute__((format(printf, 2, 3)));

const char* last_error();

} // namespace bt::platform
