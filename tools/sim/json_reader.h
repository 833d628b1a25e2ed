// Reads one JSON object of a scenario and refuses it with the file, the place, what is wrong and what would be right.
#pragma once

#include <nlohmann/json.hpp>

#include <cstdint>
#include <initializer_list>
#include <stdexcept>
#include <string>
#include <string_view>
#include <vector>

namespace bt::sim {

struct ScenarioError : std::runtime_error {
    using std::runtime_error::runtime_error;
};

class JsonReader {
public:
    JsonReader(const nlohmann::json& value, std::string file, std::string path);

    // Refuses keys that are not listed, so that a mistyped key is not silently ignored.
    void expect_only(std::initializer_list<std::string_view> known) const;

    bool has(const char* key) const { return value_.contains(key); }
    bool flag(const char* key, bool fallback) const;
    uint32_t number(const char* key, uint32_t fallback, uint32_t least, uint32_t most) const;
    int32_t signed_number(const char* key, int32_t fallback, int32_t least, int32_t most) const;
    std::string text(const char* key, const char* fallback, size_t most_bytes) const;
    std::string required_text(const char* key, size_t most_bytes) const;
    JsonReader object(const char* key) const;
    // The objects of an array; empty when the key is absent.
    std::vector<JsonReader> objects(const char* key, size_t most) const;
    std::vector<uint32_t> numbers(const char* key, uint32_t least, uint32_t most) const;
    std::vector<std::string> texts(const char* key) const;

    [[noreturn]] void refuse(const std::string& key, const std::string& wrong, const std::string& remedy) const;

private:
    const nlohmann::json* member(const char* key) const;
    const nlohmann::json& array_member(const char* key) const;
    int64_t integer(const nlohmann::json& value, const std::string& key, int64_t least, int64_t most) const;
    std::string limited_text(const nlohmann::json& value, const std::string& key, size_t most_bytes) const;

    nlohmann::json value_;
    std::string file_;
    std::string path_;
};

} // namespace bt::sim
