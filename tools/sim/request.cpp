#include "sim/request.h"

#include "sim/dispatch.h"

#include <algorithm>
#include <cstring>

namespace bt::sim {

namespace {

void append_number(Payload& payload, catalogue::Type type, int64_t number)
{
    const auto low = static_cast<uint32_t>(number);
    switch (type) {
    case catalogue::Type::u8:
        payload.u8(low);
        break;
    case catalogue::Type::u16:
        payload.u16(low);
        break;
    case catalogue::Type::be16:
        payload.be16(low);
        break;
    case catalogue::Type::be32:
        payload.be32(low);
        break;
    default:
        payload.u32(low);
        break;
    }
}

// Exactly `size` bytes: what is missing is zero, what is too much is left out.
void append_bytes(Payload& payload, std::vector<uint8_t> bytes, size_t size)
{
    bytes.resize(size);
    payload.bytes(bytes.data(), static_cast<uint32_t>(size));
}

bool is_number(catalogue::Type type)
{
    using catalogue::Type;
    return type == Type::u8 || type == Type::u16 || type == Type::u32 || type == Type::i32 || type == Type::be16 ||
           type == Type::be32;
}

int64_t first_number(const catalogue::Value* value)
{
    return value == nullptr || value->numbers.empty() ? 0 : value->numbers.front();
}

void append_field(Payload& payload, const catalogue::Field& field, const Request& request,
                  const std::vector<AnswerField>& given)
{
    const auto own = std::find_if(given.begin(), given.end(),
                                  [&](const AnswerField& candidate) { return candidate.name == field.name; });
    const catalogue::Value* const echoed = request.find(field.name);
    if (is_number(field.type)) {
        append_number(payload, field.type, own != given.end() ? std::get<int64_t>(own->value) : first_number(echoed));
        return;
    }
    const size_t size = catalogue::element_size(field.type) * field.count.number;
    if (own != given.end())
        append_bytes(payload, std::get<std::vector<uint8_t>>(own->value), size);
    else
        append_bytes(payload, echoed == nullptr ? std::vector<uint8_t>() : echoed->bytes, size);
}

} // namespace

Request::Request(const BtMessage& message) : message_(message), decoded_(catalogue::decode(message_)) {}

const catalogue::Value* Request::find(std::string_view field) const
{
    const auto found = std::find_if(decoded_.values.begin(), decoded_.values.end(),
                                    [&](const catalogue::Value& value) { return value.field->name == field; });
    return found == decoded_.values.end() ? nullptr : &*found;
}

uint32_t Request::number(std::string_view field) const
{
    return static_cast<uint32_t>(first_number(find(field)));
}

std::vector<uint32_t> Request::numbers(std::string_view field) const
{
    std::vector<uint32_t> numbers;
    if (const catalogue::Value* const value = find(field))
        for (const int64_t number : value->numbers)
            numbers.push_back(static_cast<uint32_t>(number));
    return numbers;
}

std::vector<uint8_t> Request::bytes(std::string_view field) const
{
    const catalogue::Value* const value = find(field);
    return value == nullptr ? std::vector<uint8_t>() : value->bytes;
}

BtDevAddress Request::address() const
{
    BtDevAddress address{};
    const std::vector<uint8_t> slot = bytes("address");
    if (slot.size() == sizeof address)
        std::memcpy(&address, slot.data(), sizeof address);
    else
        std::memset(address.address, 0xFF, sizeof address.address);
    return address;
}

void answer(const Request& request, BtSimResult result, const std::vector<AnswerField>& fields)
{
    const uint16_t id = catalogue::answer_to(request.id());
    Payload payload;
    payload.u32(result);
    if (const catalogue::Row* const row = catalogue::find(id))
        for (const catalogue::Field& field : row->layout)
            if (field.name != "result") append_field(payload, field, request, fields);
    dispatch(id, payload);
}

} // namespace bt::sim
