#include "btsvc/arguments.h"

#include "btsvc/failure.h"
#include "btsvc/words.h"

#include <bt_service/bt_message.h>

#include <fmt/format.h>

#include <limits>

namespace bt::client {
namespace {

using catalogue::Count;
using catalogue::Field;
using catalogue::Type;

struct Limits {
    int64_t least, most;
};

Limits limits_of(Type type)
{
    switch (type) {
    case Type::u8:
        return {0, std::numeric_limits<uint8_t>::max()};
    case Type::u16:
        return {0, std::numeric_limits<uint16_t>::max()};
    case Type::i32:
        return {std::numeric_limits<int32_t>::min(), std::numeric_limits<int32_t>::max()};
    default:
        return {0, std::numeric_limits<uint32_t>::max()};
    }
}

bool is_block(const Field& field)
{
    return field.type == Type::bytes || field.type == Type::text;
}
bool is_address(const Field& field)
{
    return field.type == Type::addr || field.type == Type::addr6;
}

size_t block_capacity(const Field& field)
{
    if (field.count.kind != Count::Kind::fixed) return BT_MESSAGE_PAYLOAD_MAX;
    return field.count.number * element_size(field.type);
}

std::vector<uint8_t> read_numbers(const Field& field, const std::string& word)
{
    const size_t size = element_size(field.type);
    std::vector<uint8_t> block;
    for (const std::string& item : split_list(word)) {
        const int64_t number = parse_integer(item, limits_of(field.type).least, limits_of(field.type).most);
        const auto* low_bytes = reinterpret_cast<const uint8_t*>(&number);
        block.insert(block.end(), low_bytes, low_bytes + size);
    }
    if (block.size() > block_capacity(field))
        throw Failure(kUsage, fmt::format("\"{}\": {} numbers, at most {} are taken", word, block.size() / size,
                                          block_capacity(field) / size));
    return block;
}

const char* expected_text(const Field& field)
{
    if (is_address(field)) return "AA:BB:CC:DD:EE:FF";
    if (is_block(field)) return "hex bytes or text:...";
    return field.repeated ? "numbers separated by commas" : "a number";
}

} // namespace

Arguments::Value Arguments::read(const Field& field, const std::string& word)
{
    const bool by_pointer = field.repeated || is_address(field);
    Value value;
    if (by_pointer && word == "null") {
        value.is_null = true;
        return value;
    }
    if (!by_pointer) {
        value.number = parse_integer(word, limits_of(field.type).least, limits_of(field.type).most);
        return value;
    }

    if (is_address(field))
        value.block = parse_address(word);
    else if (is_block(field))
        value.block = parse_bytes(word, block_capacity(field));
    else
        value.block = read_numbers(field, word);
    value.given = value.block.size();
    value.block.resize(block_capacity(field));
    return value;
}

Arguments::Arguments(const catalogue::Layout& layout, const std::vector<std::string>& words)
{
    if (words.size() != layout.size())
        throw Failure(kUsage, fmt::format("{} arguments given, {} expected: {}", words.size(), layout.size(),
                                          layout.empty() ? "none" : usage_text(layout)));
    for (size_t i = 0; i < layout.size(); ++i) {
        try {
            values_.push_back(read(layout[i], words[i]));
        } catch (const Failure& failure) {
            throw Failure(kUsage, fmt::format("argument {} ({}: {}): {}", i + 1, layout[i].name,
                                              expected_text(layout[i]), failure.what()));
        }
    }
}

std::string usage_text(const catalogue::Layout& layout)
{
    std::string text;
    for (const Field& field : layout) {
        text += (text.empty() ? "" : " ") + field.name;
        if (is_block(field))
            text += fmt::format("[{} bytes]", block_capacity(field));
        else if (field.repeated)
            text += fmt::format("[{}]", field.count.number);
    }
    return text;
}

} // namespace bt::client
