#include "catalogue/print.h"

#include "catalogue/results.h"

#include <algorithm>
#include <cstdio>

namespace bt::catalogue {
namespace {

bool is_address(Type type)
{
    return type == Type::addr || type == Type::addr6;
}

bool is_plain_gap(const Value& value)
{
    return value.field->type == Type::zero &&
           std::all_of(value.bytes.begin(), value.bytes.end(), [](uint8_t byte) { return byte == 0; });
}

std::string text_of(const Value& value)
{
    return std::string(value.bytes.begin(), value.bytes.end());
}

std::vector<std::string> addresses_of(const Value& value)
{
    std::vector<std::string> texts;
    for (size_t at = 0; at < value.bytes.size(); at += element_size(value.field->type))
        texts.push_back(address_text(&value.bytes[at]));
    return texts;
}

template <class Items>
std::string joined(const Items& items)
{
    std::string text;
    for (const auto& item : items)
        text += (text.empty() ? "" : ",") + item;
    return text;
}

std::string value_text(const Value& value)
{
    const Field& field = *value.field;
    if (is_address(field.type)) return joined(addresses_of(value));
    if (field.type == Type::text) return "\"" + printable(text_of(value)) + "\"";
    if (field.type == Type::bytes || field.type == Type::zero) return hex_text(value.bytes);

    std::vector<std::string> numbers;
    for (const int64_t number : value.numbers)
        numbers.push_back(std::to_string(number));
    return field.repeated ? "[" + joined(numbers) + "]" : joined(numbers);
}

nlohmann::ordered_json value_json(const Value& value)
{
    const Field& field = *value.field;
    if (field.type == Type::text) return text_of(value);
    if (field.type == Type::bytes || field.type == Type::zero) return hex_text(value.bytes);
    if (is_address(field.type))
        return field.repeated ? nlohmann::ordered_json(addresses_of(value))
                              : nlohmann::ordered_json(joined(addresses_of(value)));
    if (field.repeated) return value.numbers;
    return value.numbers.front();
}

// "result" is the one field whose values are named in the catalogue of events.
bool is_result(const Decoded& message, const Value& value)
{
    return message.row->kind == Kind::event && (value.field->name == "result" || value.field->name == "reason") &&
           value.numbers.size() == 1;
}

// Where a sequence of UTF-8 starting at `at` ends; `at` itself when the bytes there are none.
size_t utf8_end(std::string_view text, size_t at)
{
    const auto byte = [text](size_t i) { return static_cast<uint8_t>(text[i]); };
    const uint8_t lead = byte(at);
    if (lead < 0x80) return at + 1;

    const size_t length = lead >= 0xF0 ? 4 : lead >= 0xE0 ? 3 : 2;
    if (lead < 0xC2 || lead > 0xF4 || at + length > text.size()) return at;
    for (size_t i = 1; i < length; ++i)
        if ((byte(at + i) & 0xC0) != 0x80) return at;

    const uint8_t second = byte(at + 1);
    const bool overlong = (lead == 0xE0 && second < 0xA0) || (lead == 0xF0 && second < 0x90);
    const bool no_character = (lead == 0xED && second > 0x9F) || (lead == 0xF4 && second > 0x8F);
    const bool control = lead == 0xC2 && second < 0xA0;
    return overlong || no_character || control ? at : at + length;
}

} // namespace

std::string address_text(const uint8_t* six_bytes)
{
    char text[18];
    std::snprintf(text, sizeof text, "%02X:%02X:%02X:%02X:%02X:%02X", six_bytes[0], six_bytes[1], six_bytes[2],
                  six_bytes[3], six_bytes[4], six_bytes[5]);
    return text;
}

std::string hex_text(const std::vector<uint8_t>& bytes)
{
    static constexpr char kDigits[] = "0123456789abcdef";
    std::string text;
    for (const uint8_t byte : bytes) {
        text += kDigits[byte >> 4];
        text += kDigits[byte & 15];
    }
    return text;
}

std::string id_text(uint32_t id)
{
    char text[11];
    std::snprintf(text, sizeof text, "0x%04X", id);
    return text;
}

std::string printable(std::string_view text)
{
    std::string safe;
    for (size_t at = 0; at < text.size();) {
        const uint8_t byte = static_cast<uint8_t>(text[at]);
        const size_t end = byte < 0x20 || byte == 0x7F ? at : utf8_end(text, at);
        if (end == at) {
            safe += "\\x" + hex_text({byte});
            ++at;
        } else {
            safe += text.substr(at, end - at);
            at = end;
        }
    }
    return safe;
}

std::string to_text(const Decoded& message)
{
    std::string text = id_text(message.id) + " " + (message.row ? message.row->name : "(unknown id)");
    for (const Value& value : message.values) {
        if (is_plain_gap(value)) continue;
        text += " " + value.field->name + "=" + value_text(value);
        if (is_result(message, value))
            text += std::string(" (") + result_text(static_cast<uint32_t>(value.numbers.front())) + ")";
    }
    if (message.truncated) text += " [truncated]";
    if (!message.extra.empty()) text += (message.row ? " extra=" : " payload=") + hex_text(message.extra);
    return text;
}

nlohmann::ordered_json to_json(const Decoded& message)
{
    nlohmann::ordered_json json;
    json["id"] = id_text(message.id);
    json["name"] = message.row ? nlohmann::ordered_json(message.row->name) : nlohmann::ordered_json();
    json["fields"] = nlohmann::ordered_json::object();
    for (const Value& value : message.values) {
        if (is_plain_gap(value)) continue;
        json["fields"][value.field->name] = value_json(value);
        if (is_result(message, value))
            json["fields"][value.field->name + "_text"] = result_text(static_cast<uint32_t>(value.numbers.front()));
    }
    if (message.truncated) json["truncated"] = true;
    if (!message.extra.empty()) json["extra"] = hex_text(message.extra);
    return json;
}

} // namespace bt::catalogue
