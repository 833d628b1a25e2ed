// Words of a command line as values. Each throws Failure(kUsage) that names the word and what is expected.
#pragma once

#include <cstdint>
#include <string>
#include <vector>

namespace bt::client {

// Decimal, or hexadecimal behind 0x, within the limits.
int64_t parse_integer(const std::string& word, int64_t least, int64_t most);

// AA:BB:CC:DD:EE:FF
std::vector<uint8_t> parse_address(const std::string& word);

// Hexadecimal digits in pairs, colons and blanks between them allowed; or "text:" and the bytes as characters.
std::vector<uint8_t> parse_bytes(const std::string& word, size_t most);

// Numbers separated by commas.
std::vector<std::string> split_list(const std::string& word);

} // namespace bt::client
