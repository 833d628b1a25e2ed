#include "btsvc/words.h"

#include "btsvc/failure.h"

#include <fmt/format.h>

#include <charconv>

namespace bt::client {
namespace {

constexpr size_t kAddressSize = 6;

int hex_digit(char c)
{
    if (c >= '0' && c <= '9') return c - '0';
    if (c >= 'a' && c <= 'f') return c - 'a' + 10;
    if (c >= 'A' && c <= 'F') return c - 'A' + 10;
    return -1;
}

// Pairs of digits; false for anything else.
bool read_pairs(const std::string& word, std::vector<uint8_t>& bytes)
{
    for (size_t i = 0; i < word.size();) {
        if (i != 0 && (word[i] == ':' || word[i] == ' ')) ++i;
        if (i + 2 > word.size()) return false;
        const int high = hex_digit(word[i]);
        const int low = hex_digit(word[i + 1]);
        if (high < 0 || low < 0) return false;
        bytes.push_back(static_cast<uint8_t>(high << 4 | low));
        i += 2;
    }
    return true;
}

} // namespace

int64_t parse_integer(const std::string& word, int64_t least, int64_t most)
{
    const bool negative = !word.empty() && word[0] == '-';
    const size_t sign = negative ? 1 : 0;
    const bool hex = word.compare(sign, 2, "0x") == 0 || word.compare(sign, 2, "0X") == 0;
    const char* const first = word.data() + sign + (hex ? 2 : 0);
    const char* const end = word.data() + word.size();

    uint32_t magnitude = 0;
    const auto [stop, error] = std::from_chars(first, end, magnitude, hex ? 16 : 10);
    const int64_t value = negative ? -int64_t{magnitude} : int64_t{magnitude};
    if (error != std::errc() || stop != end || value < least || value > most)
        throw Failure(kUsage, fmt::format("\"{}\": a number {}..{} is expected, decimal or 0x...", word, least, most));
    return value;
}

std::vector<uint8_t> parse_address(const std::string& word)
{
    std::vector<uint8_t> bytes;
    if (word.size() != 3 * kAddressSize - 1 || !read_pairs(word, bytes) || bytes.size() != kAddressSize)
        throw Failure(kUsage, fmt::format("\"{}\": a device address AA:BB:CC:DD:EE:FF is expected", word));
    return bytes;
}

std::vector<uint8_t> parse_bytes(const std::string& word, size_t most)
{
    constexpr const char* kTextMark = "text:";
    const bool is_text = word.rfind(kTextMark, 0) == 0;

    std::vector<uint8_t> bytes;
    if (is_text) bytes.assign(word.begin() + 5, word.end());
    if (!is_text && !read_pairs(word, bytes))
        throw Failure(kUsage, fmt::format("\"{}\": pairs of hexadecimal digits, or text:..., are expected", word));
    if (bytes.size() > most)
        throw Failure(kUsage, fmt::format("\"{}\": {} bytes, at most {} are taken", word, bytes.size(), most));
    return bytes;
}

std::vector<std::string> split_list(const std::string& word)
{
    std::vector<std::string> items(1);
    for (const char c : word) {
        if (c == ',')
            items.emplace_back();
        else
            items.back() += c;
    }
    return items;
}

} // namespace bt::client
