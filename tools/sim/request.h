// A received request with its fields by name, and the answer to it.
#pragma once

#include "catalogue/decode.h"

#include <bt_sim/events.h>

#include <cstdint>
#include <string_view>
#include <variant>
#include <vector>

namespace bt::sim {

class Request {
public:
    explicit Request(const BtMessage& message);

    uint16_t id() const { return message_.msg_header.hdr.cid; }
    // Every field of the request is there.
    bool complete() const { return decoded_.row != nullptr && !decoded_.truncated; }

    // A field that the request does not have reads as zero, an address as FF x 6.
    uint32_t number(std::string_view field) const;
    std::vector<uint32_t> numbers(std::string_view field) const;
    std::vector<uint8_t> bytes(std::string_view field) const;
    BtDevAddress address() const;

    const catalogue::Value* find(std::string_view field) const;

private:
    BtMessage message_;
    catalogue::Decoded decoded_;
};

// A field of an answer that the request does not tell.
struct AnswerField {
    std::string_view name;
    std::variant<int64_t, std::vector<uint8_t>> value;
};

// Dispatches the answer: the result, the given fields, the fields that the request has under the same name, and zeros
// for all others.
void answer(const Request& request, BtSimResult result, const std::vector<AnswerField>& fields = {});

} // namespace bt::sim
