#include "catalogue/decode.h"

#include <algorithm>
#include <cstring>

namespace bt::catalogue {
namespace {

int64_t read_number(Type type, const uint8_t* at)
{
    const auto word = [at](auto value) {
        std::memcpy(&value, at, sizeof value);
        return static_cast<int64_t>(value);
    };
    switch (type) {
    case Type::u8:
        return *at;
    case Type::u16:
        return word(uint16_t{});
    case Type::u32:
        return word(uint32_t{});
    case Type::i32:
        return word(int32_t{});
    case Type::be16:
        return at[0] << 8 | at[1];
    default:
        return int64_t{at[0]} << 24 | at[1] << 16 | at[2] << 8 | at[3];
    }
}

bool holds_numbers(Type type)
{
    return type <= Type::be32;
}

// How many elements the layout asks for; more than `left` bytes can hold when it asks for more.
size_t wanted_elements(const Field& field, const std::vector<Value>& earlier, size_t left)
{
    const size_t size = element_size(field.type);
    if (field.count.kind == Count::Kind::rest) return left / size;
    if (field.count.kind == Count::Kind::fixed) return field.count.number;
    const std::vector<int64_t>& told = earlier[field.count.number].numbers;
    return told.empty() || told.front() < 0 ? 0 : static_cast<size_t>(told.front());
}

} // namespace

Decoded decode_by(const Row& row, const uint8_t* payload, size_t size)
{
    Decoded result;
    result.id = row.id;
    result.row = &row;

    size_t at = 0;
    for (const Field& field : row.layout) {
        const size_t element = element_size(field.type);
        const size_t wanted = wanted_elements(field, result.values, size - at);
        const size_t present = std::min(wanted, (size - at) / element);
        result.truncated = present < wanted;

        Value value;
        value.field = &field;
        if (holds_numbers(field.type))
            for (size_t i = 0; i < present; ++i)
                value.numbers.push_back(read_number(field.type, payload + at + i * element));
        else
            value.bytes.assign(payload + at, payload + at + present * element);
        at += present * element;

        if (present != 0 || !result.truncated) result.values.push_back(std::move(value));
        if (result.truncated) break;
    }
    result.extra.assign(payload + at, payload + size);
    return result;
}

Decoded decode(uint16_t id, const uint8_t* payload, size_t size)
{
    if (const Row* row = find(id)) return decode_by(*row, payload, size);

    Decoded unknown;
    unknown.id = id;
    unknown.extra.assign(payload, payload + size);
    return unknown;
}

Decoded decode(const BtMessage& message, size_t available)
{
    const BtMessageHeaderFields header = message.msg_header.hdr;
    const size_t room = std::min(available, sizeof message) - std::min(available, sizeof header);
    const size_t size = std::min<size_t>(header.len, std::min<size_t>(room, sizeof message.payload));

    Decoded result = decode(header.cid, message.payload, size);
    result.truncated = result.truncated || size < header.len;
    return result;
}

} // namespace bt::catalogue
