// What the result word of an answer says, in words.
#pragma once

#include <cstdint>

namespace bt::catalogue {

// The words for a BtSimResult; "unknown result" for any other value.
const char* result_text(uint32_t result);

} // namespace bt::catalogue
