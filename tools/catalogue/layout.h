// The payload grammar of the catalogues: "name:type name:type[count] ...", read into a list of fields.
#pragma once

#include <cstddef>
#include <cstdint>
#include <string>
#include <string_view>
#include <vector>

namespace bt::catalogue {

enum class Type { u8, u16, u32, i32, be16, be32, addr, addr6, bytes, text, zero };

// Bytes of one element of a type.
size_t element_size(Type type);

// How often a field's element occurs.
struct Count {
    enum class Kind { fixed, from_field, rest };
    Kind kind = Kind::fixed;
    size_t number = 1; // fixed: how often; from_field: index of the field that tells
};

struct Field {
    std::string name;
    Type type = Type::u32;
    bool repeated = false; // written with [count]
    Count count;
};

using Layout = std::vector<Field>;

// Throws std::invalid_argument, naming the field, for text outside the grammar.
Layout parse_layout(std::string_view text);

} // namespace bt::catalogue
