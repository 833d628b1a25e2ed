// Decoded messages as text and as JSON, and the small forms both are made of.
#pragma once

#include "catalogue/decode.h"

#include <nlohmann/json.hpp>

#include <string>

namespace bt::catalogue {

// One line: "0xA091 BT_SRV_CON_search value=1".
std::string to_text(const Decoded& message);

// { "id": "0xA091", "name": "BT_SRV_CON_search", "fields": { "value": 1 } }, with "truncated": true and
// "extra": "<hex>" where they apply. An id of no catalogue has the name null.
nlohmann::ordered_json to_json(const Decoded& message);

std::string address_text(const uint8_t* six_bytes); // "AA:BB:CC:DD:EE:FF"
std::string hex_text(const std::vector<uint8_t>& bytes);
std::string id_text(uint32_t id); // "0xA091"

// Text of unknown origin made safe for a terminal: control characters and bytes that are not UTF-8 become \xNN.
std::string printable(std::string_view text);

} // namespace bt::catalogue
