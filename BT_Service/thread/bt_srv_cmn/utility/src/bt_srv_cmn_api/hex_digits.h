// Bytes as two hex digits, high digit first.
#pragma once

#include <cstdint>

namespace bt::cmn {

constexpr char kLowerDigits[] = "0123456789abcdef";
constexpr char kUpperDigits[] = "0123456789ABCDEF";

// Writes two characters and returns the place behind them.
inline char* put_hex(char* at, uint8_t byte, const char* digits)
{
    *at++ = digits[byte >> 4];
    *at++ = digits[byte & 0x0F];
    return at;
}

} // namespace bt::cmn
