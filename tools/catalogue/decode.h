// Takes a message apart into named fields, by the row of its id.
#pragma once

#include "catalogue/rows.h"

#include <bt_service/bt_message.h>

#include <cstdint>
#include <vector>

namespace bt::catalogue {

// A field as found: numbers for the integer types, bytes for all others. A field the payload ends in holds the whole
// elements that are there.
struct Value {
    const Field* field = nullptr;
    std::vector<int64_t> numbers;
    std::vector<uint8_t> bytes;
};

struct Decoded {
    uint16_t id = 0;
    const Row* row = nullptr; // null: an id of no catalogue; everything is in `extra` then
    std::vector<Value> values;
    bool truncated = false; // the payload ends before its layout does
    std::vector<uint8_t> extra; // what follows the layout
};

// `payload` may hold anything; nothing behind `size` is read.
Decoded decode(uint16_t id, const uint8_t* payload, size_t size);

// The payload of a received message. `available` is the number of bytes at `message` that were really received; a
// length field that promises more counts as truncation.
Decoded decode(const BtMessage& message, size_t available = sizeof(BtMessage));

// The same by a given row, for the few ids that several functions share.
Decoded decode_by(const Row& row, const uint8_t* payload, size_t size);

} // namespace bt::catalogue
