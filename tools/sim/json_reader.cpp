#include "sim/json_reader.h"

#include <fmt/format.h>
#include <fmt/ranges.h>

#include <algorithm>
#include <limits>
#include <utility>

namespace bt::sim {

namespace {

const nlohmann::json kEmptyArray = nlohmann::json::array();
const nlohmann::json kEmptyObject = nlohmann::json::object();

} // namespace

JsonReader::JsonReader(const nlohmann::json& value, std::string file, std::string path)
    : value_(value), file_(std::move(file)), path_(std::move(path))
{
    if (!value_.is_object()) refuse("", fmt::format("is {}", value_.type_name()), "write an object in { }");
}

void JsonReader::refuse(const std::string& key, const std::string& wrong, const std::string& remedy) const
{
    const std::string place = key.empty() ? path_ : path_ + "/" + key;
    throw ScenarioError(fmt::format("{}: {}: {}; {}", file_, place.empty() ? "/" : place, wrong, remedy));
}

void JsonReader::expect_only(std::initializer_list<std::string_view> known) const
{
    for (const auto& item : value_.items()) {
        if (std::find(known.begin(), known.end(), item.key()) == known.end())
            refuse(item.key(), "is not a key of this object", fmt::format("use one of: {}", fmt::join(known, ", ")));
    }
}

const nlohmann::json* JsonReader::member(const char* key) const
{
    const auto found = value_.find(key);
    return found == value_.end() ? nullptr : &*found;
}

bool JsonReader::flag(const char* key, bool fallback) const
{
    const nlohmann::json* const value = member(key);
    if (value == nullptr) return fallback;
    if (!value->is_boolean()) refuse(key, fmt::format("is {}", value->dump()), "write true or false");
    return value->get<bool>();
}

int64_t JsonReader::integer(const nlohmann::json& value, const std::string& key, int64_t least, int64_t most) const
{
    const bool fits = value.is_number_integer() &&
                      (!value.is_number_unsigned() ||
                       value.get<uint64_t>() <= static_cast<uint64_t>(std::numeric_limits<int64_t>::max()));
    const int64_t number = fits ? value.get<int64_t>() : 0;
    if (!fits || number < least || number > most)
        refuse(key, fmt::format("is {}", value.dump()), fmt::format("write a whole number from {} to {}", least, most));
    return number;
}

uint32_t JsonReader::number(const char* key, uint32_t fallback, uint32_t least, uint32_t most) const
{
    const nlohmann::json* const value = member(key);
    return value == nullptr ? fallback : static_cast<uint32_t>(integer(*value, key, least, most));
}

int32_t JsonReader::signed_number(const char* key, int32_t fallback, int32_t least, int32_t most) const
{
    const nlohmann::json* const value = member(key);
    return value == nullptr ? fallback : static_cast<int32_t>(integer(*value, key, least, most));
}

std::string JsonReader::limited_text(const nlohmann::json& value, const std::string& key, size_t most_bytes) const
{
    if (!value.is_string()) refuse(key, fmt::format("is {}", value.dump()), "write a text in quotes");
    const auto& text = value.get_ref<const std::string&>();
    if (text.size() > most_bytes)
        refuse(key, fmt::format("has {} bytes", text.size()), fmt::format("write at most {} bytes", most_bytes));
    return text;
}

std::string JsonReader::text(const char* key, const char* fallback, size_t most_bytes) const
{
    const nlohmann::json* const value = member(key);
    return value == nullptr ? fallback : limited_text(*value, key, most_bytes);
}

std::string JsonReader::required_text(const char* key, size_t most_bytes) const
{
    if (!has(key)) refuse(key, "is missing", "add it");
    return text(key, "", most_bytes);
}

JsonReader JsonReader::object(const char* key) const
{
    const nlohmann::json* const value = member(key);
    return {value == nullptr ? kEmptyObject : *value, file_, path_ + "/" + key};
}

const nlohmann::json& JsonReader::array_member(const char* key) const
{
    const nlohmann::json* const value = member(key);
    if (value == nullptr) return kEmptyArray;
    if (!value->is_array()) refuse(key, fmt::format("is {}", value->type_name()), "write a list in [ ]");
    return *value;
}

std::vector<JsonReader> JsonReader::objects(const char* key, size_t most) const
{
    const nlohmann::json& array = array_member(key);
    if (array.size() > most)
        refuse(key, fmt::format("has {} entries", array.size()), fmt::format("leave at most {}", most));

    std::vector<JsonReader> readers;
    for (size_t i = 0; i < array.size(); ++i)
        readers.emplace_back(array[i], file_, fmt::format("{}/{}/{}", path_, key, i));
    return readers;
}

std::vector<uint32_t> JsonReader::numbers(const char* key, uint32_t least, uint32_t most) const
{
    const nlohmann::json& array = array_member(key);
    std::vector<uint32_t> values;
    for (size_t i = 0; i < array.size(); ++i)
        values.push_back(static_cast<uint32_t>(integer(array[i], fmt::format("{}/{}", key, i), least, most)));
    return values;
}

std::vector<std::string> JsonReader::texts(const char* key) const
{
    const nlohmann::json& array = array_member(key);
    std::vector<std::string> values;
    for (size_t i = 0; i < array.size(); ++i)
        values.push_back(limited_text(array[i], fmt::format("{}/{}", key, i), 1024));
    return values;
}

} // namespace bt::sim
