#include "catalogue/layout.h"

#include <bt_service/bt_message.h>

#include <array>
#include <charconv>
#include <stdexcept>

namespace bt::catalogue {
namespace {

struct TypeName {
    std::string_view name;
    Type type;
    size_t size;
    bool needs_count;
};

constexpr std::array<TypeName, 11> kTypes{{
    {"u8", Type::u8, 1, false},
    {"u16", Type::u16, 2, false},
    {"u32", Type::u32, 4, false},
    {"i32", Type::i32, 4, false},
    {"be16", Type::be16, 2, false},
    {"be32", Type::be32, 4, false},
    {"addr", Type::addr, 8, false},
    {"addr6", Type::addr6, 6, false},
    {"bytes", Type::bytes, 1, true},
    {"text", Type::text, 1, true},
    {"zero", Type::zero, 1, true},
}};

[[noreturn]] void refuse(std::string_view field, const char* why)
{
    throw std::invalid_argument("field \"" + std::string(field) + "\": " + why);
}

bool is_integer(Type type)
{
    return type != Type::addr && type != Type::addr6 && type != Type::bytes && type != Type::text && type != Type::zero;
}

Count parse_count(std::string_view text, const Layout& earlier, std::string_view field)
{
    if (text == "rest") return {Count::Kind::rest, 0};

    for (size_t i = 0; i < earlier.size(); ++i)
        if (earlier[i].name == text) {
            if (earlier[i].repeated || !is_integer(earlier[i].type)) refuse(field, "its count is not a single number");
            return {Count::Kind::from_field, i};
        }

    size_t number = 0;
    const auto [end, error] = std::from_chars(text.data(), text.data() + text.size(), number);
    if (error != std::errc() || end != text.data() + text.size() || number == 0 || number > BT_MESSAGE_PAYLOAD_MAX)
        refuse(field, "its count is neither 1..1008, nor an earlier field, nor \"rest\"");
    return {Count::Kind::fixed, number};
}

Field parse_field(std::string_view text, const Layout& earlier)
{
    const size_t colon = text.find(':');
    if (colon == std::string_view::npos || colon == 0) refuse(text, "not of the form name:type");

    Field field;
    field.name = text.substr(0, colon);
    for (const Field& other : earlier)
        if (other.name == field.name) refuse(text, "the name occurs twice");

    std::string_view type = text.substr(colon + 1);
    const size_t bracket = type.find('[');
    if (bracket != std::string_view::npos) {
        if (type.back() != ']') refuse(text, "\"[\" without \"]\" at the end");
        field.repeated = true;
        field.count = parse_count(type.substr(bracket + 1, type.size() - bracket - 2), earlier, text);
        type = type.substr(0, bracket);
    }

    for (const TypeName& known : kTypes)
        if (known.name == type) {
            if (known.needs_count && !field.repeated) refuse(text, "the type needs a count");
            field.type = known.type;
            return field;
        }
    refuse(text, "unknown type");
}

} // namespace

size_t element_size(Type type)
{
    for (const TypeName& known : kTypes)
        if (known.type == type) return known.size;
    return 1;
}

Layout parse_layout(std::string_view text)
{
    Layout layout;
    while (!text.empty()) {
        const size_t blank = text.find(' ');
        const std::string_view word = text.substr(0, blank);
        if (!word.empty()) {
            if (!layout.empty() && layout.back().count.kind == Count::Kind::rest)
                refuse(word, "follows a \"rest\" field");
            layout.push_back(parse_field(word, layout));
        }
        text = blank == std::string_view::npos ? std::string_view() : text.substr(blank + 1);
    }
    return layout;
}

} // namespace bt::catalogue
